#include "framework/story/PieceMaker.h"

#include <algorithm>
#include <numeric>
#include <unicode/ubidi.h>

namespace Story::Flow
{

namespace
{

constexpr double UnlimitedWidth = 100000;
// Padding of cells and least size of text, in ems and as a part.
constexpr double PaddingXPart = 0.4;
constexpr double PaddingYPart = 0.18;
constexpr float SmallestScale = 0.6F;

float Sum(std::vector<float> const & values)
{
    return std::accumulate(values.begin(), values.end(), 0.0F);
}

/// Brings the wanted widths down to `available` in all: narrow columns keep what they want, and the wide ones share
/// the rest equally, none below its least. If not even the least widths fit, the same goes for these: a column of figures
/// keeps what it needs, and the widest words are cut.
void ShareOut(std::vector<float> & wanted, std::vector<float> least, float available)
{
    if (Sum(wanted) <= available) {
        return;
    }
    if (Sum(least) >= available) {
        wanted = std::move(least);
        least.assign(wanted.size(), 0.0F);
    }
    std::vector<bool> isSettled(wanted.size(), false);
    std::size_t open = wanted.size();
    float rest = available;
    // Columns that need more than an equal share come first: they make the others' share smaller.
    for (bool const settlesNarrow : {false, true}) {
        for (bool goesOn = true; goesOn && open > 0;) {
            goesOn = false;
            float const share = rest / static_cast<float>(open);
            for (std::size_t i = 0; i < wanted.size(); ++i) {
                bool const settles = settlesNarrow ? wanted[i] <= share : least[i] > share;
                if (!isSettled[i] && settles) {
                    wanted[i] = settlesNarrow ? wanted[i] : least[i];
                    rest -= wanted[i];
                    isSettled[i] = true;
                    --open;
                    goesOn = true;
                }
            }
        }
    }
    for (std::size_t i = 0; i < wanted.size(); ++i) {
        if (!isSettled[i]) {
            wanted[i] = rest / static_cast<float>(open);
        }
    }
}

}

namespace
{

/// A table is read from the side from which its first words are.
bool IsReadFromTheRight(TableGlyph const & table)
{
    for (std::uint32_t column = 0; column < table.GetColumnCount(); ++column) {
        if (auto const & story = table.GetCell(0, column)) {
            std::u16string_view const text = story->GetText();
            UBiDiDirection const direction = ubidi_getBaseDirection(text.data(), static_cast<int32_t>(text.size()));
            if (UBIDI_NEUTRAL != direction) {
                return UBIDI_RTL == direction;
            }
        }
    }
    return false;
}

/// Moves a table that begins at the left of the room that it has to its place there.
void PlaceColumns(Table & table, float available, bool isCentred, bool isFromTheRight)
{
    float const spare = std::max(available - (table.m_Right - table.m_Left), 0.0F);
    float const shift = isCentred ? spare / 2 : isFromTheRight ? spare : 0;
    for (Table::Column & column : table.m_Columns) {
        if (isFromTheRight) {
            column.m_Left = table.m_Left + table.m_Right - column.m_Left - column.m_Width;
        }
        column.m_Left += shift;
    }
    table.m_Left += shift;
    table.m_Right += shift;
}

}

float RowHeight(Row const & row, FlowSegments const & segments)
{
    float height = 0;
    for (Row::Cell const & cell : row.m_Cells) {
        Stack stack;
        for (std::size_t i = cell.m_Next; i < cell.m_Pieces.size(); ++i) {
            Piece const & piece = cell.m_Pieces[i];
            auto const * decoration = segments[piece.m_Segment].m_Decoration;
            stack.Advance(piece, decoration, stack.Place(piece, decoration));
        }
        height = std::max(height, stack.m_Y);
    }
    return height + 2 * row.m_Table->m_PaddingY;
}

float PieceMaker::MeasureStory(Story const & story, Context const & context, double width)
{
    float widest = 0;
    std::size_t const styles = m_StyleRefs.size();
    std::size_t const objects = m_Objects.size();
    for (std::size_t i = 0; i < story.GetParagraphs().size(); ++i) {
        auto const & paragraph = story.GetParagraphs()[i];
        Segment segment;
        segment.m_Story = &story;
        segment.m_Begin = static_cast<std::uint32_t>(story.GetParagraphBegin(i));
        segment.m_End = paragraph.m_End;
        if (segment.m_End > segment.m_Begin && story.GetText()[segment.m_End - 1] == ParagraphEnd) {
            --segment.m_End;
        }
        auto const & style = m_Styles.GetParagraph(paragraph.m_Atts.Get(), context.m_FallbackStyle);
        Edges const edges = GetEdges(story, i, style, context);
        Typeset::ParagraphSettings settings;
        settings.m_Width = width;
        settings.m_Alignment = Typeset::Alignment::Left;
        settings.m_Mode = Typeset::BreakMode::Greedy;
        settings.m_Hyphenate = false;
        m_Scratch.Clear();
        BreakLines(segment, style, settings, context, m_Scratch);
        for (Typeset::Line const & line : m_Scratch.m_Lines) {
            widest = std::max(widest, line.m_NaturalWidth + edges.m_Left + edges.m_Right + std::max(edges.m_First, 0.0F));
        }
        m_StyleRefs.resize(styles);
        m_Objects.resize(objects);
    }
    return widest;
}

std::vector<float> PieceMaker::MeasureColumns(Table const & table, TableGlyph const & source, Context const & cell,
                                              double width)
{
    constexpr float leastWidth = 6;
    std::vector<float> widths(source.GetColumnCount(), leastWidth);
    for (std::uint32_t row = 0; row < source.GetRowCount(); ++row) {
        for (std::uint32_t column = 0; column < source.GetColumnCount(); ++column) {
            if (auto const & story = source.GetCell(row, column)) {
                // A hair more than measured, so that what fits exactly is not broken by rounding.
                constexpr float spare = 0.05F;
                widths[column] =
                    std::max(widths[column], MeasureStory(*story, cell, width) + 2 * table.m_PaddingX + spare);
            }
        }
    }
    return widths;
}

void PieceMaker::FitColumns(Table & table, TableGlyph const & source, Context const & cell, float available)
{
    std::vector<float> widths = MeasureColumns(table, source, cell, UnlimitedWidth);
    if (Sum(widths) > available) {
        std::vector<float> least = MeasureColumns(table, source, cell, 0);
        if (Sum(least) > available) {
            float const scale = std::max(SmallestScale, available / Sum(least));
            m_Styles.SetScale(m_Styles.GetScale() * scale);
            widths = MeasureColumns(table, source, cell, UnlimitedWidth);
            least = MeasureColumns(table, source, cell, 0);
        }
        ShareOut(widths, std::move(least), available);
    }
    float left = table.m_Left;
    for (float const width : widths) {
        table.m_Columns.push_back({left, width});
        left += width;
    }
    table.m_Right = left;
}

void PieceMaker::MakeTable(Segment segment, TableGlyph const & source, ParagraphStyle const & style,
                           Context const & context, std::vector<Piece> & pieces)
{
    if (source.GetRowCount() == 0 || source.GetColumnCount() == 0) {
        m_PendingMarks = std::move(segment.m_Marks);
        return;
    }
    Edges const edges =
        GetEdges(*segment.m_Story, segment.m_Story->GetParagraphIndex(segment.m_Begin), style, context);
    float const available = std::max(context.m_Width - edges.m_Left - edges.m_Right, 1.0F);
    double const outerScale = m_Styles.GetScale();

    Table & table = m_Tables.emplace_back();
    table.m_Left = edges.m_Left;
    table.m_PaddingX = static_cast<float>(style.m_Glyph.m_Size * PaddingXPart);
    table.m_PaddingY = static_cast<float>(style.m_Glyph.m_Size * PaddingYPart);
    table.m_RuleColour = m_Styles.GetRun(style, nullptr, RunPurpose::Marker).m_Colour;
    Context cell;
    cell.m_Height = context.m_Height;
    cell.m_IsCell = true;
    cell.m_MainOffset = segment.m_MainBegin;
    cell.m_FallbackStyle = StyleSheet::TableTextStyle;
    cell.m_Role = LayoutItem::Role::TableCell;
    FitColumns(table, source, cell, available);
    PlaceColumns(table, available, style.m_Format.m_Alignment == ParagraphAtt::Centre, IsReadFromTheRight(source));

    std::uint32_t const begin = segment.m_MainBegin;
    std::uint32_t const end = begin + (segment.m_IsMain ? 1 : 0);
    std::uint32_t const kept = KeepSegment(std::move(segment));
    for (std::uint32_t r = 0; r < source.GetRowCount(); ++r) {
        Row & row = m_Rows.emplace_back();
        row.m_Table = &table;
        row.m_IsHeader = r < source.GetHeaderRowCount();
        row.m_IsLastOfHeader = r + 1 == source.GetHeaderRowCount();
        row.m_IsLastOfTable = r + 1 == source.GetRowCount();
        row.m_Cells.resize(source.GetColumnCount());
        for (std::uint32_t c = 0; c < source.GetColumnCount(); ++c) {
            auto const & story = source.GetCell(r, c);
            if (!story) {
                continue;
            }
            cell.m_Width = std::max(table.m_Columns[c].m_Width - 2 * table.m_PaddingX, 1.0F);
            cell.m_Alignment = source.GetAlignment(c);
            for (std::size_t i = 0; i < story->GetParagraphs().size(); ++i) {
                MakeParagraph(*story, i, cell, row.m_Cells[c].m_Pieces);
            }
        }
        Piece piece;
        piece.m_Kind = Piece::Kind::Row;
        piece.m_IsFirst = r == 0;
        piece.m_IsLast = row.m_IsLastOfTable;
        piece.m_Segment = kept;
        piece.m_Row = &row;
        row.m_Height = RowHeight(row, m_Segments);
        piece.m_Above = row.m_Height;
        piece.m_MainEnd = row.m_IsLastOfTable ? end : begin;
        // The header stands with the first row below it.
        bool const followsHeader = r > 0 && r <= source.GetHeaderRowCount();
        piece.m_Break = followsHeader ? Piece::Break::Forbidden : Piece::Break::Allowed;
        if (row.m_IsHeader) {
            table.m_Header.push_back(&row);
            table.m_HeaderHeight += piece.m_Above;
        }
        pieces.push_back(piece);
    }
    m_Styles.SetScale(outerScale);
}

}
