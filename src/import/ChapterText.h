#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace Import
{

/// Looks that inline markup gives to text; they add up.
enum class Mark : std::uint16_t
{
    None = 0,
    Emphasis = 1,
    Strong = 2,
    Strike = 4,
    Code = 8,
    Subscript = 16,
    Superscript = 32,
    Underline = 64,
    Keyboard = 128,
    Small = 256,
    SmallCaps = 512,
    Highlight = 1024
};

constexpr Mark operator|(Mark a, Mark b)
{
    return static_cast<Mark>(static_cast<int>(a) | static_cast<int>(b));
}
constexpr Mark operator-(Mark a, Mark b)
{
    return static_cast<Mark>(static_cast<int>(a) & ~static_cast<int>(b));
}
constexpr bool Has(Mark marks, Mark mark)
{
    return 0 != (static_cast<int>(marks) & static_cast<int>(mark));
}

/// Attributes in pandoc's notation: `{#id .class key=value}`.
struct Attributes
{
    std::string m_Id;
    std::vector<std::string> m_Classes;
    std::vector<std::pair<std::string, std::string>> m_Values;

    [[nodiscard]] bool Empty() const { return m_Id.empty() && m_Classes.empty() && m_Values.empty(); }
    [[nodiscard]] bool HasClass(std::string_view name) const;
    /// Value of a key, or null.
    [[nodiscard]] std::string const * Find(std::string_view key) const;
};

/// A stretch of one look and one link. Spans follow each other without gaps and cover their text.
struct Span
{
    std::uint32_t m_Start = 0;
    std::uint32_t m_Length = 0;
    Mark m_Marks = Mark::None;
    /// Index in the chapter's links, -1 for none.
    std::int32_t m_Link = -1;

    friend bool operator==(Span const &, Span const &) = default;
};

/// What stands in the text in place of a character, or between two.
enum class ObjectKind : std::uint8_t
{
    /// Occupies one U+FFFC; index in the chapter's notes.
    NoteReference,
    /// Occupies one U+FFFC; index in the chapter's pictures.
    Picture,
    /// Occupies nothing; index in the chapter's anchors.
    Anchor,
    /// Occupies nothing; index in the chapter's index marks.
    IndexMark
};

struct InlineObject
{
    std::uint32_t m_Position = 0;
    ObjectKind m_Kind = ObjectKind::Anchor;
    std::uint32_t m_Index = 0;

    friend bool operator==(InlineObject const &, InlineObject const &) = default;
};

/// The text of one paragraph in UTF-16. A forced line break is U+2028.
struct InlineText
{
    std::u16string m_Text;
    std::vector<Span> m_Spans;
    /// Sorted by position.
    std::vector<InlineObject> m_Objects;

    [[nodiscard]] bool Empty() const { return m_Text.empty() && m_Objects.empty(); }
    friend bool operator==(InlineText const &, InlineText const &) = default;
};

enum class BlockKind : std::uint8_t
{
    Paragraph,
    Heading,
    /// Lines are parted by U+2028; no look, no smart typography.
    Code,
    /// A thematic break.
    Rule,
    Table,
    /// A picture by itself: the text is its caption, the first object the picture.
    Figure,
    /// Text of a caption below a listing, table or picture.
    Caption,
    /// Name of a file above a listing.
    FileName,
    /// Stands in place of something that cannot be set: the text names it, in a box.
    MarkedBox
};

enum class ListMark : std::uint8_t
{
    None,
    Bullet,
    Number,
    TaskOpen,
    TaskDone
};

struct TableCell
{
    InlineText m_Text;
};

enum class CellAlignment : std::uint8_t
{
    Natural,
    Left,
    Centre,
    Right
};

/// All rows have as many cells as there are columns.
struct Table
{
    std::vector<CellAlignment> m_Columns;
    std::vector<std::vector<TableCell>> m_Rows;
    int m_HeaderRows = 0;
};

/// One paragraph or what stands in place of one. Nesting is flat: depths say in how many lists and quotations it lies.
struct Block
{
    BlockKind m_Kind = BlockKind::Paragraph;
    /// 1 to 6 for headings.
    std::uint8_t m_Level = 0;
    std::uint8_t m_ListDepth = 0;
    std::uint8_t m_QuoteDepth = 0;
    /// Set on the first paragraph of an item, which carries its bullet or number.
    ListMark m_ListMark = ListMark::None;
    /// The item's number.
    int m_Number = 0;
    char m_NumberDelimiter = '.';
    /// Items without space between them.
    bool m_IsTight = false;
    int m_Line = 0;
    InlineText m_Text;
    /// Language of a code block.
    std::string m_CodeLanguage;
    std::vector<std::string> m_Classes;
    std::unique_ptr<Table> m_Table;
};

struct Note
{
    std::string m_Label;
    int m_Line = 0;
    std::vector<Block> m_Blocks;
};

/// A link as written; whether its target exists is seen when all chapters are known.
struct Link
{
    std::string m_Target;
    int m_Line = 0;
    /// The text was empty, so the target's page or title is wanted.
    bool m_IsEmpty = false;
};

struct Picture
{
    /// As written, decoded; relative to the chapter's file.
    std::string m_Path;
    std::string m_Alternative;
    /// Share of the measure from `width=60%`, 0 if not given.
    double m_WidthShare = 0;
    /// Width in points from `width=5cm`, 0 if not given.
    double m_Width = 0;
    /// Page of a PDF from `page=2`, from 1.
    int m_Page = 1;
    int m_Line = 0;
};

struct Anchor
{
    /// Unique within the chapter.
    std::string m_Id;
    int m_Line = 0;
};

/// "Topic!Subtopic", outermost first.
struct IndexMark
{
    std::vector<std::string> m_Topic;
    /// Topic of a "see" reference, or empty.
    std::vector<std::string> m_See;
    int m_Line = 0;
};

/// What stands in the front matter.
struct FrontMatter
{
    std::string m_Title;
    std::vector<std::string> m_Authors;
    std::string m_Language;
    /// Lines of the file that the front matter takes.
    int m_Lines = 0;
};

/// A chapter read from Markdown: a neutral, flat form that knows nothing of templates and pages. A plain value.
struct ChapterText
{
    FrontMatter m_FrontMatter;
    std::vector<Block> m_Blocks;
    std::vector<Note> m_Notes;
    std::vector<Link> m_Links;
    std::vector<Picture> m_Pictures;
    std::vector<Anchor> m_Anchors;
    std::vector<IndexMark> m_IndexMarks;

    /// The front matter's title, or the first heading's text, or empty; always without markup.
    [[nodiscard]] std::string Title() const;
};

}
