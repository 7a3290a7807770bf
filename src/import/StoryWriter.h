#pragma once

#include "framework/story/ParagraphAtts.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/StoryBuilder.h"
#include "import/ChapterText.h"
#include "import/LinkTarget.h"
#include "import/Template.h"

#include <functional>
#include <map>

namespace Import
{

/// What a chapter's text needs to know of the book that it belongs to.
struct StoryContext
{
    /// Name of the chapter in the plan.
    std::string m_Chapter;
    /// Names of all chapters, sorted.
    std::vector<std::string> m_Chapters;
    /// Set above the chapter's title, or empty.
    std::string m_Part;
    std::string m_Number;
    /// Gives the fields of a picture; called once for each picture in the text.
    std::function<Story::PictureGlyph::Fields(Picture const &)> m_LoadPicture;
};

/// Turns a chapter's blocks into a story in the styles of a template. Used once, by one thread.
class StoryWriter
{
public:
    /// Borrows all that it is given.
    StoryWriter(ChapterText const & chapter, Template const & look, StoryContext const & context);

    [[nodiscard]] Kernel::Counted<Story::Story> Write();

private:
    using GlyphAttsPtr = Kernel::Counted<Story::GlyphAtts const>;
    using ParagraphAttsPtr = Kernel::Counted<Story::ParagraphAtts const>;

    void WriteBlocks(std::vector<Block> const & blocks, bool isNote);
    void WriteBlock(Block const & block, Block const * before, Block const * next, bool isNote);
    void WriteFigure(Block const & block);
    void WriteTable(Block const & block);
    void WriteInline(InlineText const & text);
    void WriteObject(InlineObject const & object, GlyphAttsPtr const & atts);
    void WriteAnchor(Anchor const & anchor);
    void WriteStartAnchor();
    void WriteLine(char const * style, std::string const & text);
    [[nodiscard]] Kernel::Counted<Story::Story> WriteApart(std::vector<Block> const & blocks);
    [[nodiscard]] Kernel::Counted<Story::Story> WriteCell(InlineText const & text, bool isHead);

    [[nodiscard]] std::string StyleOf(Block const & block, Block const * before, bool isNote) const;
    [[nodiscard]] ParagraphAttsPtr AttsOf(Block const & block, std::string const & style, Block const * before,
                                          Block const * next);
    [[nodiscard]] Kernel::Counted<Story::ListAtt const> ListAttOf(Block const & block);
    [[nodiscard]] GlyphAttsPtr AttsOf(Mark marks, std::int32_t link);
    [[nodiscard]] Kernel::Counted<Story::HyperlinkData const> LinkOf(std::int32_t link);

    ChapterText const & m_Chapter;
    Template const & m_Look;
    StoryContext const & m_Context;
    Story::StyleSheet const & m_Styles;
    Story::StoryBuilder * m_Builder = nullptr;
    std::map<std::pair<int, std::int32_t>, GlyphAttsPtr> m_GlyphAtts;
    std::map<std::int32_t, Kernel::Counted<Story::HyperlinkData const>> m_Links;
    /// Number that the next item of each depth would have by itself.
    std::vector<int> m_NextNumbers;
    Block const * m_TitleBlock = nullptr;
    /// The heading that is being written, until its first anchor is: that one stands for it in outlines.
    Block const * m_Heading = nullptr;
    bool m_HasStartAnchor = false;
    int m_NoteDepth = 0;
};

/// The story of a title page.
[[nodiscard]] Kernel::Counted<Story::Story> WriteTitlePage(std::string const & title, std::string const & subtitle,
                                                           std::string const & author);

}
