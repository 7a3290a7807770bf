#include "framework/story/FlowPieces.h"

#include <algorithm>
#include <cmath>

namespace Story::Flow
{

namespace
{

// Sums of single-precision lengths are off by less than this.
constexpr float Tolerance = 0.02F;

/// Neighbours share one background or border: paragraphs of a quotation, with what lies between them, and paragraphs
/// on one background that touch.
bool Joins(Decoration const * before, Decoration const * decoration, float gap)
{
    return before && before == decoration && (!decoration->m_Background || gap <= Tolerance);
}

}

float Stack::GapBefore(Piece const & piece) const
{
    return m_IsEmpty ? 0.0F : std::max(m_SpaceAfter, piece.m_SpaceBefore);
}

Placement Stack::Place(Piece const & piece, Decoration const * decoration) const
{
    float const gap = GapBefore(piece);
    float y = m_Y + gap;
    if (!Joins(m_Decoration, decoration, gap)) {
        y += m_Decoration ? m_Decoration->VerticalPadding() : 0;
        y += decoration ? decoration->VerticalPadding() : 0;
    }
    Placement place;
    place.m_Top = y;
    if (piece.m_Kind == Piece::Kind::Line) {
        float baseline = y + (m_IsEmpty ? piece.m_HeadAbove : piece.m_Above);
        if (piece.m_OnGrid && m_GridStep > 0) {
            baseline = m_GridOffset + m_GridStep * std::ceil((baseline - Tolerance - m_GridOffset) / m_GridStep);
        }
        place.m_Baseline = baseline;
        place.m_Top = std::max(y, baseline - piece.m_Above);
        place.m_Bottom = baseline + piece.m_Below;
        place.m_InkBottom = baseline + piece.m_FootBelow;
    } else {
        place.m_Baseline = y + piece.m_Above;
        place.m_Bottom = y + piece.m_Above;
        place.m_InkBottom = place.m_Bottom;
    }
    if (decoration) {
        place.m_InkBottom += decoration->VerticalPadding();
    }
    return place;
}

bool Stack::IsJoined(Piece const & piece, Decoration const * decoration) const
{
    return !m_IsEmpty && Joins(m_Decoration, decoration, GapBefore(piece));
}

void Stack::Advance(Piece const & piece, Decoration const * decoration, Placement const & placement)
{
    m_Y = placement.m_Bottom;
    m_SpaceAfter = piece.m_SpaceAfter;
    m_IsEmpty = false;
    m_Decoration = decoration;
}

}
