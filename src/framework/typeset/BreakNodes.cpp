#include "framework/typeset/BreakNodes.h"

#include "framework/typeset/ParagraphInput.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace Typeset
{

namespace
{

constexpr float lastResortPenalty = 5000;
constexpr float dashBeforePenalty = 500;
constexpr float dashAfterSpacePenalty = 60;
constexpr std::size_t longestExactWord = 64;
// Flexibility of a gap between two ideographs, in ems.
constexpr double ideographicStretch = 0.12;
constexpr double ideographicShrink = 0.03;

bool IsHyphen(char16_t unit) { return unit == u'-' || unit == u'\u2010' || unit == u'\u2013'; }
bool IsDash(char16_t unit) { return unit == u'\u2014' || unit == u'\u2E3A' || unit == u'\u2E3B'; }

struct Hanging
{
    float m_Start = 0;
    float m_End = 0;
};

constexpr std::array<Hanging, 128> asciiHanging = [] {
    std::array<Hanging, 128> table{};
    table['-'] = {0, 0.55F};
    table['.'] = table[','] = {0, 0.7F};
    table[';'] = table[':'] = {0, 0.4F};
    table['!'] = table['?'] = {0, 0.15F};
    table['\''] = {0.6F, 0.6F};
    table['"'] = {0.5F, 0.5F};
    table['('] = {0.1F, 0};
    table[')'] = {0, 0.1F};
    table['*'] = {0.3F, 0.3F};
    for (char const letter : {'A', 'T', 'V', 'W', 'Y'}) {
        table[static_cast<std::size_t>(letter)] = {0.05F, 0.05F};
    }
    return table;
}();

constexpr Hanging HangingOf(char16_t unit)
{
    if (unit < 0x80) {
        return asciiHanging[unit];
    }
    switch (unit) {
    case u'\u2018':
    case u'\u2019':
    case u'\u201A':
        return {0.6F, 0.6F};
    case u'\u201C':
    case u'\u201D':
    case u'\u201E':
        return {0.5F, 0.5F};
    case u'\u00AB':
    case u'\u00BB':
    case u'\u2039':
    case u'\u203A':
        return {0.3F, 0.3F};
    case u'\u2010':
        return {0, 0.55F};
    case u'\u2013':
        return {0.2F, 0.3F};
    case u'\u2014':
        return {0.1F, 0.2F};
    default:
        return {};
    }
}

}

double ProtrusionShare(char16_t unit, bool atEnd)
{
    Hanging const found = HangingOf(unit);
    return atEnd ? found.m_End : found.m_Start;
}

double NodeMaker::Protrusion(std::uint32_t position, TextItem const & item, bool atEnd) const
{
    if (m_Settings.m_Protrusion <= 0 || position >= m_Text.size() || !item.m_Context || item.m_Level != 0) {
        return 0;
    }
    double const share = ProtrusionShare(m_Text[position], atEnd);
    if (share == 0) {
        return 0;
    }
    FontFace const & face = item.m_Context->GetFace();
    return share * m_Settings.m_Protrusion * face.GlyphAdvance(face.GetGlyph(m_Text[position])) * item.m_Scale;
}

float NodeMaker::PenaltyAt(std::uint32_t position, std::uint8_t & flags) const
{
    char16_t const before = m_Text[position - 1];
    char16_t const after = m_Text[position];
    if (IsHyphen(before)) {
        flags |= BreakNode::Flagged;
        return static_cast<float>(m_Settings.m_HyphenPenalty);
    }
    if (IsDash(after)) {
        return IsWordSpace(before) ? dashAfterSpacePenalty : dashBeforePenalty;
    }
    return before == u'/' ? 20.0F : 0.0F;
}

void NodeMaker::AddNode(std::uint32_t position, std::uint32_t piece, float penalty, std::uint8_t flags,
                        std::vector<BreakNode> & nodes)
{
    BreakNode & node = nodes.emplace_back();
    node.m_EndWidth = m_ContentWidth;
    node.m_EndStretch = m_ContentStretch;
    node.m_EndShrink = m_ContentShrink;
    node.m_NextWidth = m_Width;
    node.m_NextStretch = m_Stretch;
    node.m_NextShrink = m_Shrink;
    node.m_Position = position;
    node.m_Piece = piece;
    node.m_Penalty = penalty;
    node.m_Flags = flags;
    if (m_Settings.m_Protrusion > 0) {
        if (m_ContentEnd > 0) {
            node.m_EndWidth -= Protrusion(m_ContentEnd - 1, m_Items[m_ContentItem], true);
        }
        if (piece < m_Pieces.size()) {
            node.m_NextWidth += Protrusion(position, m_Items[m_Pieces[piece].m_Item], false);
        }
    }
}

void NodeMaker::Make(std::vector<BreakPlace> const & places, bool hyphenate, double narrowest,
                     std::vector<BreakNode> & nodes, std::vector<TabMark> & tabs)
{
    nodes.clear();
    tabs.clear();
    m_Width = m_Stretch = m_Shrink = m_ContentWidth = m_ContentStretch = m_ContentShrink = 0;
    m_ContentEnd = 0;
    m_ContentItem = 0;
    m_Place = places.begin();
    m_PlacesEnd = places.end();
    AddNode(0, 0, 0, BreakNode::Forced, nodes);
    for (std::uint32_t index = 0; index < m_Pieces.size(); ++index) {
        Piece const & piece = m_Pieces[index];
        while (m_Place != m_PlacesEnd && m_Place->m_Position <= piece.m_Start) {
            if (m_Place->m_Position == piece.m_Start && piece.m_Start > 0) {
                std::uint8_t flags = 0;
                float penalty = 0;
                switch (m_Place->m_Kind) {
                case BreakPlace::Kind::Mandatory:
                    flags = BreakNode::Forced;
                    break;
                case BreakPlace::Kind::SoftHyphen:
                    flags = BreakNode::Flagged;
                    penalty = static_cast<float>(m_Settings.m_HyphenPenalty);
                    break;
                case BreakPlace::Kind::Allowed:
                    penalty = PenaltyAt(piece.m_Start, flags);
                    break;
                }
                AddNode(piece.m_Start, index, penalty, flags, nodes);
            }
            ++m_Place;
        }
        switch (piece.m_Kind) {
        case Piece::Kind::Text:
            AddText(index, hyphenate, narrowest, nodes);
            break;
        case Piece::Kind::Space:
            AddSpace(piece);
            continue;
        case Piece::Kind::Tab:
            tabs.push_back({index, m_Width});
            break;
        case Piece::Kind::Box:
            m_Width += piece.m_Width;
            break;
        case Piece::Kind::LineEnd:
            continue;
        }
        m_ContentWidth = m_Width;
        m_ContentStretch = m_Stretch;
        m_ContentShrink = m_Shrink;
        m_ContentEnd = piece.m_End;
        m_ContentItem = piece.m_Item;
    }
    AddNode(static_cast<std::uint32_t>(m_Text.size()), static_cast<std::uint32_t>(m_Pieces.size()), 0,
            BreakNode::Forced | BreakNode::End, nodes);
}

void NodeMaker::AddSpace(Piece const & piece)
{
    m_Width += piece.m_Width;
    m_Stretch += piece.m_Width * (m_Settings.m_SpaceMaximum - 1);
    m_Shrink += piece.m_Width * (1 - m_Settings.m_SpaceMinimum);
}

void NodeMaker::AddText(std::uint32_t index, bool hyphenate, double narrowest, std::vector<BreakNode> & nodes)
{
    Piece const & piece = m_Pieces[index];
    TextItem const & item = m_Items[piece.m_Item];
    if (!piece.m_Shape) {
        return;
    }
    m_Inside.clear();
    bool hasSoftHyphen = false;
    bool hasTypedHyphen = false;
    while (m_Place != m_PlacesEnd && m_Place->m_Position < piece.m_End) {
        std::uint8_t flags = 0;
        float penalty = 0;
        if (m_Place->m_Kind == BreakPlace::Kind::SoftHyphen) {
            hasSoftHyphen = true;
            flags = BreakNode::Hyphen | BreakNode::Flagged;
            penalty = static_cast<float>(m_Settings.m_HyphenPenalty);
        } else {
            penalty = PenaltyAt(m_Place->m_Position, flags);
            hasTypedHyphen |= (flags & BreakNode::Flagged) != 0;
        }
        m_Inside.push_back({m_Place->m_Position, penalty, flags});
        ++m_Place;
    }
    if (hyphenate && !hasSoftHyphen && !hasTypedHyphen && item.m_Resolved->GetHyphenator() && !item.m_Ideographic) {
        FindHyphens(piece, index);
    }
    bool const breaksAnywhere = piece.m_Width > narrowest;
    double const startWidth = m_Width;
    double const gapStretch = item.m_Ideographic ? item.m_Size * ideographicStretch : 0;
    double const gapShrink = item.m_Ideographic ? item.m_Size * ideographicShrink : 0;
    if (m_Inside.empty() && !breaksAnywhere) {
        m_Width += piece.m_Width;
        m_Stretch += piece.m_Clusters * gapStretch;
        m_Shrink += piece.m_Clusters * gapShrink;
        return;
    }

    std::sort(m_Inside.begin(), m_Inside.end(),
              [](Inside const & a, Inside const & b) { return a.m_Position < b.m_Position; });
    double const startStretch = m_Stretch;
    double const startShrink = m_Shrink;
    ClusterWalk walk(piece, item.m_Context->IsRightToLeft());
    auto inside = m_Inside.begin();
    while (!walk.IsAtEnd() || inside != m_Inside.end()) {
        // The next place: of those that are known, or, in a word too long for the line, the next cluster.
        std::uint32_t const cluster = walk.IsAtEnd() ? piece.m_End : walk.GetPosition();
        Inside place{cluster, lastResortPenalty, BreakNode::LastResort};
        if (inside != m_Inside.end() && (inside->m_Position <= cluster || !breaksAnywhere)) {
            place = *inside++;
            walk.StepTo(place.m_Position);
        } else if (!breaksAnywhere) {
            break;
        }
        bool const isAtCluster = !walk.IsAtEnd() && walk.GetPosition() == place.m_Position;
        if (place.m_Position > piece.m_Start && place.m_Position < piece.m_End) {
            double const before = static_cast<double>(walk.GetAdvance()) * item.m_Scale +
                                  walk.GetClusters() * item.m_Tracking;
            double endWidth = before;
            double nextWidth = before;
            bool const hyphen = (place.m_Flags & BreakNode::Hyphen) != 0;
            bool const isExact = isAtCluster && walk.IsSafe();
            if (!isExact && piece.m_End - piece.m_Start <= longestExactWord) {
                endWidth = m_Maker.MakePart(piece, piece.m_Start, place.m_Position, hyphen).m_Width;
                nextWidth =
                    piece.m_Width - m_Maker.MakePart(piece, place.m_Position, piece.m_End, false).m_Width;
            } else if (hyphen) {
                endWidth += item.m_Context->GetHyphenAdvance() * item.m_Scale + item.m_Tracking;
            }
            m_ContentWidth = startWidth + endWidth;
            m_Width = startWidth + nextWidth;
            m_Stretch = m_ContentStretch = startStretch + walk.GetClusters() * gapStretch;
            m_Shrink = m_ContentShrink = startShrink + walk.GetClusters() * gapShrink;
            m_ContentEnd = place.m_Position;
            m_ContentItem = piece.m_Item;
            AddNode(place.m_Position, index, place.m_Penalty, place.m_Flags, nodes);
            if (hyphen && m_Settings.m_Protrusion > 0) {
                nodes.back().m_EndWidth += Protrusion(place.m_Position - 1, item, true);
                nodes.back().m_EndWidth -= ProtrusionShare(item.m_Context->GetHyphen(), true) * m_Settings.m_Protrusion *
                                           item.m_Context->GetHyphenAdvance() * item.m_Scale;
            }
        }
        if (breaksAnywhere && isAtCluster) {
            walk.Step();
        }
    }
    m_Width = startWidth + piece.m_Width;
    m_Stretch = startStretch + piece.m_Clusters * gapStretch;
    m_Shrink = startShrink + piece.m_Clusters * gapShrink;
}

void NodeMaker::FindHyphens(Piece const & piece, std::uint32_t index)
{
    auto const isLetter = [this](std::uint32_t at) {
        return (m_Characters.Get(m_Text[at]).m_Flags & CharacterInfo::Letter) != 0;
    };
    // A word that goes on in another style is not known as a whole.
    bool const startsInside = index > 0 && m_Pieces[index - 1].m_Kind == Piece::Kind::Text &&
                              isLetter(piece.m_Start - 1) && isLetter(piece.m_Start);
    bool const endsInside = index + 1 < m_Pieces.size() && m_Pieces[index + 1].m_Kind == Piece::Kind::Text &&
                            isLetter(piece.m_End - 1) && isLetter(piece.m_End);
    std::u16string_view const stretch = m_Text.substr(piece.m_Start, piece.m_End - piece.m_Start);
    if (startsInside || endsInside) {
        return;
    }
    Shape & shape = *piece.m_Shape;
    bool const isCacheable = piece.m_IsWhole && shape.m_Cached;
    if (isCacheable && shape.m_Hyphenated) {
        for (std::size_t i = 0; i < shape.m_HyphenCount; ++i) {
            m_Inside.push_back({piece.m_Start + shape.m_Hyphens[i], static_cast<float>(m_Settings.m_HyphenPenalty),
                                BreakNode::Hyphen | BreakNode::Flagged});
        }
        return;
    }
    std::size_t const firstFound = m_Inside.size();
    bool const isWord = stretch.size() >= 5 && !IsWebAddress(stretch);
    for (std::uint32_t at = piece.m_Start; isWord && at < piece.m_End;) {
        if (!isLetter(at)) {
            ++at;
            continue;
        }
        std::uint32_t end = at + 1;
        while (end < piece.m_End && (isLetter(end) || ((m_Text[end] == u'\'' || m_Text[end] == u'\u2019') &&
                                                       end + 1 < piece.m_End && isLetter(end + 1)))) {
            ++end;
        }
        // Part numbers, identifiers and addresses are left whole.
        bool const besideDigit = (at > piece.m_Start && m_Text[at - 1] >= u'0' && m_Text[at - 1] <= u'9') ||
                                 (end < piece.m_End && (m_Text[end] == u'_' || m_Text[end] == u'@' ||
                                                        (m_Text[end] >= u'0' && m_Text[end] <= u'9')));
        if (!besideDigit) {
            HyphenateStretch(piece, at, end);
        }
        at = end;
    }
    if (isCacheable) {
        std::size_t const count = std::min<std::size_t>(m_Inside.size() - firstFound, 255);
        auto * kept = m_Items[piece.m_Item].m_Context->GetArena().Allocate<std::uint16_t>(count);
        for (std::size_t i = 0; i < count; ++i) {
            kept[i] = static_cast<std::uint16_t>(m_Inside[firstFound + i].m_Position - piece.m_Start);
        }
        shape.m_Hyphens = kept;
        shape.m_HyphenCount = static_cast<std::uint8_t>(count);
        shape.m_Hyphenated = true;
    }
}

void NodeMaker::HyphenateStretch(Piece const & piece, std::uint32_t start, std::uint32_t end)
{
    m_Hyphens.clear();
    m_Items[piece.m_Item].m_Resolved->GetHyphenator()->Hyphenate(m_Text.substr(start, end - start), m_Hyphens);
    for (std::uint16_t const position : m_Hyphens) {
        m_Inside.push_back({start + position, static_cast<float>(m_Settings.m_HyphenPenalty),
                            BreakNode::Hyphen | BreakNode::Flagged});
    }
}

}
