#pragma once

#include "framework/typeset/BreakNodes.h"
#include "framework/typeset/ParagraphInput.h"

#include <cstdint>
#include <vector>

namespace Typeset
{

/// Rooms of a paragraph's lines, indents taken off.
class LineRooms
{
public:
    LineRooms(ParagraphSettings const & settings, bool rightToLeft);

    [[nodiscard]] LineRoom Get(std::uint32_t line) const;
    /// From this line on, all are alike.
    [[nodiscard]] std::uint32_t GetFirstAlike() const noexcept { return m_FirstAlike; }
    /// The least width that any line has; never negative.
    [[nodiscard]] double GetNarrowest() const noexcept { return m_Narrowest; }

private:
    ParagraphSettings const & m_Settings;
    bool m_RightToLeft;
    std::uint32_t m_FirstAlike = 0;
    double m_Narrowest = 0;
};

/// Distance from the paragraph's edge to the stop that a tab at `position` leads to.
struct TabTarget
{
    double m_Position = 0;
    TabAlignment m_Alignment = TabAlignment::Start;
    char32_t m_Leader = 0;
};
[[nodiscard]] TabTarget FindTab(ParagraphSettings const & settings, double position);

/// Width of a tab at `position` whose following text, up to the next tab or the line's end, has the width `following`.
[[nodiscard]] double TabWidth(TabTarget const & target, double position, double following);

/// Chooses the nodes at which lines end. The result lists node indices, ascending, the last being the paragraph's end.
class LineBreaker
{
public:
    LineBreaker(std::vector<BreakNode> const & nodes, std::vector<TabMark> const & tabs, LineRooms const & rooms,
                ParagraphSettings const & settings) :
        m_Nodes(nodes),
        m_Tabs(tabs), m_Rooms(rooms), m_Settings(settings)
    {
    }

    /// What a pass of total-fit breaking puts up with.
    struct Pass
    {
        double m_Tolerance = 100; ///< Greatest badness of a line: 100 = stretched to its limit.
        double m_Emergency = 0;   ///< Stretch added to every line, in points.
        bool m_LastResorts = false;
    };

    /// Knuth and Plass, "Breaking Paragraphs into Lines", 1981: the breaks with the least sum of demerits. False if no
    /// breaks keep within the tolerance, or if there are more possibilities than can be weighed in good time.
    [[nodiscard]] bool BreakTotalFit(Pass const & pass, std::vector<std::uint32_t> & breaks);

    /// First fit. Always succeeds. `reserve` is kept free at the end of every line but the last of a forced stretch.
    void BreakGreedy(double reserve, std::vector<std::uint32_t> & breaks);

private:
    struct Active
    {
        std::uint32_t m_Node = 0;
        std::uint32_t m_Line = 0; ///< Number of lines before it.
        std::uint32_t m_Record = 0;
        std::uint8_t m_Fitness = 1; ///< 0 tight, 1 decent, 2 loose, 3 very loose.
        std::uint8_t m_HyphenRun = 0;
        double m_Demerits = 0;
        double m_Threshold = 0; ///< Lines from here that reach less far are too loose.
    };
    struct Record
    {
        std::uint32_t m_Node = 0;
        std::uint32_t m_Previous = 0;
    };

    std::vector<BreakNode> const & m_Nodes;
    std::vector<TabMark> const & m_Tabs;
    LineRooms const & m_Rooms;
    ParagraphSettings const & m_Settings;
    std::vector<Active> m_Active;
    std::vector<Active> m_Candidates;
    std::vector<Record> m_Records;
};

}
