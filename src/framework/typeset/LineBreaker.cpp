#include "framework/typeset/LineBreaker.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace Typeset
{

namespace
{

constexpr double linePenalty = 10;
constexpr double adjacentFitnessDemerits = 10000;
constexpr double doubleHyphenDemerits = 10000;
constexpr double finalHyphenDemerits = 5000;
constexpr double shortLastLineDemerits = 20000;
constexpr double worstBadness = 10000;
constexpr std::size_t mostActive = 400;
// Ragged lines may fall short of the margin by this share of their room.
constexpr double raggedShare = 0.12;

}

LineRooms::LineRooms(ParagraphSettings const & settings, bool rightToLeft) :
    m_Settings(settings), m_RightToLeft(rightToLeft)
{
    m_FirstAlike = static_cast<std::uint32_t>(settings.m_Rooms.size());
    if (settings.m_FirstLineIndent != 0) {
        m_FirstAlike = std::max(m_FirstAlike, 1U);
    }
    m_Narrowest = Get(m_FirstAlike).m_Width;
    for (std::uint32_t line = 0; line < m_FirstAlike; ++line) {
        m_Narrowest = std::min(m_Narrowest, Get(line).m_Width);
    }
    m_Narrowest = std::max(m_Narrowest, 0.0);
}

LineRoom LineRooms::Get(std::uint32_t line) const
{
    std::vector<LineRoom> const & rooms = m_Settings.m_Rooms;
    LineRoom room{0, m_Settings.m_Width};
    if (line < rooms.size()) {
        room = rooms[line];
    } else if (m_Settings.m_LastRoomRepeats && !rooms.empty()) {
        room = rooms.back();
    }
    double const startIndent = m_Settings.m_StartIndent + (line == 0 ? m_Settings.m_FirstLineIndent : 0);
    room.m_Left += m_RightToLeft ? m_Settings.m_EndIndent : startIndent;
    room.m_Width -= startIndent + m_Settings.m_EndIndent;
    return room;
}

TabTarget FindTab(ParagraphSettings const & settings, double position)
{
    for (TabStop const & stop : settings.m_Tabs) {
        if (stop.m_Position > position + 0.01) {
            return {stop.m_Position, stop.m_Alignment, stop.m_Leader};
        }
    }
    if (settings.m_DefaultTab <= 0 || !(std::abs(position) < 1e9)) {
        return {position, TabAlignment::Start, 0};
    }
    double const next = std::floor((position + 0.01) / settings.m_DefaultTab + 1) * settings.m_DefaultTab;
    return {next, TabAlignment::Start, 0};
}

double TabWidth(TabTarget const & target, double position, double following)
{
    double const gap = target.m_Position - position;
    switch (target.m_Alignment) {
    case TabAlignment::Start:
        break;
    case TabAlignment::Centre:
        return std::max(gap - following / 2, 0.0);
    case TabAlignment::End:
    case TabAlignment::Decimal:
        return std::max(gap - following, 0.0);
    }
    return std::max(gap, 0.0);
}

bool LineBreaker::BreakTotalFit(Pass const & pass, std::vector<std::uint32_t> & breaks)
{
    bool const justified = m_Settings.m_Alignment == Alignment::Justified;
    std::uint32_t const alike = m_Rooms.GetFirstAlike();
    double const commonWidth = m_Rooms.Get(alike).m_Width;
    std::size_t const hyphenLimit =
        m_Settings.m_HyphenLimit > 0 ? static_cast<std::size_t>(m_Settings.m_HyphenLimit) : 255;

    double const greatestRatio = std::cbrt(std::min(pass.m_Tolerance, 1e9) / 100);
    double const stretches = justified ? 1 : 0;
    auto const threshold = [&](BreakNode const & start, std::uint32_t line) {
        double const width = line >= alike ? commonWidth : m_Rooms.Get(line).m_Width;
        double const fixed = pass.m_Emergency + (justified ? 0 : width * raggedShare);
        return width + start.m_NextWidth + greatestRatio * (start.m_NextStretch * stretches - fixed);
    };

    m_Active.clear();
    m_Records.clear();
    m_Records.push_back({0, 0});
    m_Active.push_back({});
    m_Active.back().m_Threshold = threshold(m_Nodes.front(), 0);
    double leastThreshold = m_Active.back().m_Threshold;
    std::uint32_t const count = static_cast<std::uint32_t>(m_Nodes.size());
    for (std::uint32_t index = 1; index < count; ++index) {
        BreakNode const & node = m_Nodes[index];
        if ((node.m_Flags & BreakNode::LastResort) && !pass.m_LastResorts) {
            continue;
        }
        bool const forced = (node.m_Flags & BreakNode::Forced) != 0;
        bool const flagged = (node.m_Flags & BreakNode::Flagged) != 0;
        m_Candidates.clear();
        // A line that reaches less far than this is too loose for the tolerance.
        double const reach = node.m_EndWidth + greatestRatio * node.m_EndStretch * stretches;
        if (!forced && reach < leastThreshold) {
            continue;
        }
        std::size_t kept = 0;
        for (std::size_t i = 0; i < m_Active.size(); ++i) {
            Active const & active = m_Active[i];
            if (!forced && reach < active.m_Threshold) {
                if (kept != i) {
                    m_Active[kept] = active;
                }
                ++kept;
                continue;
            }
            BreakNode const & start = m_Nodes[active.m_Node];
            double const width = active.m_Line >= alike ? commonWidth : m_Rooms.Get(active.m_Line).m_Width;
            double const natural = node.m_EndWidth - start.m_NextWidth;
            double const missing = width - natural;
            double badness = 0;
            double ratio = 0;
            if (missing >= 0) {
                double stretch = pass.m_Emergency;
                stretch += justified ? node.m_EndStretch - start.m_NextStretch : width * raggedShare;
                if (!forced) { // The last line ends where it likes.
                    ratio = stretch > 0 ? missing / stretch : std::numeric_limits<double>::infinity();
                    badness = std::min(100 * ratio * ratio * ratio, worstBadness);
                }
            } else {
                double const shrink = justified ? node.m_EndShrink - start.m_NextShrink : 0;
                ratio = shrink > 0 ? missing / shrink : -std::numeric_limits<double>::infinity();
                badness = -100 * ratio * ratio * ratio;
            }
            bool const overfull = ratio < -1 && missing < -0.001;
            bool const stays = !overfull && !forced;
            if (stays) {
                if (kept != i) {
                    m_Active[kept] = active;
                }
                ++kept;
            }
            if (overfull || badness > pass.m_Tolerance) {
                continue;
            }
            if (flagged && active.m_HyphenRun >= hyphenLimit) {
                continue;
            }
            double const penalty = node.m_Penalty;
            double demerits = (linePenalty + badness) * (linePenalty + badness) + penalty * penalty;
            bool const startFlagged = (start.m_Flags & BreakNode::Flagged) != 0;
            if (flagged && startFlagged) {
                demerits += doubleHyphenDemerits;
            }
            if (forced && startFlagged) {
                demerits += finalHyphenDemerits;
            }
            if ((node.m_Flags & BreakNode::End) && active.m_Node != 0 && natural < m_Settings.m_MinimumLastLine) {
                demerits += shortLastLineDemerits;
            }
            std::uint8_t fitness = 1;
            if (ratio < -0.5) {
                fitness = 0;
            } else if (ratio > 1) {
                fitness = 3;
            } else if (ratio > 0.5) {
                fitness = 2;
            }
            if (std::abs(fitness - active.m_Fitness) > 1) {
                demerits += adjacentFitnessDemerits;
            }
            demerits += active.m_Demerits;
            // Lines past the last special room are all alike, so how many came before no longer matters.
            std::uint32_t const line = std::min(active.m_Line + 1, alike);
            Active * candidate = nullptr;
            for (Active & known : m_Candidates) {
                if (known.m_Fitness == fitness && known.m_Line == line) {
                    candidate = &known;
                    break;
                }
            }
            if (!candidate) {
                candidate = &m_Candidates.emplace_back();
            } else if (candidate->m_Demerits <= demerits) {
                continue;
            }
            candidate->m_Node = index;
            candidate->m_Line = line;
            candidate->m_Record = active.m_Record;
            candidate->m_Fitness = fitness;
            candidate->m_HyphenRun =
                flagged ? static_cast<std::uint8_t>(std::min(active.m_HyphenRun + 1, 255)) : std::uint8_t{0};
            candidate->m_Demerits = demerits;
        }
        m_Active.resize(kept);
        for (Active & candidate : m_Candidates) {
            m_Records.push_back({candidate.m_Node, candidate.m_Record});
            candidate.m_Record = static_cast<std::uint32_t>(m_Records.size() - 1);
            candidate.m_Threshold = threshold(node, candidate.m_Line);
            m_Active.push_back(candidate);
        }
        leastThreshold = std::numeric_limits<double>::infinity();
        for (Active const & active : m_Active) {
            leastThreshold = std::min(leastThreshold, active.m_Threshold);
        }
        if (m_Active.empty() || m_Active.size() > mostActive) {
            return false;
        }
    }

    Active const & best = *std::min_element(m_Active.begin(), m_Active.end(), [](Active const & a, Active const & b) {
        return a.m_Demerits < b.m_Demerits;
    });
    breaks.clear();
    for (std::uint32_t record = best.m_Record; record != 0; record = m_Records[record].m_Previous) {
        breaks.push_back(m_Records[record].m_Node);
    }
    std::reverse(breaks.begin(), breaks.end());
    return true;
}

void LineBreaker::BreakGreedy(double reserve, std::vector<std::uint32_t> & breaks)
{
    breaks.clear();
    bool const justified = m_Settings.m_Alignment == Alignment::Justified && m_Settings.m_Mode != BreakMode::Code;
    std::uint32_t const count = static_cast<std::uint32_t>(m_Nodes.size());
    std::uint32_t start = 0;
    std::size_t firstTab = 0;
    while (start + 1 < count) {
        BreakNode const & startNode = m_Nodes[start];
        std::uint32_t const line = static_cast<std::uint32_t>(breaks.size());
        LineRoom const room = m_Rooms.Get(line);
        double const edge = line == 0 ? m_Settings.m_StartIndent + m_Settings.m_FirstLineIndent : m_Settings.m_StartIndent;
        double tabs = 0; // Width of the tabs of the line so far.
        std::size_t tab = firstTab;
        std::uint32_t best = 0;
        std::uint32_t bestLastResort = 0;
        std::uint32_t end = start + 1;
        for (; end < count; ++end) {
            BreakNode const & node = m_Nodes[end];
            for (; tab < m_Tabs.size() && m_Tabs[tab].m_Piece < node.m_Piece; ++tab) {
                double const position = edge + m_Tabs[tab].m_Width - startNode.m_NextWidth + tabs;
                double const next = tab + 1 < m_Tabs.size() ? std::min(m_Tabs[tab + 1].m_Width, node.m_EndWidth)
                                                            : node.m_EndWidth;
                tabs += TabWidth(FindTab(m_Settings, position), position, std::max(next - m_Tabs[tab].m_Width, 0.0));
            }
            double const width = node.m_EndWidth - startNode.m_NextWidth + tabs;
            bool const forced = (node.m_Flags & BreakNode::Forced) != 0;
            double const shrink = justified ? node.m_EndShrink - startNode.m_NextShrink : 0;
            double const available = room.m_Width - (forced ? 0 : reserve) + 0.001;
            if (width - shrink <= available) {
                if (node.m_Flags & BreakNode::LastResort) {
                    bestLastResort = end;
                } else {
                    best = end;
                }
            } else if (width - shrink > room.m_Width + 0.001) {
                break;
            }
            if (forced) {
                break;
            }
        }
        std::uint32_t chosen = best ? best : bestLastResort;
        if (!chosen) {
            // Nothing fits: the least that there is, without a hyphen if possible.
            chosen = start + 1;
        }
        breaks.push_back(chosen);
        start = chosen;
        while (firstTab < m_Tabs.size() && m_Tabs[firstTab].m_Piece < m_Nodes[start].m_Piece) {
            ++firstTab;
        }
    }
}

}
