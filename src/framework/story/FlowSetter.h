#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/LayoutBuilder.h"
#include "framework/story/PieceMaker.h"

#include <set>

namespace Story::Flow
{

/// Turns placed pieces into the items and facts of a layout. Internal to the composer.
class FlowSetter
{
public:
    FlowSetter(PieceMaker & maker, Typeset::LineArena const & arena, LayoutBuilder & layout)
        : m_Maker(maker), m_Arena(arena), m_Layout(layout)
    {
    }

    /// Backgrounds and borders of pieces that stand one below the other in a frame of that height.
    void SetDecorations(std::span<Piece const> pieces, std::span<Placement const> places, float frameHeight);
    /// A piece whose column begins at `x`. Pieces in it are set too.
    void SetPiece(Piece const & piece, Placement const & place, float x);
    /// The header rows of a table, once more at the head of a frame.
    void SetHeaderAgain(Table const & table);
    /// The rules of a table's rows where they begin and end in this frame.
    void SetTableRule(Table const & table, float y, bool isHeavy);
    /// Marks behind which no text came.
    void SetMarksAt(std::vector<Mark> const & marks, float x, float y);

    /// Lowest edge of what was set since the last call.
    [[nodiscard]] float TakeUsedHeight() { return std::exchange(m_Used, 0.0F); }

private:
    struct LineContext;

    void SetLine(Piece const & piece, Placement const & place, float x);
    void SetMarker(Segment const & segment, float x, float baseline, float top, float bottom);
    void SetRun(Segment const & segment, Typeset::GlyphRun const & run, LineContext & context);
    void SetLinkPart(LineContext & context, std::uint32_t hyperlink, std::uint32_t note, float left, float right);
    void FlushLink(LineContext & context);
    void SetPicture(Piece const & piece, Placement const & place, float x);
    void SetPictureItem(PictureGlyph const & picture, std::uint32_t storyOffset, Kernel::RectT<float> const & box);
    void SetRow(Row & row, float y, float x);
    void SetFacts(Segment & segment, std::uint32_t textEnd, float x, float y);
    void SetSegmentFacts(Segment const & segment, float x, float y);
    [[nodiscard]] LayoutItem::Place PlaceAt(float x, float y) const;

    PieceMaker & m_Maker;
    Typeset::LineArena const & m_Arena;
    LayoutBuilder & m_Layout;
    float m_Used = 0;
    /// Problems of fonts are told once.
    std::set<std::pair<LayoutItem::Problem::Kind, String>> m_Told;
    /// What is set was set before: it has no facts.
    bool m_IsRepeat = false;
};

}
