#pragma once

#include "import/Message.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace Import
{

/// One chapter that a book is to have, as its folder lists it.
struct PlannedChapter
{
    /// The Markdown file, absolute.
    std::filesystem::path m_Path;
    /// Its path from the book's folder, with forward slashes: what links and messages call it.
    std::string m_Name;
    /// Title in the list, empty if the list gives none. The chapter's own first heading comes before it.
    std::string m_Title;
    /// Title of the part that begins with this chapter, or empty.
    std::string m_Part;
    /// "4" or "4.1" in a numbered list, empty otherwise.
    std::string m_Number;
    /// Where the list names it.
    Place m_Place;
};

/// What a folder says about its book, whichever of the three ways it says it.
struct BookPlan
{
    std::filesystem::path m_Folder;
    /// What the plan was read from: "book.toml", "SUMMARY.md", or empty for the folder itself.
    std::string m_Source;
    std::string m_Title;
    std::string m_Subtitle;
    std::vector<std::string> m_Authors;
    /// BCP 47 tag; "en" if nobody says.
    std::string m_Language = "en";
    /// Name of a template or path of one, relative to the folder; empty for the default.
    std::string m_Template;
    std::vector<PlannedChapter> m_Chapters;
    /// Quotation marks, dashes and ellipses become the language's own.
    bool m_Smart = true;
    bool m_HasTitlePage = true;

    /// Target of the PDF, relative to the folder; empty for the default.
    std::string m_OutputFile;
    /// Crop marks round the page, and the bleed area with the page.
    bool m_HasMarks = false;
    bool m_IncludesBleed = false;
    bool m_EmbedsMetadata = true;

    [[nodiscard]] std::string AuthorsAsText() const;
};

/// Reads the plan of a folder: `book.toml`, or else `SUMMARY.md` in mdBook's layout (in the folder, or in the `src`
/// folder that an mdBook manifest names), or else every *.md and *.markdown file in natural order.
///
/// Nothing comes back if there is no chapter or the manifest has an error; `messages` then says why. A chapter that is
/// listed but missing is an error in `messages` and left out of the plan; one listed twice is kept once.
std::optional<BookPlan> ReadBookPlan(std::filesystem::path const & folder, MessageList & messages);

/// The two readers behind it, for text in memory. `plan.m_Folder` must be set. They look at no file but to see whether
/// chapters exist. False if the text as a whole cannot be used.
bool ReadManifestText(std::string const & text, std::string const & shownName, BookPlan & plan, MessageList & messages);
bool ReadSummaryText(std::string const & text, std::string const & shownName, BookPlan & plan, MessageList & messages);

/// Adds a chapter named by a path relative to the folder, if the file is there and not in the plan already; otherwise
/// says so. Returns whether it was added.
bool AddChapter(BookPlan & plan, std::string const & name, Place const & place, MessageList & messages);

}
