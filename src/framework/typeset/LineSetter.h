#pragma once

#include "framework/typeset/LineArena.h"
#include "framework/typeset/LineBreaker.h"
#include "framework/typeset/Pieces.h"
#include "framework/typeset/WorkingText.h"

#include <cstdint>
#include <vector>

namespace Typeset
{

/// Sets the lines that were chosen: exact shapes at the edges, justification, alignment, visual order.
class LineSetter
{
public:
    LineSetter(ParagraphInput const & input, ParagraphSettings const & settings, WorkingText const & work,
               std::vector<ResolvedStyle *> const & styles, std::vector<TextItem> const & items,
               std::vector<Piece> const & pieces, std::vector<BreakNode> const & nodes, LineRooms const & rooms,
               PieceMaker & maker, std::uint8_t baseLevel, LineArena & arena);

    /// Appends the line between two nodes.
    void Set(std::uint32_t from, std::uint32_t to);

    /// Room that the sign at the end of wrapped code takes, in points.
    [[nodiscard]] double GetSignWidth() const noexcept { return m_Sign.m_Width; }

private:
    /// A piece as it lies on the line.
    struct Placed
    {
        Piece m_Piece;
        double m_Width = 0;      ///< As set.
        double m_ClusterGap = 0; ///< Added to the advances of the first m_Gaps clusters.
        std::uint32_t m_Gaps = 0;
        char32_t m_Leader = 0;
    };

    void Collect(BreakNode const & from, BreakNode const & to);
    void PrepareSign();
    void SetTabs(double edge);
    void Justify(double missing, Line & line);
    void Order();
    void Emit(double x);
    void EmitText(Placed const & placed, GlyphRun & run);
    void EmitSpaces(Placed const & placed, GlyphRun & run);
    void EmitLeader(Placed const & placed, GlyphRun & run);
    void AddHeights(Line & line) const;
    [[nodiscard]] double Protrusion(Placed const & placed, bool atEnd) const;
    [[nodiscard]] std::uint16_t FaceIndex(Kernel::Counted<FontFace const> const & face);
    [[nodiscard]] TextItem const & ItemOf(Placed const & placed) const { return m_Items[placed.m_Piece.m_Item]; }

    ParagraphInput const & m_Input;
    ParagraphSettings const & m_Settings;
    WorkingText const & m_Work;
    std::u16string_view m_Text;
    std::vector<ResolvedStyle *> const & m_Styles;
    std::vector<TextItem> const & m_Items;
    std::vector<Piece> const & m_Pieces;
    std::vector<BreakNode> const & m_Nodes;
    LineRooms const & m_Rooms;
    PieceMaker & m_Maker;
    LineArena & m_Arena;
    std::uint8_t m_BaseLevel;
    std::uint32_t m_LineNumber = 0;

    std::vector<Placed> m_Placed; ///< In the order of the text, then visual.
    struct
    {
        Kernel::Counted<FontFace const> m_Face;
        std::uint32_t m_Glyph = 0;
        double m_Width = 0;
        double m_Size = 0;
    } m_Sign;
};

}
