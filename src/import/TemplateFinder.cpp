#include "import/Template.h"

#include "import/Text.h"

#include <algorithm>

namespace Import
{

namespace fs = std::filesystem;

namespace
{

/// Where templates come with the program: beside it when it is installed, in the source tree when it is not.
std::vector<fs::path> TemplateFolders()
{
    std::vector<fs::path> folders;
    std::error_code error;
    fs::path const program = fs::read_symlink("/proc/self/exe", error);
    if (!error) {
        folders.push_back(program.parent_path().parent_path() / "share" / "korvane-book" / "templates");
    }
    folders.emplace_back(KORVANE_TEMPLATE_FOLDER);
    return folders;
}

}

std::vector<std::string> ListTemplates()
{
    std::vector<std::string> names;
    for (fs::path const & folder : TemplateFolders()) {
        std::error_code error;
        for (fs::directory_iterator it(folder, error), end; !error && it != end; it.increment(error)) {
            if (".toml" == it->path().extension()) {
                names.push_back(it->path().stem().string());
            }
        }
    }
    std::sort(names.begin(), names.end());
    names.erase(std::unique(names.begin(), names.end()), names.end());
    return names;
}

std::optional<fs::path> FindTemplate(std::string const & name, fs::path const & folder, MessageList & messages)
{
    std::error_code error;
    if (std::string::npos != name.find('/') || name.ends_with(".toml")) {
        fs::path const path = folder / name;
        if (fs::is_regular_file(path, error)) {
            return path;
        }
        messages.Error("template-missing", {name}, Text("There is no such template file.", "Source"));
        return std::nullopt;
    }
    std::vector<fs::path> folders = TemplateFolders();
    folders.insert(folders.begin(), folder);
    for (fs::path const & candidate : folders) {
        if (fs::is_regular_file(candidate / (name + ".toml"), error)) {
            return candidate / (name + ".toml");
        }
    }
    std::string known;
    for (std::string const & candidate : ListTemplates()) {
        known += (known.empty() ? "" : ", ") + candidate;
    }
    messages.Error(
        "template-missing", {},
        Text("There is no template \"%1\". Known are: %2; or give the path of a .toml file.", "Source", name, known));
    return std::nullopt;
}

}
