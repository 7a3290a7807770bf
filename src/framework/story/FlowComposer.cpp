#include "framework/story/FlowComposer.h"

#include "framework/story/FlowSetter.h"
#include "framework/story/LayoutBuilder.h"
#include "framework/story/PieceMaker.h"

#include <algorithm>
#include <cmath>

namespace Story
{

namespace
{

using namespace Flow;

// Sums of single-precision lengths are off by less than this.
constexpr float Tolerance = 0.02F;
constexpr double LargestLength = 100000;

float Sane(double length)
{
    return std::isfinite(length) ? static_cast<float>(std::clamp(length, 0.0, LargestLength)) : 0.0F;
}

/// Fills frames with pieces, one frame after the other.
class Flower
{
public:
    Flower(Story const & story, StyleSheet const & styles, FrameSource const & frames, ComposeOptions const & options,
           Typeset::LineArena & arena)
        : m_Story(story), m_Frames(frames), m_Options(options),
          m_Maker(story, styles, options, arena, m_Layout), m_Setter(m_Maker, arena, m_Layout)
    {
    }

    Kernel::Counted<Layout> Run();

private:
    /// What came of a frame: pieces from the head to `m_End` are in it, and perhaps a part of that one.
    struct Filling
    {
        std::size_t m_End = 0;
        bool m_HasPartOfNext = false;
    };

    bool HasMore() { return m_Head < m_Pieces.size() || m_Maker.MakeMore(m_Pieces); }
    void UseGeometry(FrameGeometry const & geometry);
    [[nodiscard]] Filling Fill();
    [[nodiscard]] bool FillWithPartOf(Piece const & piece, Stack const & stack, bool isAlone);
    void Commit(Filling const & filling);
    void SetTableRules(std::size_t index, std::size_t end, Placement const & place);
    [[nodiscard]] bool IsAborted() const { return m_Options.m_Abort && m_Options.m_Abort->load(); }
    [[nodiscard]] Decoration const * DecorationOf(Piece const & piece) { return m_Maker.GetSegment(piece).m_Decoration; }

