#pragma once

#include "framework/typeset/BreakFinder.h"
#include "framework/typeset/Pieces.h"

#include <cstdint>
#include <vector>

namespace Typeset
{

/// A place where a line may end and the next begin, with sums over the paragraph up to there: the width of a line
/// between two nodes is b.m_EndWidth - a.m_NextWidth, and so for stretch and shrink (Knuth and Plass 1981).
struct BreakNode
{
    enum Flags : std::uint8_t
    {
        Forced = 1,
        Hyphen = 2,     ///< A hyphen is set at the line's end.
        Flagged = 4,    ///< The line ends with a hyphen, set or typed: two in a row are ugly.
        LastResort = 8, ///< Inside a word that fits on no line.
        End = 16        ///< Of the paragraph.
    };
    double m_EndWidth = 0;
    double m_EndStretch = 0;
    double m_EndShrink = 0;
    double m_NextWidth = 0;
    double m_NextStretch = 0;
    double m_NextShrink = 0;
    float m_Penalty = 0;
    std::uint32_t m_Position = 0; ///< In the working text: the next line's start.
    std::uint32_t m_Piece = 0;    ///< The piece that holds the next line's start.
    std::uint8_t m_Flags = 0;
};

/// Where a tab stands among the sums of the nodes.
struct TabMark
{
    std::uint32_t m_Piece = 0;
    double m_Width = 0; ///< Sum up to it; tabs themselves count nothing.
};

/// Makes the nodes of a paragraph from its pieces and break places.
class NodeMaker
{
public:
    NodeMaker(std::u16string_view text, std::vector<TextItem> const & items, std::vector<Piece> const & pieces,
              PieceMaker & maker, CharacterTable & characters, ParagraphSettings const & settings) :
        m_Text(text),
        m_Items(items), m_Pieces(pieces), m_Maker(maker), m_Characters(characters), m_Settings(settings)
    {
    }

    /// All nodes, the first being the paragraph's start and the last its end. `narrowest` is the least width of a
    /// line: in wider words, every cluster may end a line as a last resort.
    void Make(std::vector<BreakPlace> const & places, bool hyphenate, double narrowest, std::vector<BreakNode> & nodes,
              std::vector<TabMark> & tabs);

private:
    /// A place inside a piece of text.
    struct Inside
    {
        std::uint32_t m_Position;
        float m_Penalty;
        std::uint8_t m_Flags;
    };

    void AddText(std::uint32_t index, bool hyphenate, double narrowest, std::vector<BreakNode> & nodes);
    void AddSpace(Piece const & piece);
    void AddNode(std::uint32_t position, std::uint32_t piece, float penalty, std::uint8_t flags,
                 std::vector<BreakNode> & nodes);
    void FindHyphens(Piece const & piece, std::uint32_t index);
    void HyphenateStretch(Piece const & piece, std::uint32_t start, std::uint32_t end);
    [[nodiscard]] float PenaltyAt(std::uint32_t position, std::uint8_t & flags) const;
    [[nodiscard]] double Protrusion(std::uint32_t position, TextItem const & item, bool atEnd) const;

    std::u16string_view m_Text;
    std::vector<TextItem> const & m_Items;
    std::vector<Piece> const & m_Pieces;
    PieceMaker & m_Maker;
    CharacterTable & m_Characters;
    ParagraphSettings const & m_Settings;

    // Sums: up to here, and up to the last thing that is not a space.
    double m_Width = 0;
    double m_Stretch = 0;
    double m_Shrink = 0;
    double m_ContentWidth = 0;
    double m_ContentStretch = 0;
    double m_ContentShrink = 0;
    std::uint32_t m_ContentEnd = 0;  ///< Text offset after that last thing.
    std::uint32_t m_ContentItem = 0;
    std::vector<BreakPlace>::const_iterator m_Place;
    std::vector<BreakPlace>::const_iterator m_PlacesEnd;
    std::vector<Inside> m_Inside;
    std::vector<std::uint16_t> m_Hyphens;
};

/// Share of a character's width that may hang over the margin, optically: at the end or the start of a line.
[[nodiscard]] double ProtrusionShare(char16_t unit, bool atEnd);

}
