#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <regex>
#include <set>
#include <string>
#include <vector>

namespace
{

namespace fs = std::filesystem;

/// What each folder may include besides itself and the folders that those may include.
std::map<std::string, std::set<std::string>> const Below = {
    {"framework/kernel", {}},
    {"framework/typeset", {"framework/kernel"}},
    {"framework/story", {"framework/typeset"}},
    {"framework/raster", {"framework/kernel"}},
    {"framework/render", {"framework/typeset", "framework/raster"}},
    {"framework/document", {"framework/story", "framework/render"}},
    {"framework/commands", {"framework/document"}},
    {"core", {"framework/commands"}},
    {"documents", {"core"}},
    {"commands", {"documents"}},
    {"content", {"commands"}},
    {"synchronise", {"content"}},
    {"output", {"synchronise"}},
    {"import", {"output"}},
    {"app", {"import"}},
};

std::set<std::string> Reach(std::string const & folder)
{
    std::set<std::string> reach{folder};
    for (std::string const & below : Below.at(folder)) {
        std::set<std::string> const further = Reach(below);
        reach.insert(further.begin(), further.end());
    }
    return reach;
}

/// The folder of a path below src, such as framework/kernel or core.
std::string FolderOf(std::string const & path)
{
    std::size_t const slash = path.rfind('/');
    return slash == std::string::npos ? "" : path.substr(0, slash);
}

}

TEST(IncludeDirectionTest, NoFolderIncludesOneThatStandsAboveIt)
{
    fs::path const source = fs::path(KORVANE_SOURCE_FOLDER) / "src";
    std::regex const include(R"re(^\s*#\s*include\s+"([^"]+)")re");
    std::size_t looked = 0;
    for (fs::directory_entry const & entry : fs::recursive_directory_iterator(source)) {
        std::string const extension = entry.path().extension().string();
        if (extension != ".h" && extension != ".cpp") {
            continue;
        }
        std::string const folder = FolderOf(fs::relative(entry.path(), source).generic_string());
        ASSERT_TRUE(Below.contains(folder)) << folder << " has no place among the layers";
        std::set<std::string> const allowed = Reach(folder);
        std::ifstream file(entry.path());
        std::string line;
        for (int number = 1; std::getline(file, line); ++number) {
            std::smatch match;
            if (!std::regex_search(line, match, include)) {
                continue;
            }
            ++looked;
            std::string const target = FolderOf(match[1].str());
            EXPECT_TRUE(allowed.contains(target))
                << entry.path().string() << ':' << number << ": " << folder << " must not include " << match[1].str();
        }
    }
    EXPECT_GT(looked, 0u);
}
