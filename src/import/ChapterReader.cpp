#include "import/ChapterReader.h"

#include "import/AttributeReader.h"
#include "import/FrontMatterReader.h"
#include "import/SourceText.h"
#include "import/TableSize.h"
#include "import/Text.h"

#include <algorithm>

namespace Import
{

namespace
{

/// The text after the front matter's lines.
std::string_view WithoutLines(std::string_view text, int lines)
{
    for (; 0 < lines; --lines) {
        std::size_t const end = text.find('\n');
        text.remove_prefix(std::string_view::npos == end ? text.size() : end + 1);
    }
    return text;
}

/// "[^label]:" at the start of a line, or empty.
std::string_view NoteLabel(std::string_view line)
{
    std::size_t const start = line.find_first_not_of(' ');
    if (std::string_view::npos == start || 3 < start || !line.substr(start).starts_with("[^")) {
        return {};
    }
    std::size_t const end = line.find("]:", start);
    std::string_view const label =
        std::string_view::npos == end ? line.substr(0, 0) : line.substr(start + 2, end - start - 2);
    return std::string_view::npos == label.find_first_of(" \t[]") ? label : std::string_view();
}

std::string ListTextOf(std::string_view info)
{
    return std::string(info.substr(0, info.find_first_of(" ,\t{")));
}

}

ChapterReader::ChapterReader(std::string_view text, ReadOptions const & options, MessageList & messages)
    : m_Source(text),
      m_Options(options),
      m_Messages(messages),
      m_Smart("en")
{
    m_Chapter.m_FrontMatter = ReadFrontMatter(text, options.m_ShownName, messages);
    m_LineOffset = m_Chapter.m_FrontMatter.m_Lines;
    m_Source = WithoutLines(text, m_LineOffset);
    if (m_Chapter.m_FrontMatter.m_Language.empty()) {
        m_Chapter.m_FrontMatter.m_Language = options.m_Language;
    }
    m_Smart = SmartTypography(m_Chapter.m_FrontMatter.m_Language);
    m_Builders.emplace_back();
}

void ChapterReader::Warn(std::string_view kind, int line, std::string text)
{
    m_Messages.Warn(kind, PlaceAt(line), std::move(text));
}

MarkdownTree ChapterReader::ParseTamed()
{
    std::vector<int> const tables = FindEndlessTables(m_Source);
    for (int const line : tables) {
        Warn("table-size", line,
             Text("The table has more than %1 cells and is set as plain text; divide it.", "Source", g_MostTableCells));
    }
    return tables.empty() ? ParseMarkdown(m_Source) : ParseMarkdown(WithoutTables(m_Source, tables));
}

ChapterText ChapterReader::Read()
{
    MarkdownTree const tree = ParseTamed();
    cmark_iter * iterator = cmark_iter_new(tree.get());
    for (cmark_event_type event; CMARK_EVENT_DONE != (event = cmark_iter_next(iterator));) {
        Visit(cmark_iter_get_node(iterator), CMARK_EVENT_ENTER == event);
    }
    cmark_iter_free(iterator);

    if (!m_PendingAnchors.empty()) {
        if (m_Chapter.m_Blocks.empty()) {
            Emit(BlockKind::Paragraph, 1);
        }
        PlacePendingAnchors(m_Chapter.m_Blocks.back());
    }
    ReportUnusedNotes();
    return std::move(m_Chapter);
}

void ChapterReader::Visit(cmark_node * node, bool isEnter)
{
    switch (cmark_node_get_type(node)) {
    case CMARK_NODE_DOCUMENT:
        break;
    case CMARK_NODE_BLOCK_QUOTE:
        m_QuoteDepth += isEnter ? 1 : -1;
        break;
    case CMARK_NODE_LIST:
        VisitList(node, isEnter);
        break;
    case CMARK_NODE_ITEM:
        VisitItem(node, isEnter);
        break;
    case CMARK_NODE_HEADING:
        VisitHeading(node, isEnter);
        break;
    case CMARK_NODE_PARAGRAPH:
        VisitParagraph(node, isEnter);
        break;
    case CMARK_NODE_CODE_BLOCK:
        ReadCodeBlock(node);
        break;
    case CMARK_NODE_HTML_BLOCK:
        ReadHtmlBlock(node);
        break;
    case CMARK_NODE_THEMATIC_BREAK:
        Emit(BlockKind::Rule, cmark_node_get_start_line(node));
        break;
    case CMARK_NODE_FOOTNOTE_DEFINITION:
        VisitNoteDefinition(node, isEnter);
        break;
    default:
        if (IsTable(node) || IsTableRow(node) || IsTableCell(node)) {
            VisitTablePart(node, isEnter);
        } else if (IsTaskItem(node)) {
            VisitItem(node, isEnter);
        } else {
            VisitInline(node, isEnter);
        }
    }
}

void ChapterReader::VisitList(cmark_node * node, bool isEnter)
{
    if (!isEnter) {
        m_Lists.pop_back();
        return;
    }
    OpenList list;
    list.m_IsOrdered = CMARK_ORDERED_LIST == cmark_node_get_list_type(node);
    list.m_Number = cmark_node_get_list_start(node) - 1;
    list.m_Delimiter = CMARK_PAREN_DELIM == cmark_node_get_list_delim(node) ? ')' : '.';
    list.m_IsTight = 0 != cmark_node_get_list_tight(node);
    m_Lists.push_back(list);
}

void ChapterReader::VisitItem(cmark_node * node, bool isEnter)
{
    if (!isEnter) {
        // An item without any content still has its bullet.
        if (ListMark::None != m_PendingMark) {
            Emit(BlockKind::Paragraph, cmark_node_get_start_line(node));
        }
        return;
    }
    OpenList & list = m_Lists.back();
    ++list.m_Number;
    if (IsTaskItem(node)) {
        m_PendingMark = cmark_gfm_extensions_get_tasklist_item_checked(node) ? ListMark::TaskDone : ListMark::TaskOpen;
    } else {
        m_PendingMark = list.m_IsOrdered ? ListMark::Number : ListMark::Bullet;
    }
}

Block & ChapterReader::Emit(BlockKind kind, int line)
{
    Block & block = Target().emplace_back();
    block.m_Kind = kind;
    block.m_Line = line + m_LineOffset;
    block.m_ListDepth = static_cast<std::uint8_t>(std::min<std::size_t>(m_Lists.size(), 255));
    block.m_QuoteDepth = static_cast<std::uint8_t>(std::min(m_QuoteDepth, 255));
    if (!m_Lists.empty()) {
        block.m_IsTight = m_Lists.back().m_IsTight;
        block.m_ListMark = std::exchange(m_PendingMark, ListMark::None);
        block.m_Number = m_Lists.back().m_Number;
        block.m_NumberDelimiter = m_Lists.back().m_Delimiter;
    }
    return block;
}

void ChapterReader::EmitMarkedBox(std::string_view text, int line)
{
    InlineBuilder builder;
    builder.Append(ToUtf16(text), true);
    Emit(BlockKind::MarkedBox, line).m_Text = builder.Finish();
}

void ChapterReader::PlacePendingAnchors(Block & block)
{
    for (std::uint32_t const anchor : m_PendingAnchors) {
        block.m_Text.m_Objects.insert(block.m_Text.m_Objects.begin(), {0, ObjectKind::Anchor, anchor});
    }
    m_PendingAnchors.clear();
}

void ChapterReader::EmitText(BlockKind kind, int level, int line)
{
    FinishInline();
    InlineText text = Builder().Finish();
    bool const onlyAnchors =
        text.m_Text.empty() && std::all_of(text.m_Objects.begin(), text.m_Objects.end(),
                                           [](InlineObject const & o) { return ObjectKind::Anchor == o.m_Kind; });
    if (onlyAnchors && BlockKind::Heading != kind) {
        for (InlineObject const & object : text.m_Objects) {
            m_PendingAnchors.push_back(object.m_Index);
        }
        return;
    }
    // A picture that has its paragraph to itself is a figure, and its alternative text the caption.
    bool const isOnePicture = u"\uFFFC" == text.m_Text && BlockKind::Paragraph == kind;
    auto const picture = std::find_if(text.m_Objects.begin(), text.m_Objects.end(),
                                      [](InlineObject const & o) { return ObjectKind::Picture == o.m_Kind; });
    if (isOnePicture && picture != text.m_Objects.end()) {
        InlineObject const object = *picture;
        kind = BlockKind::Figure;
        text = std::move(m_PictureCaptions[object.m_Index]);
        text.m_Objects.insert(text.m_Objects.begin(), {0, ObjectKind::Picture, object.m_Index});
    }
    Block & block = Emit(kind, line);
    block.m_Level = static_cast<std::uint8_t>(level);
    block.m_Text = std::move(text);
    PlacePendingAnchors(block);
}

void ChapterReader::VisitHeading(cmark_node * node, bool isEnter)
{
    int const line = cmark_node_get_start_line(node);
    if (isEnter) {
        Builder().StartLine(line);
        return;
    }
    Attributes const attributes = TakeHeadingAttributes();
    std::u16string plain;
    for (char16_t const c : Builder().Text()) {
        plain += u'\n' == c || u'\u2028' == c ? u' ' : c;
    }
    while (!plain.empty() && u' ' == plain.back()) {
        plain.pop_back();
    }
    std::erase(plain, u'\uFFFC');
    if (attributes.m_Id.empty()) {
        std::string const slug = m_Slugs.MakeUnique(MakeSlug(ToUtf8(plain)));
        m_Chapter.m_Anchors.push_back({slug, line + m_LineOffset});
        Builder().AddObjectAt(0, ObjectKind::Anchor, static_cast<std::uint32_t>(m_Chapter.m_Anchors.size() - 1));
    } else {
        AddAnchorAt(0, attributes.m_Id, line);
    }
    EmitText(BlockKind::Heading, cmark_node_get_heading_level(node), line);
    Target().back().m_Classes = attributes.m_Classes;
}

void ChapterReader::VisitParagraph(cmark_node * node, bool isEnter)
{
    int const line = cmark_node_get_start_line(node);
    if (isEnter) {
        Builder().StartLine(line);
        m_BlockKind = BlockKind::Paragraph;
        return;
    }
    if (!ReadFence(line)) {
        EmitText(m_BlockKind, 0, line);
    }
    m_BlockKind = BlockKind::Paragraph;
}

bool ChapterReader::ReadFence(int line)
{
    // Fences of div blocks stand on lines of their own, but CommonMark joins them with their neighbours.
    std::u16string const & text = Builder().Text();
    if (std::u16string::npos == text.find(u":::")) {
        return false;
    }
    std::vector<TextEdit> edits;
    std::vector<std::string> boxes;
    for (std::size_t start = 0; start < text.size();) {
        std::size_t const found = text.find(u'\n', start);
        std::size_t const end = std::u16string::npos == found ? text.size() : found;
        std::string content = ToUtf8(std::u16string_view(text).substr(start, end - start));
        content.erase(0, content.find_first_not_of(' '));
        if (content.starts_with(":::") && !Builder().IsVerbatim(start)) {
            int const place = Builder().LineAt(start);
            content.erase(0, content.find_first_not_of(": "));
            content.resize(std::min(content.size(), content.find_last_not_of(": ") + 1));
            std::size_t length = 0;
            auto const list = ReadAttributes(std::string_view(content), length);
            std::string const name = !list ? content : list->m_Classes.empty() ? "" : list->m_Classes.front();
            static std::map<std::string, std::string, std::less<>> const later{
                {"toc", "Table of contents"}, {"index", "Index"}, {"endnotes", "Collated notes"}};
            if (auto const known = later.find(name); known != later.end()) {
                Warn("later-block", place,
                     Text("A \"%1\" block cannot be generated yet; a marked box stands in its place.", "Source", name));
                boxes.push_back(known->second);
            } else if (!content.empty()) {
                Warn("class-unknown", place,
                     Text("The block \"%1\" has no look of its own; its content is set as it stands.", "Source",
                          content));
            }
            edits.push_back({static_cast<std::uint32_t>(start),
                             static_cast<std::uint32_t>(std::min(end + 1, text.size()) - start),
                             {}});
        }
        start = end + 1;
    }
    Builder().Apply(edits);
    for (std::string const & box : boxes) {
        EmitMarkedBox(box, line);
    }
    if (!Builder().Empty()) {
        EmitText(m_BlockKind, 0, line);
    }
    return true;
}

void ChapterReader::ReadCodeBlock(cmark_node * node)
{
    int const line = cmark_node_get_start_line(node);
    RememberLines(node);
    char const * info = cmark_node_get_fence_info(node);
    std::string_view literal = cmark_node_get_literal(node);
    ReportDirectives(literal, line + 1);
    while (literal.ends_with('\n')) {
        literal.remove_suffix(1);
    }
    std::u16string text;
    std::size_t column = 0;
    for (char16_t const c : ToUtf16(literal)) {
        if (u'\n' == c) {
            text += u'\u2028';
            column = 0;
        } else if (u'\t' == c) {
            std::size_t const spaces = 4 - column % 4;
            text.append(spaces, u' ');
            column += spaces;
        } else if (u' ' <= c) {
            text += c;
            ++column;
        }
    }
    InlineBuilder builder;
    builder.SetMarks(Mark::Code);
    builder.Append(text, true);
    Block & block = Emit(BlockKind::Code, line);
    block.m_Text = builder.Finish();
    // Trimming must not touch a code block's first indentation.
    block.m_Text.m_Text = std::move(text);
    if (!block.m_Text.m_Text.empty()) {
        block.m_Text.m_Spans = {{0, static_cast<std::uint32_t>(block.m_Text.m_Text.size()), Mark::Code, -1}};
    }
    block.m_CodeLanguage = info ? ListTextOf(info) : std::string();
    PlacePendingAnchors(block);
}

void ChapterReader::VisitTablePart(cmark_node * node, bool isEnter)
{
    if (IsTableCell(node)) {
        if (isEnter) {
            Builder().StartLine(cmark_node_get_start_line(node));
        } else {
            FinishInline();
            m_Table->m_Rows.back().push_back({Builder().Finish()});
        }
    } else if (IsTableRow(node)) {
        if (isEnter) {
            m_Table->m_Rows.emplace_back();
            m_Table->m_HeaderRows += cmark_gfm_extensions_get_table_row_is_header(node) ? 1 : 0;
        }
    } else if (isEnter) {
        m_Table = std::make_unique<Table>();
        m_TableLine = cmark_node_get_start_line(node);
        std::uint8_t const * alignments = cmark_gfm_extensions_get_table_alignments(node);
        for (int column = 0; column < cmark_gfm_extensions_get_table_columns(node); ++column) {
            char const c = static_cast<char>(alignments[column]);
            m_Table->m_Columns.push_back('l' == c   ? CellAlignment::Left
                                         : 'c' == c ? CellAlignment::Centre
                                         : 'r' == c ? CellAlignment::Right
                                                    : CellAlignment::Natural);
        }
    } else {
        FinishTable();
    }
}

void ChapterReader::FinishTable()
{
    for (auto & row : m_Table->m_Rows) {
        row.resize(m_Table->m_Columns.size());
    }
    Block & block = Emit(BlockKind::Table, m_TableLine);
    block.m_Table = std::move(m_Table);
    PlacePendingAnchors(block);
}

void ChapterReader::VisitNoteDefinition(cmark_node * node, bool isEnter)
{
    // The parser moves used definitions to the end, in the order of their first marks.
    if (!isEnter) {
        m_OpenNotes.pop_back();
        return;
    }
    int const line = cmark_node_get_start_line(node);
    m_NoteLines.insert(line);
    auto const index = static_cast<std::size_t>(m_NotesSeen++);
    if (m_Chapter.m_Notes.size() <= index) {
        m_Chapter.m_Notes.resize(index + 1);
    }
    Note & note = m_Chapter.m_Notes[index];
    note.m_Line = line + m_LineOffset;
    note.m_Label = NoteLabel(WithoutLines(m_Source, line - 1));
    m_OpenNotes.push_back(index);
}

void ChapterReader::RememberLines(cmark_node * node)
{
    m_CodeLines.emplace_back(cmark_node_get_start_line(node), cmark_node_get_end_line(node));
}

void ChapterReader::ReportUnusedNotes()
{
    std::map<std::string, int, std::less<>> defined;
    std::sort(m_CodeLines.begin(), m_CodeLines.end());
    auto code = m_CodeLines.begin();
    std::string_view rest = m_Source;
    for (int line = 1; !rest.empty(); ++line) {
        std::string_view const label = NoteLabel(rest.substr(0, rest.find('\n')));
        rest = WithoutLines(rest, 1);
        if (label.empty()) {
            continue;
        }
        while (code != m_CodeLines.end() && code->second < line) {
            ++code;
        }
        if (code != m_CodeLines.end() && code->first <= line) {
            continue;
        }
        auto const [known, isNew] = defined.emplace(label, line + m_LineOffset);
        if (!isNew) {
            Warn("note-twice", line,
                 Text("The note [^%1] is defined again (first in line %2); the first one is set.", "Source", label,
                      known->second));
        } else if (!m_NoteLines.contains(line)) {
            Warn("note-unused", line, Text("The note [^%1] has no mark in the text and is left out.", "Source", label));
        }
    }
}

ChapterText ReadMarkdown(std::string_view text, ReadOptions const & options, MessageList & messages)
{
    return ChapterReader(text, options, messages).Read();
}

}