    Story const & m_Story;
    FrameSource const & m_Frames;
    ComposeOptions const & m_Options;
    LayoutBuilder m_Layout;
    PieceMaker m_Maker;
    FlowSetter m_Setter;
    std::vector<Piece> m_Pieces;
    std::vector<Placement> m_Places;
    /// First piece that is not in a frame yet.
    std::size_t m_Head = 0;
    std::uint32_t m_TextEnd = 0;
    float m_Width = -1;
    float m_Height = 0;
    float m_GridStep = 0;
    float m_GridOffset = 0;
    /// The table that goes on at the head of the frame, if its header is set again there.
    Table const * m_RepeatedHeader = nullptr;
};

void Flower::UseGeometry(FrameGeometry const & geometry)
{
    float const width = Sane(geometry.m_Width);
    float const height = Sane(geometry.m_Height);
    m_GridStep = Sane(geometry.m_GridStep);
    m_GridOffset = Sane(geometry.m_GridOffset);
    if (width == m_Width && height == m_Height) {
        return;
    }
    m_Width = width;
    m_Height = height;
    m_Maker.SetFrame(width, height);
    // What was made for the frame before, and is not begun there, is made anew.
    for (std::size_t i = m_Head; i < m_Pieces.size(); ++i) {
        if (m_Maker.IsParagraphBegin(m_Pieces[i])) {
            m_Maker.RewindTo(m_Pieces[i]);
            m_Pieces.resize(i);
            break;
        }
    }
}

Kernel::Counted<Layout> Flower::Run()
{
    for (std::uint32_t number = 0; number == 0 || HasMore(); ++number) {
        if (IsAborted()) {
            return nullptr;
        }
        auto const geometry = number < m_Options.m_MaximumFrames ? m_Frames(number) : std::nullopt;
        if (!geometry) {
            if (HasMore()) {
                m_Layout.SetOverset(m_TextEnd);
            }
            return m_Layout.Finish();
        }
        UseGeometry(*geometry);
        m_Layout.BeginFrame(m_Width, m_Height, m_TextEnd);
        Filling const filling = Fill();
        Commit(filling);
        float const used = m_Setter.TakeUsedHeight();
        if (!HasMore()) {
            m_TextEnd = static_cast<std::uint32_t>(m_Story.GetLength());
            m_Setter.SetMarksAt(m_Maker.GetPendingMarks(), 0, used);
        }
        m_Layout.EndFrame(m_TextEnd, used);
    }
    return m_Layout.Finish();
}

Flower::Filling Flower::Fill()
{
    Stack stack;
    stack.m_GridStep = m_GridStep;
    stack.m_GridOffset = m_GridOffset;
    m_Places.clear();
    m_RepeatedHeader = nullptr;
    if (!HasMore()) {
        return {m_Head, false};
    }
    if (Piece const & first = m_Pieces[m_Head]; first.m_Kind == Piece::Kind::Row && !first.m_Row->m_IsHeader) {
        Table const & table = *first.m_Row->m_Table;
        if (!table.m_Header.empty() && table.m_HeaderHeight < m_Height / 2) {
            m_RepeatedHeader = &table;
            stack.m_Y = table.m_HeaderHeight;
            stack.m_IsEmpty = false;
        }
    }
    std::size_t lastBreak = m_Head;
    for (std::size_t i = m_Head;; ++i) {
        if (i == m_Pieces.size() && (IsAborted() || !m_Maker.MakeMore(m_Pieces))) {
            return {i, false};
        }
        Piece const & piece = m_Pieces[i];
        if (i > m_Head && piece.m_Break == Piece::Break::Forced) {
            return {i, false};
        }
        if (piece.m_Break == Piece::Break::Allowed) {
            lastBreak = i;
        }
        Decoration const * decoration = DecorationOf(piece);
        Placement place = stack.Place(piece, decoration);
        place.m_IsJoined = stack.IsJoined(piece, decoration);
        if (place.m_InkBottom > m_Height + Tolerance) {
            bool const isAlone = i == m_Head;
            if (piece.m_Kind == Piece::Kind::Row && FillWithPartOf(piece, stack, isAlone)) {
                m_Places.push_back(place);
                return {i, true};
            }
            if (!isAlone) {
                // Where the rules leave no break in the whole frame, they give way.
                return {lastBreak > m_Head ? lastBreak : i, false};
            }
            m_Layout.AddProblem(LayoutItem::Problem::Kind::Clipped, m_Maker.GetSegment(piece).m_MainBegin, String());
            m_Places.push_back(place);
            return {i + 1, false};
        }
        m_Places.push_back(place);
        stack.Advance(piece, decoration, place);
    }
}

bool Flower::FillWithPartOf(Piece const & piece, Stack const & stack, bool isAlone)
{
    Row & row = *piece.m_Row;
    float const headerHeight = row.m_Table->m_Header.empty() ? 0 : row.m_Table->m_HeaderHeight;
    float const wholeFrame = m_Height - (headerHeight < m_Height / 2 ? headerHeight : 0);
    if (piece.m_Above <= wholeFrame) {
        return false;
    }
    float const room = m_Height - stack.m_Y - stack.GapBefore(piece) - 2 * row.m_Table->m_PaddingY;
    bool hasPart = false;
    bool hasRest = false;
    for (Row::Cell & cell : row.m_Cells) {
        Stack inner;
        std::size_t end = cell.m_Next;
        for (; end < cell.m_Pieces.size(); ++end) {
            auto const * decoration = DecorationOf(cell.m_Pieces[end]);
            Placement const place = inner.Place(cell.m_Pieces[end], decoration);
            if (place.m_InkBottom > room) {
                break;
            }
            inner.Advance(cell.m_Pieces[end], decoration, place);
        }
        cell.m_End = end;
        hasPart = hasPart || end > cell.m_Next;
        hasRest = hasRest || end < cell.m_Pieces.size();
    }
    if (!hasPart && isAlone && hasRest) {
        // Not even a line fits: one goes in all the same, so that every frame gets on.
        for (Row::Cell & cell : row.m_Cells) {
            cell.m_End = std::min(cell.m_Next + 1, cell.m_Pieces.size());
        }
        hasPart = true;
        m_Layout.AddProblem(LayoutItem::Problem::Kind::Clipped, m_Maker.GetSegment(piece).m_MainBegin, String());
    }
    if (!hasPart) {
        for (Row::Cell & cell : row.m_Cells) {
            cell.m_End = cell.m_Pieces.size();
        }
    }
    return hasPart;
}

void Flower::Commit(Filling const & filling)
{
    if (m_RepeatedHeader) {
        m_Setter.SetHeaderAgain(*m_RepeatedHeader);
    }
    std::size_t const count = filling.m_End - m_Head;
    m_Setter.SetDecorations(std::span(m_Pieces).subspan(m_Head, count), std::span(m_Places).first(count), m_Height);
    for (std::size_t i = m_Head; i < filling.m_End; ++i) {
        Placement const & place = m_Places[i - m_Head];
        m_Setter.SetPiece(m_Pieces[i], place, 0);
        if (m_Pieces[i].m_Kind == Piece::Kind::Row) {
            SetTableRules(i, filling.m_End, place);
        }
        m_TextEnd = std::max(m_TextEnd, m_Pieces[i].m_MainEnd);
    }
    m_Head = filling.m_End;
    if (filling.m_HasPartOfNext) {
        Piece & piece = m_Pieces[m_Head];
        Placement place = m_Places[count];
        // The part that is set now, and what is left of the row.
        float const whole = piece.m_Above;
        place.m_InkBottom = std::min(place.m_InkBottom, m_Height);
        m_Setter.SetPiece(piece, place, 0);
        piece.m_IsFirst = false;
        bool isDone = true;
        for (Row::Cell & cell : piece.m_Row->m_Cells) {
            isDone = isDone && cell.m_Next >= cell.m_Pieces.size();
            cell.m_End = cell.m_Pieces.size();
        }
        piece.m_Above = RowHeight(*piece.m_Row, m_Maker.GetSegments());
        piece.m_SpaceBefore = 0;
        piece.m_Break = Piece::Break::Allowed;
        if (place.m_Top > 0 || !m_RepeatedHeader) {
            m_Setter.SetTableRule(*piece.m_Row->m_Table, std::min(place.m_Top + whole, m_Height), true);
        }
        if (isDone) {
            m_TextEnd = std::max(m_TextEnd, piece.m_MainEnd);
            ++m_Head;
        }
    }
}

void Flower::SetTableRules(std::size_t index, std::size_t end, Placement const & place)
{
    Row const & row = *m_Pieces[index].m_Row;
    Table const & table = *row.m_Table;
    bool const isFirstHere = index == m_Head || m_Pieces[index - 1].m_Kind != Piece::Kind::Row ||
                             m_Pieces[index - 1].m_Row->m_Table != &table;
    bool const isLastHere = index + 1 == end || row.m_IsLastOfTable;
    if (isFirstHere && !m_RepeatedHeader) {
        m_Setter.SetTableRule(table, place.m_Top, true);
    }
    if (isLastHere) {
        m_Setter.SetTableRule(table, place.m_Bottom, true);
    } else if (row.m_IsLastOfHeader) {
        m_Setter.SetTableRule(table, place.m_Bottom, false);
    }
}

void Collect(Story const & story, std::uint32_t mainOffset, bool isMain, std::vector<CollectedAnchor> & anchors)
{
    for (Story::Object const & object : story.GetObjects()) {
        std::uint32_t const offset = isMain ? object.m_Offset : mainOffset;
        if (object.m_Glyph->GetClassUID() == AnchorGlyph::c_classUid) {
            auto glyph = Kernel::CountedCast<AnchorGlyph const>(object.m_Glyph);
            auto data = glyph->GetAnchorData();
            anchors.push_back({std::move(glyph), std::move(data), offset});
        }
        for (std::size_t i = 0; i < object.m_Glyph->GetStoryCount(); ++i) {
            if (auto const nested = object.m_Glyph->GetStory(i)) {
                Collect(*nested, offset, false, anchors);
            }
        }
    }
}

}

struct FlowComposer::Work
{
    /// Kept between stories for its memory.
    Typeset::LineArena m_Arena;
};

FlowComposer::FlowComposer() : m_Work(std::make_unique<Work>()) {}

FlowComposer::~FlowComposer() = default;

Kernel::Counted<Layout> FlowComposer::Compose(Story const & story, StyleSheet const & styles,
                                              FrameSource const & frames, ComposeOptions const & options)
{
    m_Work->m_Arena.Clear();
    return Flower(story, styles, frames, options, m_Work->m_Arena).Run();
}

std::vector<CollectedAnchor> CollectAnchors(Story const & story)
{
    std::vector<CollectedAnchor> anchors;
    Collect(story, 0, true, anchors);
    return anchors;
}

}
