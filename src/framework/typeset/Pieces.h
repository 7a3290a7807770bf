#pragma once

#include "framework/typeset/Itemiser.h"
#include "framework/typeset/Shape.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace Typeset
{

/// The unit of line building: a word, a group of spaces, a tab, a box, a line separator. Widths in points.
struct Piece
{
    enum class Kind : std::uint8_t
    {
        Text,
        Space,
        Tab,
        Box,
        LineEnd
    };
    std::uint32_t m_Start = 0; ///< In the working text.
    std::uint32_t m_End = 0;
    std::uint32_t m_Item = 0;
    std::uint32_t m_ShapeStart = 0; ///< Where in the text the shape's first code unit stands.
    Shape * m_Shape = nullptr;      ///< Of the piece, or of more than the piece. Null for spaces set by count.
    std::uint32_t m_FirstGlyph = 0;
    std::uint32_t m_LastGlyph = 0; ///< After the last.
    std::uint32_t m_Clusters = 0;
    Kind m_Kind = Kind::Text;
    bool m_IsWhole = true; ///< The shape is of this piece alone.
    double m_Width = 0;
};

/// Shapes the items and cuts them into pieces.
class PieceMaker
{
public:
    PieceMaker(std::u16string_view text, std::vector<TextItem> const & items, BumpArena & scratch) :
        m_Text(text), m_Items(items), m_Scratch(scratch)
    {
    }

    void Make(std::span<InlineObject const> objects, std::vector<Piece> & pieces);

    /// The part [from, to) of a piece of text as a piece by itself, as it looks at the edge of a line; with `hyphen`,
    /// a hyphen is set after it (its cluster is the part's length).
    [[nodiscard]] Piece MakePart(Piece const & piece, std::uint32_t from, std::uint32_t to, bool hyphen);

    /// A cached word's shape without spaces beside it.
    [[nodiscard]] Shape * MakeBare(Piece const & piece);

private:
    void MakeWords(std::uint32_t index, std::vector<Piece> & pieces);
    void MakeFromRuns(std::uint32_t index, std::vector<Piece> & pieces);
    void CutShape(std::uint32_t index, Shape * shape, std::size_t start, std::size_t end, std::vector<Piece> & pieces);

    std::u16string_view m_Text;
    std::vector<TextItem> const & m_Items;
    BumpArena & m_Scratch;
    std::u16string m_Hyphenated;
    std::vector<std::uint32_t> m_Keys; ///< Of the pieces of the item at work.
};

/// Goes through the clusters of a piece in the order of the text.
class ClusterWalk
{
public:
    ClusterWalk(Piece const & piece, bool rightToLeft) :
        m_Glyphs(piece.m_Shape->m_Glyphs), m_Base(piece.m_ShapeStart), m_First(piece.m_FirstGlyph),
        m_Last(piece.m_LastGlyph), m_RightToLeft(rightToLeft)
    {
    }

    [[nodiscard]] bool IsAtEnd() const noexcept { return m_First >= m_Last; }
    /// Text offset of the cluster to come.
    [[nodiscard]] std::uint32_t GetPosition() const noexcept { return m_Base + Next().m_Cluster; }
    [[nodiscard]] bool IsSafe() const noexcept { return !Next().m_Unsafe; }
    [[nodiscard]] std::int64_t GetAdvance() const noexcept { return m_Advance; }
    [[nodiscard]] std::uint32_t GetClusters() const noexcept { return m_Clusters; }
    [[nodiscard]] std::uint32_t GetFirst() const noexcept { return m_First; }
    [[nodiscard]] std::uint32_t GetLast() const noexcept { return m_Last; }

    /// Takes the glyphs of one cluster.
    void Step()
    {
        std::uint32_t const cluster = Next().m_Cluster;
        while (!IsAtEnd() && Next().m_Cluster == cluster) {
            m_Advance += Next().m_Advance;
            if (m_RightToLeft) {
                --m_Last;
            } else {
                ++m_First;
            }
        }
        ++m_Clusters;
    }
    /// Goes to the first cluster at or after the position without counting what is passed over.
    void Seek(std::uint32_t position)
    {
        // Clusters ascend from left to right, or descend in right-to-left text.
        std::uint32_t low = m_First;
        std::uint32_t high = m_Last;
        while (low < high) {
            std::uint32_t const middle = low + (high - low) / 2;
            if ((m_Base + m_Glyphs[middle].m_Cluster < position) != m_RightToLeft) {
                low = middle + 1;
            } else {
                high = middle;
            }
        }
        (m_RightToLeft ? m_Last : m_First) = low;
    }
    /// Takes all clusters that start before the position.
    void StepTo(std::uint32_t position)
    {
        while (!IsAtEnd() && GetPosition() < position) {
            Step();
        }
    }

private:
    [[nodiscard]] ShapeGlyph const & Next() const noexcept { return m_Glyphs[m_RightToLeft ? m_Last - 1 : m_First]; }

    ShapeGlyph const * m_Glyphs;
    std::uint32_t m_Base;
    std::uint32_t m_First;
    std::uint32_t m_Last;
    std::uint32_t m_Clusters = 0;
    std::int64_t m_Advance = 0;
    bool m_RightToLeft;
};

[[nodiscard]] inline bool IsWordSpace(char16_t unit) { return unit == u' ' || unit == u'\u00A0'; }

}
