#include "import/StoryWriter.h"

#include "framework/story/IndexTopic.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/StyleSheet.h"
#include "framework/story/TableGlyph.h"
#include "import/SourceText.h"

#include <algorithm>
#include <array>

namespace Import
{

namespace
{

struct MarkStyle
{
    Mark m_Mark;
    char const * m_Style;
};

/// Character styles in the order in which they are laid over each other.
constexpr std::array g_MarkStyles{
    MarkStyle{Mark::Emphasis, "Emphasis"},
    MarkStyle{Mark::Strong, "Strong"},
    MarkStyle{Mark::Code, "Code"},
    MarkStyle{Mark::Keyboard, "Keyboard"},
    MarkStyle{Mark::Strike, "Strike-through"},
    MarkStyle{Mark::Underline, "Underline"},
    MarkStyle{Mark::Superscript, "Superscript"},
    MarkStyle{Mark::Subscript, "Subscript"},
    MarkStyle{Mark::Small, "Small"},
    MarkStyle{Mark::SmallCaps, "Small capitals"},
    MarkStyle{Mark::Highlight, "Highlight"},
};

/// Deep lists may take no more than this part of the measure.
constexpr double g_MaximumListPart = 0.45;

bool StartsAnew(Block const * before)
{
    return !before || BlockKind::Paragraph != before->m_Kind || 0 < before->m_ListDepth || 0 < before->m_QuoteDepth;
}

std::string PlainText(InlineText const & text)
{
    std::u16string plain;
    for (char16_t const c : text.m_Text) {
        if (u'\uFFFC' != c) {
            plain += u'\u2028' == c ? u' ' : c;
        }
    }
    return ToUtf8(plain);
}

std::string JoinTopic(std::vector<std::string> const & names)
{
    std::string result;
    for (std::string const & name : names) {
        result += result.empty() ? name : Story::IndexTopic::NameSeparator + name;
    }
    return result;
}

}

StoryWriter::StoryWriter(ChapterText const & chapter, Template const & look, StoryContext const & context)
    : m_Chapter(chapter),
      m_Look(look),
      m_Context(context),
      m_Styles(*look.m_Settings.m_Styles)
{
    // The first heading is the chapter's title, whatever stands before it.
    auto const title = std::find_if(chapter.m_Blocks.begin(), chapter.m_Blocks.end(),
                                    [](Block const & block) { return BlockKind::Heading == block.m_Kind; });
    m_TitleBlock = title == chapter.m_Blocks.end() ? nullptr : &*title;
}

Kernel::Counted<Story::Story> StoryWriter::Write()
{
    Story::StoryBuilder builder;
    m_Builder = &builder;
    if (!m_Context.m_Part.empty()) {
        WriteLine(StyleName::PartTitle, m_Context.m_Part);
    }
    if (!m_Context.m_Number.empty()) {
        WriteLine(StyleName::ChapterNumber, m_Context.m_Number);
    }
    WriteBlocks(m_Chapter.m_Blocks, false);
    if (0 == builder.GetLength()) {
        WriteLine(StyleName::Body, "");
    }
    m_Builder = nullptr;
    return builder.Finish();
}

void StoryWriter::WriteLine(char const * style, std::string const & text)
{
    WriteStartAnchor();
    m_Builder->AppendText(text, nullptr);
    m_Builder->EndParagraph(Story::ParagraphAtts::FromStyle(style));
}

void StoryWriter::WriteStartAnchor()
{
    if (!m_HasStartAnchor && 0 == m_NoteDepth) {
        m_HasStartAnchor = true;
        WriteAnchor({});
    }
}

void StoryWriter::WriteBlocks(std::vector<Block> const & blocks, bool isNote)
{
    for (std::size_t at = 0; at < blocks.size(); ++at) {
        WriteBlock(blocks[at], 0 < at ? &blocks[at - 1] : nullptr, at + 1 < blocks.size() ? &blocks[at + 1] : nullptr,
                   isNote);
    }
}

std::string StoryWriter::StyleOf(Block const & block, Block const * before, bool isNote) const
{
    switch (block.m_Kind) {
    case BlockKind::Heading:
        if (&block == m_TitleBlock && 1 == block.m_Level) {
            return StyleName::ChapterTitle;
        }
        return StyleName::Heading + std::to_string(block.m_Level);
    case BlockKind::Code:
        return StyleName::Code;
    case BlockKind::Rule:
        return StyleName::Rule;
    case BlockKind::Table:
        return StyleName::Table;
    case BlockKind::Figure:
        return StyleName::Figure;
    case BlockKind::Caption:
        return StyleName::Caption;
    case BlockKind::FileName:
        return StyleName::FileName;
    case BlockKind::MarkedBox:
        return StyleName::MarkedBox;
    case BlockKind::Paragraph:
        break;
    }
    if (isNote) {
        return Story::StyleSheet::NoteTextStyle;
    }
    if (0 < block.m_ListDepth) {
        return block.m_IsTight ? StyleName::ListItem : StyleName::LooseListItem;
    }
    if (0 < block.m_QuoteDepth) {
        return StyleName::Quotation;
    }
    return StartsAnew(before) ? StyleName::First : StyleName::Body;
}

Kernel::Counted<Story::ListAtt const> StoryWriter::ListAttOf(Block const & block)
{
    if (ListMark::None == block.m_ListMark) {
        return nullptr;
    }
    auto att = Kernel::MakeCounted<Story::ListAtt>();
    auto const depth = static_cast<std::size_t>(block.m_ListDepth);
    att->SetLevel(static_cast<int>(depth) - 1);
    m_NextNumbers.resize(depth);
    if (ListMark::Number != block.m_ListMark) {
        std::string const & bullet = ListMark::TaskOpen == block.m_ListMark ? "\u2610"
                                     : ListMark::TaskDone == block.m_ListMark
                                         ? "\u2611"
                                         : m_Look.m_Bullets[std::min(depth, m_Look.m_Bullets.size()) - 1];
        att->SetKind(Story::ListAtt::Bulleted);
        att->SetName("Bullets");
        att->SetBullet(String(bullet));
        return att;
    }
    att->SetKind(Story::ListAtt::Numbered);
    att->SetName("Numbers");
    att->SetSuffix(String(std::string_view(&block.m_NumberDelimiter, 1)));
    int & next = m_NextNumbers[depth - 1];
    if (next != block.m_Number || 0 == next) {
        att->SetIsRestartNumbering(true);
        att->SetStartNumberingAt(block.m_Number);
    }
    next = block.m_Number + 1;
    return att;
}

StoryWriter::ParagraphAttsPtr StoryWriter::AttsOf(Block const & block, std::string const & style, Block const * before,
                                                  Block const * next)
{
    namespace Att = Story::ParagraphAtt;
    Story::ParagraphFormat const & format = m_Styles.ResolveParagraphStyle(style).m_Paragraph;
    Story::AttSet atts;
    atts.SetString(Att::Style, String(style));

    double const step = m_Styles.ResolveParagraphStyle(StyleName::ListItem).m_Paragraph.m_ListIndent;
    double const most = m_Look.m_Measure * g_MaximumListPart;
    double const depth = block.m_ListDepth;
    double const indent = std::min(depth * step, most);
    double left = format.m_LeftIndent;
    if (BlockKind::Paragraph == block.m_Kind && 0 < block.m_QuoteDepth) {
        double const quote = m_Styles.ResolveParagraphStyle(StyleName::Quotation).m_Paragraph.m_LeftIndent;
        bool const isQuotation = StyleName::Quotation == style;
        left += std::min(quote * (block.m_QuoteDepth - (isQuotation ? 1 : 0)), most);
    }
    if (&block == m_TitleBlock && !before && !(m_Context.m_Part.empty() && m_Context.m_Number.empty())) {
        // The lines of part and number belong to the title.
        atts.SetDouble(Att::SpaceBefore, 0);
    }
    bool const isItem = ListMark::None != block.m_ListMark && BlockKind::Paragraph == block.m_Kind;
    if (isItem && most < depth * step) {
        atts.SetDouble(Att::ListIndent, most / depth);
    } else if (!isItem) {
        left += indent;
    }
    if (left != format.m_LeftIndent) {
        atts.SetDouble(Att::LeftIndent, left);
    }
    if (0 < block.m_ListDepth && BlockKind::Paragraph == block.m_Kind) {
        // A list as a whole stands apart from the text round it, however close its items are.
        double const gap = m_Styles.ResolveParagraphStyle(StyleName::Body).m_Paragraph.m_Leading / 2;
        if (!before || 0 == before->m_ListDepth) {
            atts.SetDouble(Att::SpaceBefore, std::max(gap, format.m_SpaceBefore));
        }
        if (!next || 0 == next->m_ListDepth) {
            atts.SetDouble(Att::SpaceAfter, std::max(gap, format.m_SpaceAfter));
        }
    }
    return Kernel::MakeCounted<Story::ParagraphAtts>(std::move(atts), Story::AttSet(),
                                                     isItem ? ListAttOf(block) : nullptr);
}

void StoryWriter::WriteBlock(Block const & block, Block const * before, Block const * next, bool isNote)
{
    if (0 == block.m_ListDepth) {
        m_NextNumbers.clear();
    }
    WriteStartAnchor();
    // The mark of an item that begins with something else than text stands in a paragraph of its own.
    if (ListMark::None != block.m_ListMark && BlockKind::Paragraph != block.m_Kind) {
        Block item;
        item.m_ListDepth = block.m_ListDepth;
        item.m_QuoteDepth = block.m_QuoteDepth;
        item.m_ListMark = block.m_ListMark;
        item.m_Number = block.m_Number;
        item.m_NumberDelimiter = block.m_NumberDelimiter;
        item.m_IsTight = true;
        m_Builder->EndParagraph(AttsOf(item, StyleName::ListItem, before, &block));
    }
    if (BlockKind::Figure == block.m_Kind) {
        WriteFigure(block);
        return;
    }
    ParagraphAttsPtr const atts = AttsOf(block, StyleOf(block, before, isNote), before, next);
    if (BlockKind::Table == block.m_Kind) {
        WriteInline(block.m_Text);
        WriteTable(block);
    } else if (BlockKind::Rule == block.m_Kind) {
        m_Builder->AppendObject(Kernel::MakeCounted<Story::RuleGlyph>(), nullptr);
    } else if (BlockKind::Code == block.m_Kind) {
        // The style of the paragraph says all: the look of inline code would shrink it once more.
        InlineText text = block.m_Text;
        for (Span & span : text.m_Spans) {
            span.m_Marks = Mark::None;
        }
        WriteInline(text);
    } else {
        m_Heading = BlockKind::Heading == block.m_Kind ? &block : nullptr;
        WriteInline(block.m_Text);
        m_Heading = nullptr;
    }
    m_Builder->EndParagraph(atts);
}

void StoryWriter::WriteFigure(Block const & block)
{
    InlineText caption = block.m_Text;
    InlineText picture;
    auto const isPicture = [](InlineObject const & object) { return ObjectKind::Picture == object.m_Kind; };
    auto const found = std::find_if(caption.m_Objects.begin(), caption.m_Objects.end(), isPicture);
    picture.m_Objects.push_back(*found);
    caption.m_Objects.erase(found);

    Block const plain;
    Block placed;
    placed.m_Kind = BlockKind::Figure;
    placed.m_ListDepth = block.m_ListDepth;
    WriteInline(picture);
    bool const hasCaption = !caption.m_Text.empty();
    if (!hasCaption) {
        WriteInline(caption);
    }
    ParagraphAttsPtr atts = AttsOf(placed, StyleName::Figure, &plain, &plain);
    if (hasCaption) {
        Story::AttSet set = atts->GetAtts();
        set.SetInt(Story::ParagraphAtt::KeepWithNext, 1);
        atts = Kernel::MakeCounted<Story::ParagraphAtts>(std::move(set), Story::AttSet(), nullptr);
    }
    m_Builder->EndParagraph(atts);
    if (hasCaption) {
        placed.m_Kind = BlockKind::Caption;
        WriteInline(caption);
        m_Builder->EndParagraph(AttsOf(placed, StyleName::Caption, &plain, &plain));
    }
}

Kernel::Counted<Story::Story> StoryWriter::WriteCell(InlineText const & text, bool isHead)
{
    Story::StoryBuilder builder;
    Story::StoryBuilder * const outer = std::exchange(m_Builder, &builder);
    WriteInline(text);
    builder.EndParagraph(Story::ParagraphAtts::FromStyle(isHead ? StyleName::TableHead : StyleName::TableText));
    m_Builder = outer;
    return builder.Finish();
}

void StoryWriter::WriteTable(Block const & block)
{
    Table const & table = *block.m_Table;
    Story::TableGlyph::Fields fields;
    fields.m_Rows = static_cast<std::uint32_t>(table.m_Rows.size());
    fields.m_Columns = static_cast<std::uint32_t>(table.m_Columns.size());
    fields.m_HeaderRows = static_cast<std::uint32_t>(table.m_HeaderRows);
    for (CellAlignment const alignment : table.m_Columns) {
        fields.m_Alignments.push_back(CellAlignment::Centre == alignment  ? Story::ParagraphAtt::Centre
                                      : CellAlignment::Right == alignment ? Story::ParagraphAtt::Right
                                                                          : Story::ParagraphAtt::Left);
    }
    for (std::size_t row = 0; row < table.m_Rows.size(); ++row) {
        for (TableCell const & cell : table.m_Rows[row]) {
            fields.m_Cells.push_back(WriteCell(cell.m_Text, row < static_cast<std::size_t>(table.m_HeaderRows)));
        }
    }
    m_Builder->AppendObject(Kernel::MakeCounted<Story::TableGlyph>(std::move(fields)), nullptr);
}

StoryWriter::GlyphAttsPtr StoryWriter::AttsOf(Mark marks, std::int32_t link)
{
    if (Mark::None == marks && link < 0) {
        return nullptr;
    }
    GlyphAttsPtr & known = m_GlyphAtts[{static_cast<int>(marks), link}];
    if (known) {
        return known;
    }
    std::vector<char const *> styles;
    Kernel::Counted<Story::HyperlinkData const> const target = LinkOf(link);
    if (target) {
        styles.push_back(StyleName::Link);
    }
    for (MarkStyle const & candidate : g_MarkStyles) {
        if (Has(marks, candidate.m_Mark)) {
            styles.push_back(candidate.m_Style);
        }
    }
    Story::AttSet atts;
    if (1 == styles.size()) {
        atts.SetString(Story::GlyphAtt::Style, styles.front());
    } else {
        // A run has one character style; several looks are laid into one set.
        for (char const * style : styles) {
            atts.Merge(m_Styles.ResolveCharacterStyle(style));
        }
    }
    known = Kernel::MakeCounted<Story::GlyphAtts>(std::move(atts), target);
    return known;
}

Kernel::Counted<Story::HyperlinkData const> StoryWriter::LinkOf(std::int32_t link)
{
    if (link < 0) {
        return nullptr;
    }
    if (auto const known = m_Links.find(link); known != m_Links.end()) {
        return known->second;
    }
    std::string const & written = m_Chapter.m_Links[static_cast<std::size_t>(link)].m_Target;
    LinkTarget const target = ReadLinkTarget(written, m_Context.m_Chapter, m_Context.m_Chapters);
    Kernel::Counted<Story::HyperlinkData const> data;
    switch (target.m_Kind) {
    case LinkTarget::Kind::Web:
        data = Story::HyperlinkData::ToWeb(String(target.m_Address));
        break;
    case LinkTarget::Kind::Mail: {
        Story::HyperlinkData::Fields fields;
        fields.m_Type = Story::HyperlinkData::Type::Mail;
        fields.m_Path = String(target.m_Address);
        fields.m_TargetText = String(written);
        data = Kernel::MakeCounted<Story::HyperlinkData>(std::move(fields));
        break;
    }
    case LinkTarget::Kind::Chapter:
        data = Story::HyperlinkData::ToAnchor(String(MakeAnchorUid(target.m_Chapter, target.m_Id)), String(written));
        break;
    case LinkTarget::Kind::Unknown:
        break;
    }
    m_Links.emplace(link, data);
    return data;
}

void StoryWriter::WriteAnchor(Anchor const & anchor)
{
    String const uid(MakeAnchorUid(m_Context.m_Chapter, anchor.m_Id));
    Kernel::Counted<Story::AnchorData> data;
    if (m_Heading && !anchor.m_Id.empty()) {
        // The chapter's title is the outline's entry of the chapter itself.
        Block const & heading = *std::exchange(m_Heading, nullptr);
        bool const isBookmark = &heading != m_TitleBlock;
        data = Kernel::MakeCounted<Story::AnchorData>(String(PlainText(heading.m_Text)), isBookmark, true, uid,
                                                      heading.m_Level);
    } else {
        String const name(anchor.m_Id.empty() ? m_Context.m_Chapter : anchor.m_Id);
        data = Kernel::MakeCounted<Story::AnchorData>(name, false, false, uid);
    }
    m_Builder->AppendObject(Kernel::MakeCounted<Story::AnchorGlyph>(data), nullptr);
}

void StoryWriter::WriteObject(InlineObject const & object, GlyphAttsPtr const & atts)
{
    switch (object.m_Kind) {
    case ObjectKind::Anchor:
        WriteAnchor(m_Chapter.m_Anchors[object.m_Index]);
        break;
    case ObjectKind::IndexMark:
        m_Builder->AppendObject(Kernel::MakeCounted<Story::IndexMarkGlyph>(
                                    String(JoinTopic(m_Chapter.m_IndexMarks[object.m_Index].m_Topic))),
                                atts);
        break;
    case ObjectKind::Picture:
        m_Builder->AppendObject(
            Kernel::MakeCounted<Story::PictureGlyph>(m_Context.m_LoadPicture(m_Chapter.m_Pictures[object.m_Index])),
            atts);
        break;
    case ObjectKind::NoteReference: {
        // A note within a note is set in brackets at its place: notes have one level.
        Note const & note = m_Chapter.m_Notes[object.m_Index];
        if (0 < m_NoteDepth) {
            m_Builder->AppendText(" [", atts);
            ++m_NoteDepth;
            for (Block const & block : note.m_Blocks) {
                if (m_NoteDepth < 8) {
                    WriteInline(block.m_Text);
                }
            }
            --m_NoteDepth;
            m_Builder->AppendText("]", atts);
            break;
        }
        auto att = Kernel::MakeCounted<Story::NoteAtt>();
        att->SetKind(Story::NoteAtt::Endnote);
        m_Builder->AppendObject(Kernel::MakeCounted<Story::PinnoteGlyph>(att, WriteApart(note.m_Blocks)), atts);
        break;
    }
    }
}

Kernel::Counted<Story::Story> StoryWriter::WriteApart(std::vector<Block> const & blocks)
{
    Story::StoryBuilder builder;
    Story::StoryBuilder * const outer = std::exchange(m_Builder, &builder);
    std::vector<int> const numbers = std::exchange(m_NextNumbers, {});
    ++m_NoteDepth;
    WriteBlocks(blocks, true);
    if (0 == builder.GetLength()) {
        builder.EndParagraph(Story::ParagraphAtts::FromStyle(Story::StyleSheet::NoteTextStyle));
    }
    --m_NoteDepth;
    m_NextNumbers = numbers;
    m_Builder = outer;
    return builder.Finish();
}

void StoryWriter::WriteInline(InlineText const & text)
{
    std::size_t object = 0;
    auto const writeText = [&](std::uint32_t start, std::uint32_t end, GlyphAttsPtr const & atts) {
        while (start < end) {
            std::size_t const lineEnd = std::min<std::size_t>(text.m_Text.find(u'\u2028', start), end);
            std::u16string_view const piece = std::u16string_view(text.m_Text).substr(start, lineEnd - start);
            m_Builder->AppendText(ToUtf8(piece), atts);
            start = static_cast<std::uint32_t>(lineEnd);
            if (start < end) {
                m_Builder->AppendLineBreak(atts);
                ++start;
            }
        }
    };
    for (Span const & span : text.m_Spans) {
        GlyphAttsPtr const atts = AttsOf(span.m_Marks, span.m_Link);
        std::uint32_t at = span.m_Start;
        std::uint32_t const end = span.m_Start + span.m_Length;
        for (; object < text.m_Objects.size() && text.m_Objects[object].m_Position < end; ++object) {
            InlineObject const & place = text.m_Objects[object];
            writeText(at, place.m_Position, atts);
            WriteObject(place, atts);
            bool const isInText = ObjectKind::NoteReference == place.m_Kind || ObjectKind::Picture == place.m_Kind;
            at = place.m_Position + (isInText && u'\uFFFC' == text.m_Text[place.m_Position] ? 1 : 0);
        }
        writeText(at, end, atts);
    }
    for (; object < text.m_Objects.size(); ++object) {
        WriteObject(text.m_Objects[object], nullptr);
    }
}

Kernel::Counted<Story::Story> WriteTitlePage(std::string const & title, std::string const & subtitle,
                                             std::string const & author)
{
    Story::StoryBuilder builder;
    auto const write = [&](std::string const & text, char const * style) {
        if (!text.empty()) {
            builder.AppendText(text, nullptr);
            builder.EndParagraph(Story::ParagraphAtts::FromStyle(style));
        }
    };
    write(title, StyleName::BookTitle);
    write(subtitle, StyleName::BookSubtitle);
    write(author, StyleName::BookAuthor);
    return builder.Finish();
}

}
