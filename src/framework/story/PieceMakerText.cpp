#include "framework/kernel/Utf.h"
#include "framework/story/PieceMaker.h"

#include <algorithm>

namespace Story::Flow
{

namespace
{

// Parts of the em above and below the baseline that a line of text needs.
constexpr double AscentPart = 0.75;
constexpr double DescentPart = 0.25;
// Between a list marker or note number and the text, in ems.
constexpr double MarkerGap = 0.45;
constexpr double LeastMarkerGap = 0.25;
constexpr double UnlimitedWidth = 100000;
constexpr double SmallestMeasure = 4;

float AsFloat(double value)
{
    return static_cast<float>(value);
}

Typeset::Alignment AsTypeset(ParagraphAtt::AlignmentKind alignment)
{
    switch (alignment) {
    case ParagraphAtt::Centre:
        return Typeset::Alignment::Centre;
    case ParagraphAtt::Right:
        return Typeset::Alignment::End;
    case ParagraphAtt::Justify:
        return Typeset::Alignment::Justified;
    default:
        return Typeset::Alignment::Start;
    }
}

}

PieceMaker::Edges PieceMaker::GetEdges(Story const & story, std::size_t paragraph, ParagraphStyle const & style,
                                       Context const & context) const
{
    ParagraphFormat const & format = style.m_Format;
    Edges edges;
    edges.m_Left = AsFloat(format.m_LeftIndent);
    edges.m_Right = AsFloat(format.m_RightIndent);
    edges.m_First = AsFloat(format.m_FirstLineIndent);
    auto const & atts = story.GetParagraphs()[paragraph].m_Atts;
    if (auto const list = atts ? atts->GetListAtt() : nullptr) {
        constexpr int deepest = 100;
        int const depth = std::clamp(list->GetLevel(), 0, deepest) + 1;
        // Very deep lists leave at least half of the measure to the text.
        float const wanted = AsFloat(format.m_ListIndent) * static_cast<float>(depth);
        edges.m_Left += std::min(wanted, std::max(0.0F, context.m_Width / 2 - edges.m_Left));
        edges.m_MarkerRoom = AsFloat(format.m_ListIndent);
        if (list->GetKind() != ListAtt::None) {
            edges.m_First = 0;
        }
    }
    if (context.m_NoteIndent > 0) {
        edges.m_Left += context.m_NoteIndent;
        edges.m_MarkerRoom = context.m_NoteIndent;
        if (context.m_Note != None) {
            edges.m_First = 0;
        }
    }
    return edges;
}

Typeset::ParagraphSettings PieceMaker::MakeSettings(ParagraphStyle const & style, Edges const & edges,
                                                    Context const & context) const
{
    ParagraphFormat const & format = style.m_Format;
    Typeset::ParagraphSettings settings;
    settings.m_Width = context.m_Width;
    settings.m_StartIndent = edges.m_Left;
    settings.m_EndIndent = edges.m_Right;
    // Indents that leave nothing are given up, so that lines still hold words.
    if (context.m_Width - edges.m_Left - edges.m_Right < std::min<double>(SmallestMeasure, context.m_Width)) {
        settings.m_StartIndent = 0;
        settings.m_EndIndent = 0;
    }
    settings.m_FirstLineIndent = edges.m_First;
    settings.m_Alignment = AsTypeset(context.m_Alignment.value_or(format.m_Alignment));
    settings.m_Hyphenate = format.m_Hyphenate;
    if (format.m_MarkWraps) {
        constexpr double codeAdvance = 0.6;
        settings.m_Mode = Typeset::BreakMode::Code;
        settings.m_DefaultTab = style.m_Glyph.m_Size * codeAdvance * format.m_TabSize;
    }
    return settings;
}

void PieceMaker::BreakLines(Segment & segment, ParagraphStyle const & style,
                            Typeset::ParagraphSettings const & settings, Context const & context,
                            Typeset::LineArena & arena)
{
    Story const & story = *segment.m_Story;
    m_InputRuns.clear();
    m_InputStyles.clear();
    m_InputObjects.clear();
    segment.m_FirstStyle = static_cast<std::uint32_t>(m_StyleRefs.size());
    segment.m_FirstObject = static_cast<std::uint32_t>(m_Objects.size());

    auto const addRun = [&](std::size_t end, RunStyle const & run) {
        auto const offset = static_cast<std::uint32_t>(end - segment.m_Begin);
        if (!m_InputRuns.empty() && m_StyleRefs.back() == &run) {
            m_InputRuns.back().m_End = offset;
            return;
        }
        m_InputRuns.push_back({offset, static_cast<std::uint32_t>(m_InputStyles.size())});
        m_InputStyles.push_back(run.m_Text);
        m_StyleRefs.push_back(&run);
    };

    std::size_t place = segment.m_Begin;
    auto const objects = story.GetObjects();
    std::size_t object = story.GetObjectIndex(segment.m_Begin);
    for (std::size_t run = place < segment.m_End ? story.GetRunIndex(place) : 0; place < segment.m_End; ++run) {
        GlyphAtts const * atts = story.GetGlyphRuns()[run].m_Atts.Get();
        std::size_t const runEnd = std::min<std::size_t>(story.GetGlyphRuns()[run].m_End, segment.m_End);
        RunStyle const & text = m_Styles.GetRun(style, atts, RunPurpose::Text);
        for (; object < objects.size() && objects[object].m_Offset < runEnd; ++object) {
            Glyph const & glyph = *objects[object].m_Glyph;
            std::size_t const offset = objects[object].m_Offset;
            LineObject item;
            Typeset::InlineObject input;
            input.m_Position = static_cast<std::uint32_t>(offset - segment.m_Begin);
            RunStyle const * own = &text;
            if (auto const note = m_NoteNumbers.find(&glyph); note != m_NoteNumbers.end()) {
                item.m_Note = note->second;
                item.m_Text = m_Notes[note->second].m_Number;
                own = &m_Styles.GetRun(style, atts, RunPurpose::NoteReference);
                input.m_Attached = true;
            } else if (auto const * field = dynamic_cast<FieldGlyph const *>(&glyph)) {
                item.m_Kind = LineObject::Kind::Field;
                item.m_Text = m_Options.m_FieldText ? m_Options.m_FieldText(*field) : std::u16string();
            } else if (auto const * picture = dynamic_cast<PictureGlyph const *>(&glyph)) {
                item.m_Kind = LineObject::Kind::Picture;
                item.m_Picture = picture;
                auto const size = FitPicture(*picture, context.m_Width - settings.m_StartIndent, context.m_Height);
                input.m_Width = size.width;
                input.m_Ascent = size.height;
                item.m_Height = AsFloat(size.height);
            } else {
                continue;
            }
            if (offset > place) {
                addRun(offset, text);
            }
            addRun(offset + 1, *own);
            place = offset + 1;
            m_Objects.push_back(std::move(item));
            input.m_Text = m_Objects.back().m_Text;
            m_InputObjects.push_back(input);
        }
        if (place < runEnd) {
            addRun(runEnd, text);
            place = runEnd;
        }
    }
    if (m_InputStyles.empty()) {
        RunStyle const & run = m_Styles.GetRun(style, nullptr, RunPurpose::Text);
        m_InputStyles.push_back(run.m_Text);
        m_StyleRefs.push_back(&run);
    }

    Typeset::ParagraphInput input;
    input.m_Text = story.GetText().substr(segment.m_Begin, segment.m_End - segment.m_Begin);
    input.m_Runs = m_InputRuns;
    input.m_Styles = m_InputStyles;
    input.m_Objects = m_InputObjects;
    input.m_Settings = &settings;
    segment.m_FirstProblem = static_cast<std::uint32_t>(arena.m_Problems.size());
    auto const lines = m_Builder.Build(input, arena);
    segment.m_FirstLine = lines.m_FirstLine;
    segment.m_LineCount = lines.m_LineCount;
    segment.m_IsRightToLeft = lines.m_RightToLeft;
    segment.m_ProblemCount = static_cast<std::uint32_t>(arena.m_Problems.size()) - segment.m_FirstProblem;
}

void PieceMaker::SetMarker(Segment & segment, Edges & edges, std::size_t paragraph, ParagraphStyle const & style)
{
    RunPurpose purpose = RunPurpose::Marker;
    if (segment.m_Note != None) {
        purpose = RunPurpose::NoteNumber;
        segment.m_MarkerText = m_Notes[segment.m_Note].m_Number + u'.';
    } else {
        auto const & atts = segment.m_Story->GetParagraphs()[paragraph].m_Atts;
        auto const list = atts ? atts->GetListAtt() : nullptr;
        bool const isItem = list && list->GetKind() != ListAtt::None &&
                            segment.m_Begin == segment.m_Story->GetParagraphBegin(paragraph);
        if (!isItem) {
            return;
        }
        int const number = list->GetKind() == ListAtt::Numbered ? GetListNumbers(*segment.m_Story)[paragraph] : 0;
        segment.m_MarkerText = Kernel::Utf8ToUtf16(list->FormatMarker(number));
    }
    if (segment.m_MarkerText.empty()) {
        return;
    }
    RunStyle const & run = m_Styles.GetRun(style, nullptr, purpose);
    segment.m_MarkerStyle = &run;
    Typeset::ParagraphSettings settings;
    settings.m_Width = UnlimitedWidth;
    settings.m_Mode = Typeset::BreakMode::Greedy;
    settings.m_Alignment = Typeset::Alignment::Left;
    settings.m_Hyphenate = false;
    Typeset::ParagraphInput input;
    input.m_Text = segment.m_MarkerText;
    input.m_Styles = std::span(&run.m_Text, 1);
    input.m_Settings = &settings;
    auto const lines = m_Builder.Build(input, m_Arena);
    segment.m_MarkerLine = lines.m_FirstLine;
    segment.m_MarkerWidth = m_Arena.m_Lines[lines.m_FirstLine].m_SetWidth;
    // A marker that is wide for its room moves closer to the text; one that is wider than its room starts at the room's
    // edge and pushes the first line.
    segment.m_MarkerGap = std::clamp(edges.m_MarkerRoom - segment.m_MarkerWidth,
                                     AsFloat(style.m_Glyph.m_Size * LeastMarkerGap),
                                     AsFloat(style.m_Glyph.m_Size * MarkerGap));
    edges.m_First = std::max(edges.m_First, segment.m_MarkerWidth + segment.m_MarkerGap - edges.m_MarkerRoom);
}

void PieceMaker::MakeText(Segment segment, std::size_t paragraph, ParagraphStyle const & style,
                          Context const & context, std::vector<Piece> & pieces)
{
    ParagraphFormat const & format = style.m_Format;
    Edges edges = GetEdges(*segment.m_Story, paragraph, style, context);
    if (!context.m_IsCell) {
        segment.m_Decoration =
            m_Styles.GetDecoration(format, edges.m_Left, std::max(edges.m_Left, context.m_Width - edges.m_Right));
    }
    if (segment.m_Decoration) {
        auto const padding = segment.m_Decoration->m_Padding;
        int const sides = segment.m_Decoration->m_Background ? ~0 : segment.m_Decoration->m_Sides;
        edges.m_Left += (sides & ParagraphAtt::BorderLeft) != 0 ? padding : 0;
        edges.m_Right += (sides & ParagraphAtt::BorderRight) != 0 ? padding : 0;
    }
    SetMarker(segment, edges, paragraph, style);
    if (segment.m_Begin > segment.m_Story->GetParagraphBegin(paragraph)) {
        edges.m_First = 0;
    }
    auto const settings = MakeSettings(style, edges, context);
    BreakLines(segment, style, settings, context, m_Arena);
    if (segment.m_MarkerLine != None) {
        float const start = AsFloat(settings.m_StartIndent) + AsFloat(settings.m_FirstLineIndent);
        segment.m_MarkerX = segment.m_IsRightToLeft ? context.m_Width - start + segment.m_MarkerGap
                                                    : start - segment.m_MarkerGap - segment.m_MarkerWidth;
    }

    std::uint32_t const count = segment.m_LineCount;
    std::uint32_t const firstLine = segment.m_FirstLine;
    std::uint32_t const begin = segment.m_MainBegin;
    bool const isMain = segment.m_IsMain;
    double const size = style.m_Glyph.m_Size;
    double const leading = format.m_Leading;
    auto const orphans = static_cast<std::uint32_t>(format.m_Orphans);
    auto const widows = static_cast<std::uint32_t>(format.m_Widows);
    std::uint32_t const kept = KeepSegment(std::move(segment));
    for (std::uint32_t i = 0; i < count; ++i) {
        Typeset::Line const & line = m_Arena.m_Lines[firstLine + i];
        double const em = std::max<double>(size, line.m_FontSize);
        Piece piece;
        piece.m_Kind = Piece::Kind::Line;
        piece.m_IsFirst = i == 0;
        piece.m_IsLast = i + 1 == count;
        piece.m_OnGrid = format.m_AlignToGrid && !context.m_IsCell;
        piece.m_Segment = kept;
        piece.m_Line = firstLine + i;
        piece.m_MainEnd = isMain ? begin + line.m_TextEnd : begin;
        piece.m_HeadAbove = AsFloat(em * AscentPart);
        piece.m_FootBelow = AsFloat(em * DescentPart);
        piece.m_Above = AsFloat(em * AscentPart + (leading - size) / 2);
        piece.m_Below = AsFloat(leading) - piece.m_Above;
        if (em > size) {
            piece.m_Below = std::max(piece.m_FootBelow, AsFloat(size * DescentPart + (leading - size) / 2));
        }
        for (std::uint32_t run = 0; run < line.m_RunCount; ++run) {
            // Boxes in the line push it apart; glyphs do not.
            if (m_Arena.m_Runs[line.m_FirstRun + run].m_IsBox) {
                piece.m_HeadAbove = std::max(piece.m_HeadAbove, line.m_Ascent);
                piece.m_Above = std::max(piece.m_Above, line.m_Ascent);
                break;
            }
        }
        if (context.m_IsCell) {
            // Rules and neighbours stand close by: the first line of a cell keeps its whole slot.
            piece.m_HeadAbove = piece.m_Above;
        }
        if (i > 0) {
            bool const mayBreak = !format.m_KeepTogether && i >= orphans && count - i >= widows;
            piece.m_Break = mayBreak ? Piece::Break::Allowed : Piece::Break::Forbidden;
        }
        pieces.push_back(piece);
    }
}

}
