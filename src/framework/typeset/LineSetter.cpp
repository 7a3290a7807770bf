#include "framework/typeset/LineSetter.h"

#include <algorithm>
#include <cmath>

namespace Typeset
{

namespace
{

constexpr double tolerance = 0.01; // Points by which a line may be too wide before it counts as such.

bool IsGlyphPiece(Piece const & piece)
{
    return piece.m_Kind == Piece::Kind::Text || piece.m_Kind == Piece::Kind::Space;
}

}

LineSetter::LineSetter(ParagraphInput const & input, ParagraphSettings const & settings, WorkingText const & work,
                       std::vector<ResolvedStyle *> const & styles, std::vector<TextItem> const & items,
                       std::vector<Piece> const & pieces, std::vector<BreakNode> const & nodes,
                       LineRooms const & rooms, PieceMaker & maker, std::uint8_t baseLevel, LineArena & arena) :
    m_Input(input),
    m_Settings(settings), m_Work(work), m_Text(work.GetText()), m_Styles(styles), m_Items(items), m_Pieces(pieces),
    m_Nodes(nodes), m_Rooms(rooms), m_Maker(maker), m_Arena(arena), m_BaseLevel(baseLevel)
{
    if (m_Settings.m_Mode == BreakMode::Code && m_Settings.m_ContinuationSign) {
        PrepareSign();
    }
}

void LineSetter::PrepareSign()
{
    ResolvedStyle & style = *m_Styles[m_Work.GetRuns().front().m_Style];
    Kernel::Counted<FontFace const> const & face = style.FindFace(m_Settings.m_ContinuationSign);
    if (face) {
        m_Sign.m_Face = face;
        m_Sign.m_Glyph = face->GetGlyph(m_Settings.m_ContinuationSign);
        m_Sign.m_Size = style.GetStyle().m_Size;
        m_Sign.m_Width = face->GlyphAdvance(m_Sign.m_Glyph) * m_Sign.m_Size / face->GetUnitsPerEm();
    }
}

void LineSetter::Set(std::uint32_t from, std::uint32_t to)
{
    BreakNode const & start = m_Nodes[from];
    BreakNode const & end = m_Nodes[to];
    Collect(start, end);

    Line line;
    line.m_TextStart = m_Work.ToSource(start.m_Position);
    line.m_TextEnd = m_Work.ToSource(end.m_Position);
    if (from == 0) {
        line.m_TextStart = 0; // What was left out before the first character belongs to the first line.
        line.m_Flags |= Line::FirstLine;
    }
    bool const forced = (end.m_Flags & BreakNode::Forced) != 0;
    if (end.m_Flags & BreakNode::End) {
        line.m_Flags |= Line::LastLine;
    } else if (forced) {
        line.m_Flags |= Line::ForcedBreak;
    }
    if (end.m_Flags & BreakNode::Hyphen) {
        line.m_Flags |= Line::Hyphenated;
    }

    LineRoom const room = m_Rooms.Get(m_LineNumber);
    bool const rightToLeft = (m_BaseLevel & 1) != 0;
    double const edge =
        m_Settings.m_StartIndent + (m_LineNumber == 0 ? m_Settings.m_FirstLineIndent : 0);
    SetTabs(edge);
    double natural = 0;
    bool hasTab = false;
    for (Placed const & placed : m_Placed) {
        natural += placed.m_Width;
        hasTab |= placed.m_Piece.m_Kind == Piece::Kind::Tab;
    }
    double hangStart = 0;
    double hangEnd = 0;
    if (m_Settings.m_Protrusion > 0 && !m_Placed.empty() && m_BaseLevel == 0) {
        hangStart = Protrusion(m_Placed.front(), false);
        hangEnd = Protrusion(m_Placed.back(), true);
    }
    bool const wrapsCode = m_Settings.m_Mode == BreakMode::Code && !forced && m_Sign.m_Face;
    double const missing = room.m_Width - (natural - hangStart - hangEnd) - (wrapsCode ? m_Sign.m_Width : 0);

    Alignment alignment = m_Settings.m_Alignment;
    if (alignment == Alignment::Justified && (forced || hasTab || m_Settings.m_Mode == BreakMode::Code)) {
        alignment = hasTab || m_Settings.m_Mode == BreakMode::Code ? Alignment::Start : m_Settings.m_LastLineAlignment;
    }
    bool const justifies = alignment == Alignment::Justified;
    // The last line may have been chosen on the strength of its spaces' shrinking.
    bool const shrinks = m_Settings.m_Alignment == Alignment::Justified && missing < 0 && !hasTab &&
                         m_Settings.m_Mode != BreakMode::Code;
    if (justifies || shrinks) {
        Justify(missing, line);
    }
    double set = 0;
    for (Placed const & placed : m_Placed) {
        set += placed.m_Width;
    }
    double const rest = room.m_Width - (set - hangStart - hangEnd);
    if (rest < -tolerance) {
        line.m_Flags |= Line::Overfull;
        m_Arena.m_Problems.push_back({LayoutProblem::Kind::OverfullLine, line.m_TextStart, 0, 0});
    }

    double x = room.m_Left - hangStart;
    switch (alignment) {
    case Alignment::Centre:
        x += rest / 2;
        break;
    case Alignment::Right:
        x += rest;
        break;
    case Alignment::End:
        x += rightToLeft ? 0 : rest;
        break;
    case Alignment::Start:
        x += rightToLeft ? rest : 0;
        break;
    case Alignment::Justified:
        x += rightToLeft ? rest : 0;
        break;
    case Alignment::Left:
        break;
    }
    line.m_X = static_cast<float>(x);
    line.m_NaturalWidth = static_cast<float>(natural);
    line.m_SetWidth = static_cast<float>(set);
    line.m_FirstRun = static_cast<std::uint32_t>(m_Arena.m_Runs.size());
    Order();
    Emit(x);
    if (wrapsCode) {
        line.m_Flags |= Line::Wrapped;
        GlyphRun run;
        run.m_FirstGlyph = static_cast<std::uint32_t>(m_Arena.m_Glyphs.size());
        run.m_GlyphCount = 1;
        run.m_TextStart = run.m_TextEnd = line.m_TextEnd;
        run.m_Style = m_Work.GetRuns().front().m_Style;
        run.m_Face = FaceIndex(m_Sign.m_Face);
        run.m_Size = static_cast<float>(m_Sign.m_Size);
        run.m_X = static_cast<float>(room.m_Left + room.m_Width - m_Sign.m_Width);
        run.m_Width = static_cast<float>(m_Sign.m_Width);
        PlacedGlyph glyph;
        glyph.m_Glyph = static_cast<std::uint16_t>(m_Sign.m_Glyph);
        glyph.m_Flags = PlacedGlyph::Synthetic;
        glyph.m_Cluster = line.m_TextEnd;
        glyph.m_Advance = run.m_Width;
        m_Arena.m_Glyphs.push_back(glyph);
        m_Arena.m_Runs.push_back(run);
    }
    line.m_RunCount = static_cast<std::uint32_t>(m_Arena.m_Runs.size()) - line.m_FirstRun;
    AddHeights(line);
    if (line.m_FontSize == 0) {
        // An empty line is as high as the style that would stand there.
        std::vector<WorkRun> const & runs = m_Work.GetRuns();
        auto run = std::find_if(runs.begin(), runs.end(),
                                [&](WorkRun const & candidate) { return candidate.m_End > start.m_Position; });
        ResolvedStyle const & style = *m_Styles[run == runs.end() ? runs.back().m_Style : run->m_Style];
        line.m_FontSize = static_cast<float>(style.GetStyle().m_Size);
        if (!style.GetFaces().empty()) {
            FaceMetrics const & metrics = style.GetFaces().front()->GetMetrics();
            double const scale = style.GetStyle().m_Size / metrics.m_UnitsPerEm;
            line.m_Ascent = std::max(line.m_Ascent, static_cast<float>(metrics.m_Ascent * scale));
            line.m_Descent = std::max(line.m_Descent, static_cast<float>(metrics.m_Descent * scale));
        }
    }
    m_Arena.m_Lines.push_back(line);
    ++m_LineNumber;
}

void LineSetter::Collect(BreakNode const & from, BreakNode const & to)
{
    m_Placed.clear();
    for (std::size_t index = from.m_Piece; index < m_Pieces.size() && m_Pieces[index].m_Start < to.m_Position;
         ++index) {
        Piece const & piece = m_Pieces[index];
        std::uint32_t const start = std::max(piece.m_Start, from.m_Position);
        std::uint32_t const end = std::min(piece.m_End, to.m_Position);
        Placed & placed = m_Placed.emplace_back();
        bool const hyphen = (to.m_Flags & BreakNode::Hyphen) && end == to.m_Position;
        if (piece.m_Kind == Piece::Kind::Text && (start > piece.m_Start || end < piece.m_End || hyphen)) {
            placed.m_Piece = m_Maker.MakePart(piece, start, end, hyphen);
        } else {
            placed.m_Piece = piece;
        }
    }
    while (!m_Placed.empty() && (m_Placed.back().m_Piece.m_Kind == Piece::Kind::Space ||
                                 m_Placed.back().m_Piece.m_Kind == Piece::Kind::LineEnd)) {
        bool const wasSpace = m_Placed.back().m_Piece.m_Kind == Piece::Kind::Space;
        m_Placed.pop_back();
        if (wasSpace && !m_Placed.empty()) {
            // Without the space, the last letter is not kerned to it.
            Piece & last = m_Placed.back().m_Piece;
            TextItem const & item = m_Items[last.m_Item];
            if (last.m_Kind == Piece::Kind::Text && last.m_IsWhole && item.m_Context && last.m_Shape &&
                last.m_Shape->m_Cached && item.m_Context->GetMode() == ShapingMode::SpacedWords) {
                last.m_Shape = m_Maker.MakeBare(last);
                last.m_LastGlyph = last.m_Shape->m_GlyphCount;
                last.m_Width = last.m_Shape->m_Width * item.m_Scale + last.m_Clusters * item.m_Tracking;
            }
        }
    }
    for (Placed & placed : m_Placed) {
        placed.m_Width = placed.m_Piece.m_Width;
        placed.m_Gaps = placed.m_Piece.m_Clusters;
    }
    if (!m_Placed.empty() && m_Placed.back().m_Gaps > 0 && ItemOf(m_Placed.back()).m_Level == 0) {
        --m_Placed.back().m_Gaps; // A gap after the line's last cluster would stand in the margin.
    }
}

void LineSetter::SetTabs(double edge)
{
    double x = edge;
    for (std::size_t i = 0; i < m_Placed.size(); ++i) {
        Placed & placed = m_Placed[i];
        if (placed.m_Piece.m_Kind == Piece::Kind::Tab) {
            TabTarget const target = FindTab(m_Settings, x);
            double following = 0;
            for (std::size_t j = i + 1; j < m_Placed.size() && m_Placed[j].m_Piece.m_Kind != Piece::Kind::Tab; ++j) {
                Piece const & piece = m_Placed[j].m_Piece;
                if (target.m_Alignment == TabAlignment::Decimal && piece.m_Kind == Piece::Kind::Text && piece.m_Shape) {
                    std::size_t const point =
                        m_Text.substr(piece.m_Start, piece.m_End - piece.m_Start).find_first_of(u".,");
                    if (point != std::u16string_view::npos) {
                        ClusterWalk walk(piece, m_Items[piece.m_Item].m_Context->IsRightToLeft());
                        walk.StepTo(piece.m_Start + static_cast<std::uint32_t>(point));
                        following += static_cast<double>(walk.GetAdvance()) * m_Items[piece.m_Item].m_Scale;
                        break;
                    }
                }
                following += piece.m_Width;
            }
            placed.m_Width = TabWidth(target, x, following);
            placed.m_Leader = target.m_Leader;
        }
        x += placed.m_Width;
    }
}

void LineSetter::Justify(double missing, Line & line)
{
    double spaces = 0;     // Their natural width.
    double gaps = 0;       // Ems of clusters that may be set apart, ideographs.
    double letters = 0;    // Ems of all clusters.
    for (Placed const & placed : m_Placed) {
        if (placed.m_Piece.m_Kind == Piece::Kind::Space) {
            spaces += placed.m_Width;
        }
        if (IsGlyphPiece(placed.m_Piece)) {
            double const ems = placed.m_Gaps * ItemOf(placed).m_Size;
            letters += ems;
            gaps += placed.m_Piece.m_Kind == Piece::Kind::Text && ItemOf(placed).m_Ideographic ? ems : 0;
        }
    }
    bool const opens = missing > 0;
    double const spaceShare = opens ? std::max(m_Settings.m_SpaceMaximum - 1, 0.001)
                                    : std::clamp(1 - m_Settings.m_SpaceMinimum, 0.0, 1.0);
    double const gapShare = opens ? 0.12 : 0.03;
    double const letterShare =
        (opens ? m_Settings.m_LetterSpaceMaximum : -m_Settings.m_LetterSpaceMinimum) / 1000;
    double const capacity = spaces * spaceShare + gaps * gapShare;
    double const letterCapacity = std::max(letters * letterShare, 0.0);
    if (capacity + letterCapacity <= 0) {
        return;
    }
    // A line that a wide box or an endless word has left nearly empty reads better with its own spaces.
    constexpr double mostSpaces = 6;
    if (opens && gaps <= 0 && missing > mostSpaces * spaces) {
        return;
    }
    double ratio = capacity > 0 ? std::abs(missing) / capacity : 0;
    line.m_SpaceRatio = static_cast<float>(opens ? ratio : -ratio);
    double letterRatio = 0;
    if (letterCapacity > 0 && (ratio > 1 || capacity <= 0)) {
        double const rest = std::abs(missing) - capacity;
        letterRatio = std::min(rest / letterCapacity, 1.0);
        ratio = capacity > 0 ? std::max((std::abs(missing) - letterRatio * letterCapacity) / capacity, 1.0) : 0;
    }
    if (!opens) {
        ratio = std::min(ratio, 1.0);
    }
    double const sign = opens ? 1 : -1;
    for (Placed & placed : m_Placed) {
        if (!IsGlyphPiece(placed.m_Piece)) {
            continue;
        }
        TextItem const & item = ItemOf(placed);
        double gap = letterRatio * letterShare;
        if (placed.m_Piece.m_Kind == Piece::Kind::Text) {
            gap += item.m_Ideographic ? ratio * gapShare : 0;
        } else {
            placed.m_Width += sign * placed.m_Piece.m_Width * spaceShare * ratio;
        }
        placed.m_ClusterGap = sign * gap * item.m_Size;
        placed.m_Width += placed.m_ClusterGap * placed.m_Gaps;
    }
}

double LineSetter::Protrusion(Placed const & placed, bool atEnd) const
{
    TextItem const & item = ItemOf(placed);
    if (placed.m_Piece.m_Kind != Piece::Kind::Text || !item.m_Context || item.m_Level != 0 ||
        placed.m_Piece.m_End <= placed.m_Piece.m_Start) {
        return 0;
    }
    FontFace const & face = item.m_Context->GetFace();
    char16_t unit = m_Text[atEnd ? placed.m_Piece.m_End - 1 : placed.m_Piece.m_Start];
    bool const hyphenated = placed.m_Piece.m_IsWhole && placed.m_Piece.m_Shape &&
                            placed.m_Piece.m_Shape->m_Length > placed.m_Piece.m_End - placed.m_Piece.m_Start;
    if (atEnd && hyphenated) {
        unit = item.m_Context->GetHyphen();
    }
    double const share = ProtrusionShare(unit, atEnd);
    return share == 0 ? 0
                      : share * m_Settings.m_Protrusion * face.GlyphAdvance(face.GetGlyph(unit)) * item.m_Scale;
}

void LineSetter::Order()
{
    // UAX #9 L2: from the highest level down to the lowest odd one, turn every stretch at that level or higher.
    std::uint8_t highest = 0;
    std::uint8_t lowestOdd = 255;
    for (Placed const & placed : m_Placed) {
        std::uint8_t const level = ItemOf(placed).m_Level;
        highest = std::max(highest, level);
        if (level & 1) {
            lowestOdd = std::min(lowestOdd, level);
        }
    }
    for (int level = highest; level >= lowestOdd; --level) {
        for (auto start = m_Placed.begin(); start != m_Placed.end();) {
            if (ItemOf(*start).m_Level < level) {
                ++start;
                continue;
            }
            auto end = start;
            while (end != m_Placed.end() && ItemOf(*end).m_Level >= level) {
                ++end;
            }
            std::reverse(start, end);
            start = end;
        }
    }
}

std::uint16_t LineSetter::FaceIndex(Kernel::Counted<FontFace const> const & face)
{
    auto & faces = m_Arena.m_Faces;
    auto found = std::find(faces.begin(), faces.end(), face);
    if (found == faces.end()) {
        faces.push_back(face);
        found = faces.end() - 1;
    }
    return static_cast<std::uint16_t>(found - faces.begin());
}

void LineSetter::Emit(double x)
{
    GlyphRun * run = nullptr;
    std::uint32_t runItem = 0;
    double runStart = 0;
    for (Placed const & placed : m_Placed) {
        Piece const & piece = placed.m_Piece;
        TextItem const & item = ItemOf(placed);
        bool const isGlyphs = IsGlyphPiece(piece) && item.m_Context;
        if (!run || !isGlyphs || runItem != piece.m_Item) {
            run = nullptr;
            bool const isBox = piece.m_Kind == Piece::Kind::Box;
            bool const isLeader = piece.m_Kind == Piece::Kind::Tab && placed.m_Leader;
            if (isGlyphs || isBox || isLeader) {
                run = &m_Arena.m_Runs.emplace_back();
                run->m_FirstGlyph = static_cast<std::uint32_t>(m_Arena.m_Glyphs.size());
                run->m_TextStart = m_Work.ToSource(piece.m_Start);
                run->m_TextEnd = m_Work.ToSourceEnd(piece.m_End);
                run->m_Style = item.m_Style;
                run->m_Object = item.m_Object;
                run->m_Level = item.m_Level;
                run->m_Size = static_cast<float>(item.m_Size);
                run->m_Rise = static_cast<float>(item.m_Rise);
                run->m_X = static_cast<float>(x);
                run->m_IsBox = isBox;
                runItem = piece.m_Item;
                runStart = x;
                if (isGlyphs) {
                    run->m_Face = FaceIndex(item.m_Context->GetCountedFace());
                }
            }
            if (isLeader) {
                EmitLeader(placed, *run);
            }
        }
        if (run && piece.m_Kind != Piece::Kind::Tab) {
            run->m_TextStart = std::min(run->m_TextStart, m_Work.ToSource(piece.m_Start));
            run->m_TextEnd = std::max(run->m_TextEnd, m_Work.ToSourceEnd(piece.m_End));
            run->m_Width = static_cast<float>(x + placed.m_Width - runStart);
        }
        if (isGlyphs) {
            if (piece.m_Kind == Piece::Kind::Space && !piece.m_Shape) {
                EmitSpaces(placed, *run);
            } else {
                EmitText(placed, *run);
            }
        } else {
            run = nullptr;
        }
        x += placed.m_Width;
    }
}

void LineSetter::EmitText(Placed const & placed, GlyphRun & run)
{
    Piece const & piece = placed.m_Piece;
    TextItem const & item = ItemOf(placed);
    if (!piece.m_Shape) {
        return;
    }
    bool const isSpace = piece.m_Kind == Piece::Kind::Space;
    std::uint32_t const count = piece.m_LastGlyph - piece.m_FirstGlyph;
    // Of spaces shaped with their words, each takes its part of what justification has added.
    double const spaceExtra = isSpace && count ? (placed.m_Width - piece.m_Width) / count : 0;
    std::size_t const first = m_Arena.m_Glyphs.size();
    m_Arena.m_Glyphs.resize(first + count);
    PlacedGlyph * out = m_Arena.m_Glyphs.data() + first;
    ShapeGlyph const * glyphs = piece.m_Shape->m_Glyphs + piece.m_FirstGlyph;
    std::uint32_t const hyphenFrom = piece.m_End;
    std::uint32_t clusters = 0;
    for (std::uint32_t i = 0; i < count; ++i) {
        ShapeGlyph const & glyph = glyphs[i];
        PlacedGlyph & placedGlyph = out[i];
        bool const endsCluster = i + 1 == count || glyphs[i + 1].m_Cluster != glyph.m_Cluster;
        std::uint32_t const position = piece.m_ShapeStart + glyph.m_Cluster;
        placedGlyph.m_Glyph = glyph.m_Glyph;
        placedGlyph.m_Cluster = m_Work.ToSource(std::min(position, hyphenFrom));
        placedGlyph.m_Flags = isSpace ? PlacedGlyph::Space : 0;
        if (position >= hyphenFrom) {
            placedGlyph.m_Flags |= PlacedGlyph::Synthetic;
        } else if (glyph.m_Glyph == 0) {
            placedGlyph.m_Flags |= PlacedGlyph::Missing;
        }
        double extra = spaceExtra;
        if (endsCluster) {
            extra += item.m_Tracking + (!isSpace && clusters < placed.m_Gaps ? placed.m_ClusterGap : 0);
            ++clusters;
        }
        placedGlyph.m_Advance = static_cast<float>(glyph.m_Advance * item.m_Scale + extra);
        placedGlyph.m_OffsetX = static_cast<float>(glyph.m_OffsetX * item.m_Scale);
        placedGlyph.m_OffsetY = static_cast<float>(-glyph.m_OffsetY * item.m_Scale);
    }
    run.m_GlyphCount += count;
}

void LineSetter::EmitSpaces(Placed const & placed, GlyphRun & run)
{
    Piece const & piece = placed.m_Piece;
    std::uint32_t const count = piece.m_End - piece.m_Start;
    PlacedGlyph glyph;
    glyph.m_Glyph = ItemOf(placed).m_Context->GetSpaceGlyph();
    glyph.m_Flags = PlacedGlyph::Space;
    glyph.m_Advance = static_cast<float>(placed.m_Width / count);
    bool const rightToLeft = (ItemOf(placed).m_Level & 1) != 0;
    for (std::uint32_t i = 0; i < count; ++i) {
        glyph.m_Cluster = m_Work.ToSource(rightToLeft ? piece.m_End - 1 - i : piece.m_Start + i);
        m_Arena.m_Glyphs.push_back(glyph);
    }
    run.m_GlyphCount += count;
}

void LineSetter::EmitLeader(Placed const & placed, GlyphRun & run)
{
    TextItem const & item = ItemOf(placed);
    Kernel::Counted<FontFace const> const & face = item.m_Resolved->FindFace(placed.m_Leader);
    if (!face) {
        return;
    }
    std::uint32_t const leader = face->GetGlyph(placed.m_Leader);
    double const advance = face->GlyphAdvance(leader) * item.m_Size / face->GetUnitsPerEm();
    if (!(advance > 0.01)) {
        return;
    }
    run.m_Face = FaceIndex(face);
    // A little air at both ends; what is left over stands before the first.
    double const count = std::floor((placed.m_Width - advance / 2) / advance);
    if (!(count >= 1) || count > 10000) {
        return;
    }
    run.m_GlyphCount = static_cast<std::uint32_t>(count);
    double const rest = placed.m_Width - count * advance;
    PlacedGlyph glyph;
    glyph.m_Glyph = static_cast<std::uint16_t>(leader);
    glyph.m_Flags = PlacedGlyph::Synthetic;
    glyph.m_Cluster = run.m_TextStart;
    glyph.m_Advance = static_cast<float>(advance);
    run.m_X += static_cast<float>(rest / 2);
    run.m_Width = static_cast<float>(count * advance);
    m_Arena.m_Glyphs.insert(m_Arena.m_Glyphs.end(), run.m_GlyphCount, glyph);
}

void LineSetter::AddHeights(Line & line) const
{
    double ascent = 0;
    double descent = 0;
    double size = 0;
    for (std::uint32_t i = line.m_FirstRun; i < line.m_FirstRun + line.m_RunCount; ++i) {
        GlyphRun const & run = m_Arena.m_Runs[i];
        if (run.m_IsBox) {
            if (run.m_Object < m_Input.m_Objects.size()) {
                InlineObject const & object = m_Input.m_Objects[run.m_Object];
                ascent = std::max(ascent, object.m_Ascent + run.m_Rise);
                descent = std::max(descent, object.m_Descent - run.m_Rise);
            }
            continue;
        }
        if (run.m_GlyphCount == 0) {
            continue;
        }
        FaceMetrics const & metrics = m_Arena.m_Faces[run.m_Face]->GetMetrics();
        double const scale = static_cast<double>(run.m_Size) / metrics.m_UnitsPerEm;
        ascent = std::max(ascent, metrics.m_Ascent * scale + run.m_Rise);
        descent = std::max(descent, metrics.m_Descent * scale - run.m_Rise);
        size = std::max(size, m_Styles[run.m_Style]->GetStyle().m_Size);
    }
    line.m_Ascent = static_cast<float>(ascent);
    line.m_Descent = static_cast<float>(descent);
    line.m_FontSize = static_cast<float>(size);
}

}
