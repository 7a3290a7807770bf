#include "framework/story/PieceMaker.h"

#include "framework/kernel/Utf.h"

#include <algorithm>
#include <map>

namespace Story::Flow
{

namespace
{

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
    constexpr double dotAndGap = 0.7;
    m_NoteIndent = AsFloat(noteStyle.m_Glyph.m_Size * (digitWidth * static_cast<double>(digits) + dotAndGap));

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

}
