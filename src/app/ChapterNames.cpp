#include "app/ChapterNames.h"

#include "import/Text.h"

#include <algorithm>
#include <charconv>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

constexpr std::size_t g_MostCandidates = 5;

/// "1 (a/intro.kvdoc), 4 (b/intro.kvdoc)"
std::string ListCandidates(std::vector<ChapterLabel> const & chapters, std::vector<std::size_t> const & found)
{
    std::string list;
    for (std::size_t at = 0; at < std::min(found.size(), g_MostCandidates); ++at) {
        list += (list.empty() ? "" : ", ") + std::to_string(found[at] + 1) + " (" + chapters[found[at]].m_Path + ")";
    }
    return g_MostCandidates < found.size() ? list + ", ..." : list;
}

template <typename TFits>
std::vector<std::size_t> Collect(std::vector<ChapterLabel> const & chapters, TFits const & fits)
{
    std::vector<std::size_t> found;
    for (std::size_t at = 0; at < chapters.size(); ++at) {
        if (fits(chapters[at])) {
            found.push_back(at);
        }
    }
    return found;
}

std::string Folded(std::string text)
{
    // Suggestions only, so the letters of ASCII are enough.
    std::transform(text.begin(), text.end(), text.begin(), [](unsigned char c) {
        return 'A' <= c && c <= 'Z' ? static_cast<char>(c + 32) : static_cast<char>(c);
    });
    return text;
}

std::string DescribeRange(std::size_t count)
{
    return 0 == count ? Text("The book has no chapters.", "Program")
                      : Import::CountText("The book has %1 chapter.", "The book has %1 chapters, numbered from 1.",
                                          "Program", count);
}

}

FoundChapter FindChapter(std::vector<ChapterLabel> const & chapters, std::string const & text, fs::path const & folder)
{
    long number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    bool const isNumber = end == text.data() + text.size() && std::errc::invalid_argument != error;
    if (isNumber && std::errc() == error && 1 <= number && number <= static_cast<long>(chapters.size())) {
        return {static_cast<int>(number - 1), {}};
    }

    std::string const path = (folder / text).lexically_normal().string();
    std::vector<std::size_t> found =
        Collect(chapters, [&](ChapterLabel const & chapter) { return path == chapter.m_Path; });
    if (found.empty()) {
        found = Collect(chapters, [&](ChapterLabel const & chapter) {
            fs::path const file = fs::path(chapter.m_Path).filename();
            return text == chapter.m_Name || text == file.string() || text == file.stem().string();
        });
    }
    if (1 == found.size()) {
        return {static_cast<int>(found.front()), {}};
    }
    if (!found.empty()) {
        return {-1, Text("\"%1\" may be any of the chapters %2. Name it by its number.", "Program", text,
                         ListCandidates(chapters, found))};
    }
    if (isNumber) {
        return {-1, Text("There is no chapter %1.", "Program", text) + " " + DescribeRange(chapters.size())};
    }
    std::string const wanted = Folded(text);
    found = Collect(chapters, [&](ChapterLabel const & chapter) {
        return std::string::npos != Folded(chapter.m_Name).find(wanted) ||
               std::string::npos != Folded(fs::path(chapter.m_Path).filename().string()).find(wanted);
    });
    return {-1, Text("No chapter is called \"%1\".", "Program", text) + " " +
                    (found.empty() ? DescribeRange(chapters.size())
                                   : Text("Is it one of %1?", "Program", ListCandidates(chapters, found)))};
}

}
