#pragma once

#include "import/InlineBuilder.h"
#include "import/MarkdownReader.h"
#include "import/MarkdownTree.h"
#include "import/Slug.h"

#include <array>
#include <map>
#include <set>

namespace Import
{

struct HtmlToken;

/// The work behind `ReadMarkdown`: one walk over the parsed tree, without recursion, as nesting has no limit.
/// Used once, by one thread.
class ChapterReader
{
public:
    ChapterReader(std::string_view text, ReadOptions const & options, MessageList & messages);
    ChapterText Read();

private:
    /// The tree of the source, without tables that no book can hold.
    [[nodiscard]] MarkdownTree ParseTamed();

    /// A list that is open at this point of the walk.
    struct OpenList
    {
        bool m_IsOrdered = false;
        int m_Number = 0;
        char m_Delimiter = '.';
        bool m_IsTight = false;
    };

    /// A raw tag that is open, with the looks that it adds.
    struct OpenTag
    {
        std::string m_Name;
        Mark m_Marks = Mark::None;
        std::int32_t m_OuterLink = -1;
        int m_Line = 0;
        bool m_IsLink = false;
    };

    /// The end of a link or picture, where an attribute list may follow.
    struct AttributeSpot
    {
        std::uint32_t m_Start = 0;
        std::uint32_t m_End = 0;
        std::int32_t m_Link = -1;
        std::int32_t m_Picture = -1;
    };

    // The walk over blocks: ChapterReader.cpp.
    void Visit(cmark_node * node, bool isEnter);
    void VisitList(cmark_node * node, bool isEnter);
    void VisitItem(cmark_node * node, bool isEnter);
    void VisitHeading(cmark_node * node, bool isEnter);
    void VisitParagraph(cmark_node * node, bool isEnter);
    void VisitTablePart(cmark_node * node, bool isEnter);
    void VisitNoteDefinition(cmark_node * node, bool isEnter);
    void ReadCodeBlock(cmark_node * node);
    void FinishTable();
    Block & Emit(BlockKind kind, int line);
    void EmitMarkedBox(std::string_view text, int line);
    void EmitText(BlockKind kind, int level, int line);
    bool ReadFence(int line);
    void PlacePendingAnchors(Block & block);
    void ReportUnusedNotes();
    void RememberLines(cmark_node * node);

    // Text and markup within a paragraph: ChapterReaderInline.cpp.
    void VisitInline(cmark_node * node, bool isEnter);
    void EnterMark(Mark mark, bool isEnter);
    void EnterLink(cmark_node * node, bool isEnter);
    void EnterPicture(cmark_node * node, bool isEnter);
    void AppendText(std::string_view text, bool isVerbatim);
    void ReadNoteReference(cmark_node * node);
    void UpdateLook();
    void ReadSpots();
    void ReadBracketedSpans();
    void ApplyToLink(AttributeSpot const & spot, Attributes const & attributes, int line);
    void ApplyToPicture(std::uint32_t picture, Attributes const & attributes, int line);
    void ApplyToSpan(std::uint32_t start, std::uint32_t end, Attributes const & attributes, int line);
    void AddIndexMark(std::uint32_t start, std::u16string_view text, Attributes const & attributes, int line);
    void ReportLeftovers();
    void ReportDirectives(std::string_view text, int line);
    Attributes TakeHeadingAttributes();
    void FinishInline();
    void AddAnchorAt(std::uint32_t position, std::string const & id, int line);
    static Mark MarkOfClass(std::string_view name);

    // Raw HTML: ChapterReaderHtml.cpp.
    void ReadInlineHtml(std::string_view html, int line);
    void ReadHtmlBlock(cmark_node * node);
    void ReadTag(HtmlToken const & token, int line);
    bool ReadBlockTag(HtmlToken const & token, int line);
    void ReadListingTag(HtmlToken const & token, int line);
    void ReadImageTag(HtmlToken const & token, int line);
    void CloseTag(std::string const & name);
    void CloseAllTags();
    void FinishHtmlParagraph(int line);
    /// Reads a caption's markup; `label` stands before it as it is.
    InlineText ReadCaption(std::string const & label, std::string const & text, int line);

    [[nodiscard]] Place PlaceAt(int line) const { return {m_Options.m_ShownName, line + m_LineOffset, 0}; }
    void Warn(std::string_view kind, int line, std::string text);
    InlineBuilder & Builder() { return m_Builders.back(); }
    /// The blocks of the chapter, or of the note that is being read.
    std::vector<Block> & Target()
    {
        return m_OpenNotes.empty() ? m_Chapter.m_Blocks : m_Chapter.m_Notes[m_OpenNotes.back()].m_Blocks;
    }

    std::string_view m_Source;
    ReadOptions m_Options;
    MessageList & m_Messages;
    ChapterText m_Chapter;
    SmartTypography m_Smart;
    SlugCounter m_Slugs;
    std::set<std::string> m_ExplicitIds;

    std::vector<OpenList> m_Lists;
    int m_QuoteDepth = 0;
    ListMark m_PendingMark = ListMark::None;
    std::vector<std::uint32_t> m_PendingAnchors;
    BlockKind m_BlockKind = BlockKind::Paragraph;
    int m_HtmlHeading = 0;
    std::string m_ListingLabel;
    std::string m_ListingCaption;
    std::unique_ptr<Table> m_Table;
    int m_TableLine = 0;
    int m_NotesSeen = 0;
    /// Indices of the notes that are being read, one within the other.
    std::vector<std::size_t> m_OpenNotes;

    /// The paragraph's builder below, one for each open picture's alternative text above.
    std::vector<InlineBuilder> m_Builders;
    std::vector<InlineText> m_PictureCaptions;
    /// How often each look is open, by bit.
    std::array<int, 16> m_Open{};
    std::vector<OpenTag> m_Tags;
    std::vector<std::uint32_t> m_LinkStarts;
    std::vector<AttributeSpot> m_Spots;
    /// Number of spots when each open picture began.
    std::vector<std::size_t> m_SpotsOutside;
    /// Lines of code and raw HTML, where no note is defined; and lines on which used notes are.
    std::vector<std::pair<int, int>> m_CodeLines;
    std::set<int> m_NoteLines;
    int m_LineOffset = 0;
    bool m_HasReportedControls = false;
};

}
