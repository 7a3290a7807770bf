#include "import/BookPlan.h"

#include "import/NaturalOrder.h"
#include "import/SourceText.h"
#include "import/Text.h"

#include <algorithm>

namespace Import
{

namespace fs = std::filesystem;

namespace
{

bool IsMarkdownName(fs::path const & path)
{
    std::string extension = path.extension().string();
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](unsigned char c) { return static_cast<char>(c < 0x80 ? std::tolower(c) : c); });
    return ".md" == extension || ".markdown" == extension;
}

void AddFilesOfFolder(BookPlan & plan, MessageList & messages)
{
    std::vector<std::string> names;
    std::error_code error;
    for (fs::directory_iterator it(plan.m_Folder, error), end; !error && it != end; it.increment(error)) {
        std::string const name = it->path().filename().string();
        // A link that leads nowhere is told as a chapter that cannot be read.
        std::error_code linkError;
        if (!name.starts_with('.') && IsMarkdownName(it->path()) && !fs::is_directory(it->path(), linkError)) {
            names.push_back(name);
        }
    }
    if (error) {
        messages.Error("unreadable", {plan.m_Folder.string()},
                       Text("The folder cannot be read: %1.", "Source", error.message()));
    }
    std::sort(names.begin(), names.end(),
              [](std::string const & a, std::string const & b) { return ComesBefore(a, b); });
    for (std::string const & name : names) {
        AddChapter(plan, name, {name}, messages);
    }
}

std::string NameOfFolder(fs::path folder)
{
    if (folder.filename().empty()) {
        folder = folder.parent_path();
    }
    return folder.filename().string();
}

}

std::string BookPlan::AuthorsAsText() const
{
    std::string text;
    for (std::size_t at = 0; at < m_Authors.size(); ++at) {
        text += (0 == at ? "" : at + 1 == m_Authors.size() ? " and " : ", ") + m_Authors[at];
    }
    return text;
}

bool AddChapter(BookPlan & plan, std::string const & name, Place const & place, MessageList & messages)
{
    fs::path const path = (plan.m_Folder / name).lexically_normal();
    std::string const shown = path.lexically_relative(plan.m_Folder.lexically_normal()).generic_string();
    auto const known = std::find_if(plan.m_Chapters.begin(), plan.m_Chapters.end(),
                                    [&](PlannedChapter const & chapter) { return chapter.m_Path == path; });
    if (known != plan.m_Chapters.end()) {
        messages.Warn(
            "chapter-twice", place,
            known->m_Place.m_Line
                ? Text("The chapter %1 is listed twice (line %2); it is set once, in the first place.", "Source", shown,
                       known->m_Place.m_Line)
                : Text("The chapter %1 is listed twice; it is set once, in the first place.", "Source", shown));
        return false;
    }
    std::error_code error;
    if (!fs::exists(path, error)) {
        messages.Error(
            "chapter-missing", place,
            error ? Text("The chapter %1 is listed but there is no such file: %2.", "Source", shown, error.message())
                  : Text("The chapter %1 is listed but there is no such file.", "Source", shown));
        return false;
    }
    plan.m_Chapters.push_back({path, shown.empty() ? name : shown, "", "", "", place});
    return true;
}

std::optional<BookPlan> ReadBookPlan(fs::path const & folder, MessageList & messages)
{
    BookPlan plan;
    std::error_code error;
    plan.m_Folder = fs::absolute(folder, error).lexically_normal();
    fs::file_status const status = fs::status(plan.m_Folder, error);
    if (!fs::is_directory(status)) {
        messages.Error("no-folder", {folder.string()},
                       fs::exists(status)
                           ? Text("This is not a folder; give the folder that holds the chapters.", "Source")
                       : fs::file_type::none == status.type()
                           ? Text("The folder cannot be read: %1.", "Source", error.message())
                           : Text("There is no such folder.", "Source"));
        return std::nullopt;
    }

    fs::path const manifest = plan.m_Folder / "book.toml";
    if (fs::exists(manifest, error)) {
        auto const text = ReadSourceText(manifest, "book.toml", messages);
        if (!text || !ReadManifestText(*text, "book.toml", plan, messages)) {
            return std::nullopt;
        }
        plan.m_Source = "book.toml";
    }
    bool const isListed = !plan.m_Chapters.empty() || messages.HasErrors();
    if (fs::path const summary = plan.m_Folder / "SUMMARY.md"; !isListed && fs::exists(summary, error)) {
        auto const text = ReadSourceText(summary, "SUMMARY.md", messages);
        if (!text || !ReadSummaryText(*text, "SUMMARY.md", plan, messages)) {
            return std::nullopt;
        }
        plan.m_Source = plan.m_Source.empty() ? "SUMMARY.md" : plan.m_Source;
    } else if (!isListed) {
        AddFilesOfFolder(plan, messages);
    }

    if (plan.m_Chapters.empty()) {
        if (!messages.HasErrors()) {
            messages.Error(
                "no-chapters", {folder.string()},
                plan.m_Source.empty()
                    ? Text("The folder holds no book.toml, no SUMMARY.md and no Markdown file (*.md, *.markdown).",
                           "Source")
                    : Text("The %1 lists no chapter.", "Source", plan.m_Source));
        }
        return std::nullopt;
    }
    if (plan.m_Title.empty()) {
        plan.m_Title = NameOfFolder(plan.m_Folder);
    }
    return plan;
}

}
