#pragma once

#include "framework/document/DocumentSettings.h"
#include "import/Message.h"

#include <filesystem>
#include <optional>
#include <string>
#include <vector>

namespace Import
{

/// The look of a book, read from a TOML file: pages, masters, styles and colours. An immutable value once it is read.
struct Template
{
    /// Name for people, and the file that it came from.
    std::string m_Name;
    std::filesystem::path m_Path;
    /// Hash of the file's text: a chapter is made anew when it changes.
    std::uint64_t m_Hash = 0;

    /// Page setup, masters, styles and swatches, ready for a document; metadata and sections are left to the chapter.
    DocumentSettings m_Settings;
    /// Markers of bulleted lists by depth; the last serves all that are deeper.
    std::vector<std::string> m_Bullets{"\u2022", "\u2013", "\u00B7"};
    /// Width of the text in points.
    double m_Measure = 0;
    /// The title page's master, or empty: then it uses the body's first.
    std::string m_TitleMaster;
};

/// Names of the styles that imported text uses. A template may leave any out: its text then looks like the default.
namespace StyleName
{
inline constexpr char const * Body = "Body";
/// A paragraph that follows a heading or another break, which needs no indentation to be seen.
inline constexpr char const * First = "First paragraph";
inline constexpr char const * ChapterTitle = "Chapter title";
inline constexpr char const * ChapterNumber = "Chapter number";
inline constexpr char const * PartTitle = "Part title";
/// With the level from 1 to 6 behind it.
inline constexpr char const * Heading = "Heading ";
inline constexpr char const * Quotation = "Quotation";
inline constexpr char const * ListItem = "List item";
inline constexpr char const * LooseListItem = "Loose list item";
inline constexpr char const * Code = "Code";
inline constexpr char const * Figure = "Figure";
inline constexpr char const * Caption = "Caption";
inline constexpr char const * FileName = "File name";
inline constexpr char const * Rule = "Rule";
inline constexpr char const * Table = "Table";
inline constexpr char const * TableText = "Table text";
inline constexpr char const * TableHead = "Table head";
inline constexpr char const * MarkedBox = "Marked box";
inline constexpr char const * BookTitle = "Book title";
inline constexpr char const * BookSubtitle = "Book subtitle";
inline constexpr char const * BookAuthor = "Book author";
inline constexpr char const * Link = "Link";
}

/// Reads a template. Nothing comes back if the file cannot be read or has an error; `messages` says what and where.
/// Unknown keys are warnings.
std::optional<Template> ReadTemplate(std::filesystem::path const & path, MessageList & messages);
std::optional<Template> ReadTemplateText(std::string const & text, std::string const & shownName,
                                         MessageList & messages);

/// The file of a template. A name with a slash or the ending ".toml" is a path from `folder`; any other is looked for
/// as NAME.toml in `folder`, beside the program (share/korvane-book/templates) and in the source tree. An unknown one
/// is an error in `messages` that lists the names there are.
std::optional<std::filesystem::path> FindTemplate(std::string const & name, std::filesystem::path const & folder,
                                                  MessageList & messages);

/// Names of the templates that come with the program, sorted.
std::vector<std::string> ListTemplates();

}
