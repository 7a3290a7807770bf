#include "framework/story/PieceMaker.h"

#include "framework/kernel/Utf.h"

#include <algorithm>
#include <cmath>
#include <map>

namespace Story::Flow
{

namespace
{

// Parts of the em above and below the baseline that a line of text needs.
constexpr double AscentPart = 0.75;
constexpr double DescentPart = 0.25;
// Between a list marker or note number and the text, in ems.
constexpr double MarkerGap = 0.45;
constexpr double UnlimitedWidth = 100000;
constexpr double SmallestMeasure = 4;

float AsFloat(double value)
{
    return static_cast<float>(value);
}

/// What a paragraph consists of, as far as it decides how it is set.
struct Contents
{
    bool m_HasText = false;
    bool m_HasPicture = false;
    bool m_HasBlock = false;
    bool m_HasMark = false;
};

bool IsBlank(char16_t unit)
{
    return unit == u' ' || unit == u'\t' || unit == u'\u00A0';
}

bool IsMark(Kernel::ClassUID uid)
{
    return uid == AnchorGlyph::c_classUid || uid == IndexMarkGlyph::c_classUid;
}

bool IsBlock(Kernel::ClassUID uid)
{
    return uid == TableGlyph::c_classUid || uid == RuleGlyph::c_classUid || uid == BreakGlyph::c_classUid;
}

Contents LookAt(Story const & story, std::size_t begin, std::size_t end)
{
    Contents contents;
    auto const text = story.GetText();
    auto const objects = story.GetObjects();
    std::size_t object = story.GetObjectIndex(begin);
    for (std::size_t i = begin; i < end; ++i) {
        if (text[i] != ObjectCharacter) {
            contents.m_HasText = contents.m_HasText || !IsBlank(text[i]);
            continue;
        }
        auto const uid = objects[object++].m_Glyph->GetClassUID();
        if (uid == PictureGlyph::c_classUid) {
            contents.m_HasPicture = true;
        } else if (IsBlock(uid)) {
            contents.m_HasBlock = true;
        } else if (IsMark(uid)) {
            contents.m_HasMark = true;
        } else {
            contents.m_HasText = true;
        }
    }
    return contents;
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

PieceMaker::PieceMaker(Story const & story, StyleSheet const & styles, ComposeOptions const & options,
                       Typeset::LineArena & arena, LayoutBuilder & layout)
    : m_Story(story), m_Sheet(styles), m_Options(options), m_Arena(arena), m_Layout(layout), m_Styles(styles, layout)
{
    CountNotesAndAnchors(story, 0, true);
    // Notes within notes follow those of the text.
    for (std::size_t i = 0; i < m_Notes.size(); ++i) {
        CountNotesAndAnchors(*m_Notes[i].m_Glyph->GetNote(), m_Notes[i].m_MainOffset, false);
    }
    NumberNotes();
    m_Layout.Anchors().resize(m_AnchorNumbers.size());
}

void PieceMaker::CountNotesAndAnchors(Story const & story, std::uint32_t mainOffset, bool isMain)
{
    for (Story::Object const & object : story.GetObjects()) {
        std::uint32_t const offset = isMain ? object.m_Offset : mainOffset;
        Glyph const & glyph = *object.m_Glyph;
        if (IsNoteReferenceGlyph()(glyph)) {
            if (m_NoteNumbers.try_emplace(&glyph, static_cast<std::uint32_t>(m_Notes.size())).second) {
                m_Notes.push_back({static_cast<NoteReferenceGlyph const *>(&glyph), offset, {}});
            }
        } else {
            for (std::size_t i = 0; i < glyph.GetStoryCount(); ++i) {
                if (auto const nested = glyph.GetStory(i)) {
                    CountNotesAndAnchors(*nested, offset, false);
                }
            }
        }
    }
}

void PieceMaker::NumberNotes()
{
    std::uint32_t number = 0;
    for (CollectedAnchor const & anchor : CollectAnchors(m_Story)) {
        m_AnchorNumbers.emplace(anchor.m_Glyph.Get(), number++);
    }
    std::map<int, int> next;
    auto & facts = m_Layout.Notes();
    for (NoteEntry & note : m_Notes) {
        NoteAtt const & att = *note.m_Glyph->GetNoteAtt();
        auto const [place, isFirst] = next.try_emplace(att.GetKind(), 0);
        if (isFirst && facts.empty() && m_Options.m_FirstNoteNumber) {
            place->second = *m_Options.m_FirstNoteNumber;
        } else if (isFirst || att.IsRestartNumbering()) {
            place->second = att.GetStartNumberingAt();
        }
        LayoutItem::Note fact;
        fact.m_Number = place->second++;
        fact.m_Kind = att.GetKind();
        fact.m_StoryOffset = note.m_MainOffset;
        facts.push_back(fact);
        note.m_Number = Kernel::Utf8ToUtf16(std::to_string(fact.m_Number));
    }
}

std::vector<int> const & PieceMaker::GetListNumbers(Story const & story)
{
    auto const [place, isNew] = m_ListNumbers.try_emplace(&story);
    if (isNew) {
        std::map<std::pair<String, int>, int> last;
        auto const paragraphs = story.GetParagraphs();
        place->second.resize(paragraphs.size());
        for (std::size_t i = 0; i < paragraphs.size(); ++i) {
            auto const list = paragraphs[i].m_Atts ? paragraphs[i].m_Atts->GetListAtt() : nullptr;
            if (!list || list->GetKind() != ListAtt::Numbered) {
                continue;
            }
            auto const [counter, isFirst] = last.try_emplace({list->GetName(), list->GetLevel()}, 0);
            counter->second = isFirst || list->IsRestartNumbering() ? list->GetStartNumberingAt() : counter->second + 1;
            place->second[i] = counter->second;
        }
    }
    return place->second;
}

void PieceMaker::SetFrame(float width, float height)
{
    m_Width = width;
    m_Height = height;
}

bool PieceMaker::MakeMore(std::vector<Piece> & pieces)
{
    std::size_t const before = pieces.size();
    while (pieces.size() == before) {
        if (m_PendingMarks.empty()) {
            m_BeginCursor = m_Cursor;
        }
        if (!MakeNext(pieces)) {
            return false;
        }
    }
    m_Segments[pieces[before].m_Segment].m_BeginsParagraph = true;
    m_Segments[pieces[before].m_Segment].m_Cursor = m_BeginCursor;
    return true;
}

void PieceMaker::RewindTo(Piece const & piece)
{
    Segment const & segment = m_Segments[piece.m_Segment];
    m_Cursor = segment.m_Cursor;
    m_PendingMarks.clear();
    m_Segments.resize(piece.m_Segment);
}

bool PieceMaker::MakeNext(std::vector<Piece> & pieces)
{
    Context context;
    context.m_Width = m_Width;
    context.m_Height = m_Height;
    if (m_Cursor.m_Paragraph < m_Story.GetParagraphs().size()) {
        context.m_IsMain = true;
        MakeParagraph(m_Story, m_Cursor.m_Paragraph++, context, pieces);
        return true;
    }
    if (!m_Options.m_SetsNotes || m_Cursor.m_Note >= m_Notes.size()) {
        return false;
    }
    if (!m_Cursor.m_HeadingIsMade) {
        m_Cursor.m_HeadingIsMade = true;
        MakeNotesHeading(pieces);
        return true;
    }
    NoteEntry const & note = m_Notes[m_Cursor.m_Note];
    Story const & text = *note.m_Glyph->GetNote();
    context.m_MainOffset = note.m_MainOffset;
    context.m_FallbackStyle = StyleSheet::NoteTextStyle;
    context.m_Role = LayoutItem::Role::NoteText;
    context.m_Note = m_Cursor.m_NoteParagraph == 0 ? m_Cursor.m_Note : None;
    context.m_NoteIndent = m_NoteIndent;
    if (m_Cursor.m_NoteParagraph < text.GetParagraphs().size()) {
        MakeParagraph(text, m_Cursor.m_NoteParagraph++, context, pieces);
    } else {
        ++m_Cursor.m_Note;
        m_Cursor.m_NoteParagraph = 0;
    }
    return true;
}

void PieceMaker::MakeNotesHeading(std::vector<Piece> & pieces)
{
    Context context;
    context.m_Width = m_Width;
    context.m_Height = m_Height;
    context.m_MainOffset = static_cast<std::uint32_t>(m_Story.GetLength());
    context.m_FallbackStyle = StyleSheet::NotesHeadingStyle;
    context.m_Role = LayoutItem::Role::Generated;

    // All numbers hang in the room of the widest.
    auto const & noteStyle = m_Styles.GetParagraph(nullptr, StyleSheet::NoteTextStyle);
    std::size_t digits = 1;
    for (NoteEntry const & note : m_Notes) {
        digits = std::max(digits, note.m_Number.size());
    }
    constexpr double digitWidth = 0.52;
    m_NoteIndent = AsFloat(noteStyle.m_Glyph.m_Size * (digitWidth * static_cast<double>(digits) + 0.25 + MarkerGap));

    if (m_Options.m_NotesHeading.Empty()) {
        return;
    }
    GlyphString text;
    text.AddText(m_Options.m_NotesHeading);
    text.AddChar32(ParagraphEnd);
    m_NotesHeading = Kernel::MakeCounted<Story>();
    m_NotesHeading->AppendText(text, nullptr, nullptr);
    MakeParagraph(*m_NotesHeading, 0, context, pieces);
    m_Cursor.m_KeepsWithNext = true;
}

std::uint32_t PieceMaker::KeepSegment(Segment segment)
{
    m_Segments.push_back(std::move(segment));
    return static_cast<std::uint32_t>(m_Segments.size() - 1);
}

void PieceMaker::MakeParagraph(Story const & story, std::size_t index, Context const & context,
                               std::vector<Piece> & pieces)
{
    auto const & paragraph = story.GetParagraphs()[index];
    std::size_t const begin = story.GetParagraphBegin(index);
    std::size_t end = paragraph.m_End;
    if (end > begin && story.GetText()[end - 1] == ParagraphEnd) {
        --end;
    }
    auto const & style = m_Styles.GetParagraph(paragraph.m_Atts.Get(), context.m_FallbackStyle);
    auto const & format = style.m_Format;
    Contents const contents = LookAt(story, begin, end);
    bool const picturesAreBlocks = contents.m_HasPicture && !contents.m_HasText;

    std::size_t const firstPiece = pieces.size();
    auto const makeSegment = [&](std::size_t from, std::size_t to) {
        Segment segment;
        segment.m_Story = &story;
        segment.m_Begin = static_cast<std::uint32_t>(from);
        segment.m_End = static_cast<std::uint32_t>(to);
        segment.m_MainBegin = context.m_IsMain ? segment.m_Begin : context.m_MainOffset;
        segment.m_IsMain = context.m_IsMain;
        segment.m_Format = &format;
        segment.m_Role = context.m_Role;
        if (segment.m_Role == LayoutItem::Role::Text && format.m_OutlineLevel > 0) {
            segment.m_Role = LayoutItem::Role::Heading;
        } else if (segment.m_Role == LayoutItem::Role::Text && format.m_MarkWraps) {
            segment.m_Role = LayoutItem::Role::Code;
        }
        segment.m_Note = from == begin ? context.m_Note : None;
        segment.m_IsHeading = context.m_IsMain && format.m_OutlineLevel > 0 && from == begin;
        segment.m_Marks = std::move(m_PendingMarks);
        m_PendingMarks.clear();
        return segment;
    };
    auto const addMark = [&](Story::Object const & object, std::vector<Mark> & marks, std::size_t base) {
        Mark mark;
        mark.m_Offset = static_cast<std::uint32_t>(object.m_Offset - base);
        mark.m_StoryOffset = context.m_IsMain ? object.m_Offset : context.m_MainOffset;
        if (auto const * indexMark = dynamic_cast<IndexMarkGlyph const *>(object.m_Glyph.Get())) {
            mark.m_Kind = Mark::Kind::Index;
            mark.m_Index = indexMark;
        } else {
            mark.m_Number = m_AnchorNumbers.at(object.m_Glyph.Get());
        }
        marks.push_back(mark);
    };
    // Sets what stands between two block elements. Nothing but marks and spaces takes no room there, and the marks
    // belong to what follows.
    auto const makeText = [&](std::size_t from, std::size_t to, bool isWhole) {
        bool const isEmptyParagraph = isWhole && from == to;
        Contents const part = isWhole ? contents : LookAt(story, from, to);
        auto const objects = story.GetObjects();
        bool const takesRoom =
            part.m_HasText || (part.m_HasPicture && !picturesAreBlocks) || isEmptyParagraph ||
            (isWhole && !part.m_HasMark);
        Segment segment = takesRoom ? makeSegment(from, to) : Segment();
        for (std::size_t i = story.GetObjectIndex(from); i < objects.size() && objects[i].m_Offset < to; ++i) {
            if (IsMark(objects[i].m_Glyph->GetClassUID())) {
                addMark(objects[i], takesRoom ? segment.m_Marks : m_PendingMarks, takesRoom ? from : objects[i].m_Offset);
            }
        }
        if (takesRoom) {
            MakeText(std::move(segment), index, style, context, pieces);
        }
    };

    bool breaksBeforeNext = false;
    if (!contents.m_HasBlock && !picturesAreBlocks) {
        makeText(begin, end, true);
    } else {
        std::size_t textBegin = begin;
        auto const objects = story.GetObjects();
        for (std::size_t i = story.GetObjectIndex(begin); i < objects.size() && objects[i].m_Offset < end; ++i) {
            Glyph const & glyph = *objects[i].m_Glyph;
            auto const uid = glyph.GetClassUID();
            bool const isPicture = uid == PictureGlyph::c_classUid;
            if (!IsBlock(uid) && !(isPicture && picturesAreBlocks)) {
                continue;
            }
            std::size_t const offset = objects[i].m_Offset;
            makeText(textBegin, offset, false);
            textBegin = offset + 1;
            std::size_t const blockBegin = pieces.size();
            if (isPicture) {
                MakePicture(makeSegment(offset, textBegin), static_cast<PictureGlyph const &>(glyph), style, context,
                            pieces);
            } else if (uid == TableGlyph::c_classUid) {
                MakeTable(makeSegment(offset, textBegin), static_cast<TableGlyph const &>(glyph), style, context,
                          pieces);
            } else if (uid == RuleGlyph::c_classUid) {
                MakeRule(makeSegment(offset, textBegin), style, context, pieces);
            } else if (pieces.size() > firstPiece) {
                breaksBeforeNext = true;
            } else if (!context.m_IsCell) {
                m_Cursor.m_BreaksBeforeNext = true;
            }
            if (breaksBeforeNext && pieces.size() > blockBegin) {
                pieces[blockBegin].m_Break = Piece::Break::Forced;
                breaksBeforeNext = false;
            }
        }
        std::size_t const restBegin = pieces.size();
        makeText(textBegin, end, false);
        if (breaksBeforeNext && pieces.size() > restBegin) {
            pieces[restBegin].m_Break = Piece::Break::Forced;
            breaksBeforeNext = false;
        }
    }
    if (pieces.size() == firstPiece) {
        return;
    }

    Piece & first = pieces[firstPiece];
    first.m_SpaceBefore = AsFloat(format.m_SpaceBefore);
    first.m_Break = format.m_PageBreakBefore || m_Cursor.m_BreaksBeforeNext            ? Piece::Break::Forced
                    : format.m_KeepWithPrevious || m_Cursor.m_KeepsWithNext            ? Piece::Break::Forbidden
                                                                                       : Piece::Break::Allowed;
    pieces.back().m_SpaceAfter = AsFloat(format.m_SpaceAfter);
    if (context.m_IsMain) {
        pieces.back().m_MainEnd = paragraph.m_End;
    }
    if (!context.m_IsCell) {
        m_Cursor.m_KeepsWithNext = format.m_KeepWithNext;
        m_Cursor.m_BreaksBeforeNext = breaksBeforeNext;
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
    segment.m_MarkerGap = AsFloat(style.m_Glyph.m_Size * MarkerGap);
    // A marker wider than its room starts at the room's edge and pushes the first line.
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
        if (i > 0) {
            bool const mayBreak = !format.m_KeepTogether && i >= orphans && count - i >= widows;
            piece.m_Break = mayBreak ? Piece::Break::Allowed : Piece::Break::Forbidden;
        }
        pieces.push_back(piece);
    }
}

Kernel::SizeT<double> PieceMaker::FitPicture(PictureGlyph const & picture, double width, double height) const
{
    constexpr double missingWidth = 180;
    constexpr double missingHeight = 60;
    auto const & fields = picture.GetFields();
    bool const isKnown = !fields.m_IsMissing && fields.m_NaturalWidth > 0 && fields.m_NaturalHeight > 0;
    double const naturalWidth = isKnown ? fields.m_NaturalWidth : missingWidth;
    double const naturalHeight = isKnown ? fields.m_NaturalHeight : missingHeight;
    double wanted = naturalWidth;
    if (isKnown && fields.m_WantedWidth > 0) {
        wanted = fields.m_WantedWidth;
    } else if (isKnown && fields.m_WantedMeasurePart > 0) {
        wanted = width * fields.m_WantedMeasurePart;
    }
    double scale = std::min(wanted, std::max(width, 1.0)) / naturalWidth;
    if (height > 0) {
        scale = std::min(scale, height / naturalHeight);
    }
    return {std::max(naturalWidth * scale, 1.0), std::max(naturalHeight * scale, 1.0)};
}

void PieceMaker::MakePicture(Segment segment, PictureGlyph const & picture, ParagraphStyle const & style,
                             Context const & context, std::vector<Piece> & pieces)
{
    ParagraphFormat const & format = style.m_Format;
    Edges const edges =
        GetEdges(*segment.m_Story, segment.m_Story->GetParagraphIndex(segment.m_Begin), style, context);
    float const measure = std::max(context.m_Width - edges.m_Left - edges.m_Right, 1.0F);
    // A caption below needs room beside a tall picture.
    constexpr double captionLines = 4;
    double const reserve = format.m_KeepWithNext ? captionLines * format.m_Leading : 0;
    double const height = context.m_Height > 2 * reserve ? context.m_Height - reserve : context.m_Height;
    auto const size = FitPicture(picture, measure, height);

    Piece piece;
    piece.m_Kind = Piece::Kind::Picture;
    piece.m_IsFirst = true;
    piece.m_IsLast = true;
    piece.m_Picture = &picture;
    piece.m_Above = AsFloat(size.height);
    piece.m_Width = AsFloat(size.width);
    auto const alignment = context.m_Alignment.value_or(format.m_Alignment);
    float const rest = std::max(0.0F, measure - piece.m_Width);
    piece.m_Left = edges.m_Left + (alignment == ParagraphAtt::Centre  ? rest / 2
                                   : alignment == ParagraphAtt::Right ? rest
                                                                      : 0);
    piece.m_MainEnd = segment.m_MainBegin + (segment.m_IsMain ? 1 : 0);
    if (picture.GetFields().m_IsMissing) {
        // The reason is set in the box, so that a reader of the page sees what is wrong.
        auto const & fields = picture.GetFields();
        GlyphString text;
        text.AddText(fields.m_MissingReason.Empty() ? fields.m_Path : fields.m_MissingReason);
        text.AddChar32(ParagraphEnd);
        auto story = Kernel::MakeCounted<Story>();
        story->AppendText(text, nullptr, nullptr);
        m_Generated.push_back(story);
        Context inner;
        inner.m_Width = std::max(piece.m_Width - 12, 1.0F);
        inner.m_IsCell = true;
        inner.m_MainOffset = segment.m_MainBegin;
        inner.m_FallbackStyle = StyleSheet::MissingPictureStyle;
        inner.m_Role = LayoutItem::Role::Generated;
        inner.m_Alignment = ParagraphAtt::Left;
        Row & row = m_Rows.emplace_back();
        row.m_Cells.resize(1);
        auto pending = std::move(m_PendingMarks);
        m_PendingMarks.clear();
        MakeParagraph(*story, 0, inner, row.m_Cells[0].m_Pieces);
        m_PendingMarks = std::move(pending);
        piece.m_Row = &row;
    }
    piece.m_Segment = KeepSegment(std::move(segment));
    pieces.push_back(piece);
}

void PieceMaker::MakeRule(Segment segment, ParagraphStyle const & style, Context const & context,
                          std::vector<Piece> & pieces)
{
    constexpr float widthPart = 0.22F;
    Piece piece;
    piece.m_Kind = Piece::Kind::Rule;
    piece.m_IsFirst = true;
    piece.m_IsLast = true;
    piece.m_Above = AsFloat(style.m_Format.m_Leading);
    piece.m_Width = context.m_Width * widthPart;
    piece.m_Left = (context.m_Width - piece.m_Width) / 2;
    piece.m_MainEnd = segment.m_MainBegin + (segment.m_IsMain ? 1 : 0);
    segment.m_MarkerStyle = &m_Styles.GetRun(style, nullptr, RunPurpose::Marker);
    piece.m_Segment = KeepSegment(std::move(segment));
    pieces.push_back(piece);
}

}
