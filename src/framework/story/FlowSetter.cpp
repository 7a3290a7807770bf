#include "framework/story/FlowSetter.h"

#include "framework/kernel/Utf.h"

#include <algorithm>

namespace Story::Flow
{

namespace
{

constexpr float HeavyRule = 0.8F;
constexpr float LightRule = 0.4F;
constexpr float ThematicRule = 0.5F;
constexpr float MissingStroke = 0.75F;
constexpr float MissingInset = 6;

/// The text of a line ends where the next one goes on in the same word.
bool EndsInWord(Segment const & segment, Typeset::Line const & line)
{
    if ((line.m_Flags & (Typeset::Line::ForcedBreak | Typeset::Line::LastLine)) != 0 || line.m_TextEnd == 0) {
        return false;
    }
    char16_t const unit = segment.m_Story->GetText()[segment.m_Begin + line.m_TextEnd - 1];
    return unit != u' ' && unit != u'\t' && unit != LineSeparator;
}

}

/// A line while its runs are set.
struct FlowSetter::LineContext
{
    float m_X = 0;
    float m_Baseline = 0;
    float m_Top = 0;
    float m_Bottom = 0;
    std::uint32_t m_StoryOffset = 0;
    std::uint32_t m_LastObject = None;
    /// Link that goes on from the run before.
    LayoutItem::Link m_Link;
};

LayoutItem::Place FlowSetter::PlaceAt(float x, float y) const
{
    return {m_Layout.GetFrameIndex(), x, y};
}

void FlowSetter::SetDecorations(std::span<Piece const> pieces, std::span<Placement const> places, float frameHeight)
{
    for (std::size_t first = 0; first < pieces.size();) {
        auto const * decoration = m_Maker.GetSegment(pieces[first]).m_Decoration;
        std::size_t end = first + 1;
        if (!decoration) {
            first = end;
            continue;
        }
        while (end < pieces.size() && places[end].m_IsJoined) {
            ++end;
        }
        float const padding = decoration->VerticalPadding();
        float const top = std::max(0.0F, places[first].m_Top - padding);
        float const bottom = std::min(std::max(frameHeight, places[end - 1].m_InkBottom),
                                      places[end - 1].m_Bottom + padding);
        if (decoration->m_Background) {
            m_Layout.AddBox({decoration->m_Left, top, decoration->m_Right, bottom, *decoration->m_Background,
                             LayoutItem::Box::Kind::Background, 0});
        }
        auto const addBorder = [&](int side, float left, float upper, float right, float lower) {
            if ((decoration->m_Sides & side) != 0) {
                m_Layout.AddBox(
                    {left, upper, right, lower, decoration->m_Border, LayoutItem::Box::Kind::Border, 0});
            }
        };
        float const width = decoration->m_BorderWidth;
        addBorder(ParagraphAtt::BorderLeft, decoration->m_Left, top, decoration->m_Left + width, bottom);
        addBorder(ParagraphAtt::BorderRight, decoration->m_Right - width, top, decoration->m_Right, bottom);
        addBorder(ParagraphAtt::BorderTop, decoration->m_Left, top, decoration->m_Right, top + width);
        addBorder(ParagraphAtt::BorderBottom, decoration->m_Left, bottom - width, decoration->m_Right, bottom);
        m_Used = std::max(m_Used, bottom);
        first = end;
    }
}

void FlowSetter::SetPiece(Piece const & piece, Placement const & place, float x)
{
    m_Used = std::max(m_Used, place.m_InkBottom);
    Segment & segment = m_Maker.GetSegment(piece);
    if (piece.m_IsFirst && !m_IsRepeat) {
        SetSegmentFacts(segment, x + (piece.m_Kind == Piece::Kind::Line ? 0 : piece.m_Left), place.m_Top);
    }
    switch (piece.m_Kind) {
    case Piece::Kind::Line:
        SetLine(piece, place, x);
        return;
    case Piece::Kind::Picture:
        SetFacts(segment, segment.m_End, x, place.m_Top);
        SetPicture(piece, place, x);
        return;
    case Piece::Kind::Rule: {
        SetFacts(segment, segment.m_End, x, place.m_Top);
        float const middle = (place.m_Top + place.m_Bottom) / 2;
        m_Layout.AddBox({x + piece.m_Left, middle, x + piece.m_Left + piece.m_Width, middle + ThematicRule,
                         segment.m_MarkerStyle->m_Colour, LayoutItem::Box::Kind::Rule, 0});
        return;
    }
    case Piece::Kind::Row:
        SetFacts(segment, segment.m_End, x, place.m_Top);
        SetRow(*piece.m_Row, place.m_Top, x);
        return;
    }
}

void FlowSetter::SetSegmentFacts(Segment const & segment, float x, float y)
{
    if (segment.m_IsHeading) {
        auto const text = segment.m_Story->GetString(segment.m_Begin, segment.m_End);
        m_Layout.AddHeading({PlaceAt(x, y), static_cast<std::uint32_t>(segment.m_Format->m_OutlineLevel),
                             m_Layout.AddString(text), segment.m_MainBegin});
    }
    if (segment.m_Note != None) {
        m_Layout.Notes()[segment.m_Note].m_Text = PlaceAt(x, y);
    }
    for (std::uint32_t i = 0; i < segment.m_ProblemCount; ++i) {
        Typeset::LayoutProblem const & problem = m_Arena.m_Problems[segment.m_FirstProblem + i];
        std::uint32_t const offset = segment.m_MainBegin + (segment.m_IsMain ? problem.m_Position : 0);
        using Kind = LayoutItem::Problem::Kind;
        if (problem.m_Kind == Typeset::LayoutProblem::Kind::OverfullLine) {
            m_Layout.AddProblem(Kind::OverfullLine, offset, String());
            continue;
        }
        bool const isFamily = problem.m_Kind == Typeset::LayoutProblem::Kind::MissingFamily;
        String text;
        if (isFamily) {
            text = m_Maker.GetRunStyle(segment, problem.m_Style).m_Text->m_Families.front();
        } else {
            std::string character;
            Kernel::AppendUtf8(character, problem.m_Character);
            text = character;
        }
        Kind const kind = isFamily ? Kind::MissingFamily : Kind::MissingCharacter;
        if (m_Told.emplace(kind, text).second) {
            m_Layout.AddProblem(kind, offset, text);
        }
    }
}

void FlowSetter::SetFacts(Segment & segment, std::uint32_t textEnd, float x, float y)
{
    if (m_IsRepeat) {
        return;
    }
    for (; segment.m_NextMark < segment.m_Marks.size(); ++segment.m_NextMark) {
        Mark const & mark = segment.m_Marks[segment.m_NextMark];
        if (mark.m_Offset >= textEnd) {
            break;
        }
        SetMarksAt({mark}, x, y);
    }
}

void FlowSetter::SetMarksAt(std::vector<Mark> const & marks, float x, float y)
{
    for (Mark const & mark : marks) {
        if (mark.m_Kind == Mark::Kind::Anchor) {
            m_Layout.Anchors()[mark.m_Number] = PlaceAt(x, y);
        } else {
            m_Layout.AddIndexMark(
                {PlaceAt(x, y), m_Layout.AddString(mark.m_Index->GetTopicNameWithParents()), mark.m_StoryOffset});
        }
    }
}

void FlowSetter::SetLine(Piece const & piece, Placement const & place, float x)
{
    Segment & segment = m_Maker.GetSegment(piece);
    Typeset::Line const & line = m_Arena.m_Lines[piece.m_Line];
    SetFacts(segment, piece.m_IsLast ? 0xFFFFFFFF : line.m_TextEnd, x + line.m_X, place.m_Top);

    LayoutItem::Line item;
    item.m_FirstRun = m_Layout.GetRunCount();
    item.m_StoryOffset = segment.m_MainBegin + (segment.m_IsMain ? line.m_TextStart : 0);
    item.m_Flags = (piece.m_IsFirst ? LayoutItem::Line::ParagraphBegin : 0) |
                   (piece.m_IsLast ? LayoutItem::Line::ParagraphEnd : 0) |
                   (EndsInWord(segment, line) ? LayoutItem::Line::JoinsNext : 0);
    item.m_Left = x + line.m_X;
    item.m_Right = item.m_Left + line.m_SetWidth;
    item.m_Baseline = place.m_Baseline;
    item.m_Ascent = line.m_Ascent;
    item.m_Descent = line.m_Descent;
    m_Layout.BeginLine(item);

    LineContext context;
    context.m_X = x;
    context.m_Baseline = place.m_Baseline;
    context.m_Top = place.m_Baseline - piece.m_HeadAbove;
    context.m_Bottom = place.m_Baseline + piece.m_FootBelow;
    context.m_StoryOffset = item.m_StoryOffset;
    if (piece.m_IsFirst && segment.m_MarkerLine != None) {
        SetMarker(segment, x, place.m_Baseline, context.m_Top, context.m_Bottom);
    }
    for (Typeset::GlyphRun const & run : m_Arena.RunsOf(line)) {
        SetRun(segment, run, context);
    }
    FlushLink(context);
}

void FlowSetter::SetMarker(Segment const & segment, float x, float baseline, float top, float bottom)
{
    Typeset::Line const & line = m_Arena.m_Lines[segment.m_MarkerLine];
    bool const isNote = segment.m_Note != None;
    for (Typeset::GlyphRun const & run : m_Arena.RunsOf(line)) {
        auto const text =
            std::u16string_view(segment.m_MarkerText).substr(run.m_TextStart, run.m_TextEnd - run.m_TextStart);
        m_Layout.AddRun(m_Arena, run, text, run.m_TextStart, x + segment.m_MarkerX + run.m_X, baseline,
                        {segment.m_MarkerStyle->m_Colour,
                         isNote ? LayoutItem::Role::NoteNumber : LayoutItem::Role::ListMarker});
    }
    if (isNote && !m_IsRepeat) {
        LayoutItem::Link link{x + segment.m_MarkerX, top, x + segment.m_MarkerX + segment.m_MarkerWidth, bottom};
        link.m_Note = segment.m_Note;
        link.m_LeadsBack = 1;
        m_Layout.AddLink(link);
    }
}

void FlowSetter::SetRun(Segment const & segment, Typeset::GlyphRun const & run, LineContext & context)
{
    RunStyle const & style = m_Maker.GetRunStyle(segment, run.m_Style);
    LineObject const * object =
        run.m_Object == Typeset::GlyphRun::NoObject ? nullptr : &m_Maker.GetObject(segment, run.m_Object);
    float const left = context.m_X + run.m_X;
    float const right = left + run.m_Width;
    if (style.m_Background) {
        m_Layout.AddBox({left, context.m_Top, right, context.m_Bottom, *style.m_Background,
                         LayoutItem::Box::Kind::Background, 0});
    }
    std::uint32_t note = None;
    if (object && object->m_Kind == LineObject::Kind::Note) {
        note = object->m_Note;
        if (!m_IsRepeat) {
            m_Layout.Notes()[note].m_Reference = PlaceAt(left, context.m_Top);
        }
    }
    SetLinkPart(context, style.m_Hyperlink, note, left, right);
    if (run.m_IsBox) {
        if (object && object->m_Picture) {
            auto const box = Kernel::RectT<float>{left, context.m_Baseline - object->m_Height, right,
                                                  context.m_Baseline};
            SetPictureItem(*object->m_Picture, context.m_StoryOffset, box);
        }
        return;
    }
    LayoutBuilder::RunLook const look{style.m_Colour, note != None ? LayoutItem::Role::NoteReference
                                                                   : segment.m_Role};
    if (object) {
        // Its text may need several fonts; the first run speaks for all.
        bool const isFirst = context.m_LastObject != run.m_Object;
        context.m_LastObject = run.m_Object;
        m_Layout.AddRun(m_Arena, run, isFirst ? std::u16string_view(object->m_Text) : std::u16string_view(), None,
                        left, context.m_Baseline, look);
    } else {
        auto const text = segment.m_Story->GetText().substr(segment.m_Begin + run.m_TextStart,
                                                            run.m_TextEnd - run.m_TextStart);
        m_Layout.AddRun(m_Arena, run, text, run.m_TextStart, left, context.m_Baseline, look);
    }
    if (style.m_Underline || style.m_Strike) {
        auto const & metrics = m_Arena.m_Faces[run.m_Face]->GetMetrics();
        float const unit = run.m_Size / static_cast<float>(metrics.m_UnitsPerEm);
        auto const addStroke = [&](int position, int thickness, LayoutItem::Box::Kind kind) {
            float const half = std::max(static_cast<float>(thickness) * unit, 0.2F) / 2;
            float const middle = context.m_Baseline - static_cast<float>(position) * unit;
            m_Layout.AddBox({left, middle - half, right, middle + half, style.m_Colour, kind, 0});
        };
        if (style.m_Underline) {
            addStroke(metrics.m_UnderlinePosition, metrics.m_UnderlineThickness, LayoutItem::Box::Kind::Underline);
        }
        if (style.m_Strike) {
            addStroke(metrics.m_StrikePosition, metrics.m_StrikeThickness, LayoutItem::Box::Kind::Strike);
        }
    }
}

void FlowSetter::SetLinkPart(LineContext & context, std::uint32_t hyperlink, std::uint32_t note, float left,
                             float right)
{
    if (m_IsRepeat && note != None) {
        note = None;
    }
    if (note != None) {
        hyperlink = None;
    }
    if (context.m_Link.m_Hyperlink != hyperlink || context.m_Link.m_Note != note) {
        FlushLink(context);
        context.m_Link = {left, context.m_Top, right, context.m_Bottom, hyperlink, note, 0};
    }
    context.m_Link.m_Left = std::min(context.m_Link.m_Left, left);
    context.m_Link.m_Right = std::max(context.m_Link.m_Right, right);
}

void FlowSetter::FlushLink(LineContext & context)
{
    if (context.m_Link.m_Hyperlink != None || context.m_Link.m_Note != None) {
        m_Layout.AddLink(context.m_Link);
    }
    context.m_Link = {};
}

void FlowSetter::SetPictureItem(PictureGlyph const & picture, std::uint32_t storyOffset,
                                Kernel::RectT<float> const & box)
{
    auto const & fields = picture.GetFields();
    if (fields.m_IsMissing) {
        m_Layout.AddBox({box.left, box.top, box.right, box.bottom, 0, LayoutItem::Box::Kind::MissingPicture,
                         MissingStroke});
        auto const text = fields.m_MissingReason.Empty() ? fields.m_Path : fields.m_MissingReason;
        m_Layout.AddProblem(LayoutItem::Problem::Kind::PictureMissing, storyOffset, text);
    } else {
        m_Layout.AddPicture({box.left, box.top, box.right, box.bottom, m_Layout.AddString(fields.m_DataId),
                             m_Layout.AddString(fields.m_AltText), storyOffset});
    }
}

void FlowSetter::SetPicture(Piece const & piece, Placement const & place, float x)
{
    float const left = x + piece.m_Left;
    SetPictureItem(*piece.m_Picture, m_Maker.GetSegment(piece).m_MainBegin,
                   {left, place.m_Top, left + piece.m_Width, place.m_Bottom});
    if (!piece.m_Row) {
        return;
    }
    Stack stack;
    stack.m_Y = place.m_Top + MissingInset;
    for (Piece const & inner : piece.m_Row->m_Cells[0].m_Pieces) {
        Placement const where = stack.Place(inner, nullptr);
        if (where.m_InkBottom > place.m_Bottom) {
            break;
        }
        SetPiece(inner, where, left + MissingInset);
        stack.Advance(inner, nullptr, where);
    }
}

void FlowSetter::SetRow(Row & row, float y, float x)
{
    Table const & table = *row.m_Table;
    for (std::size_t c = 0; c < row.m_Cells.size(); ++c) {
        Row::Cell & cell = row.m_Cells[c];
        std::size_t const begin = m_IsRepeat ? 0 : cell.m_Next;
        std::size_t const end = m_IsRepeat ? cell.m_Pieces.size() : std::min(cell.m_End, cell.m_Pieces.size());
        Stack stack;
        stack.m_Y = y + table.m_PaddingY;
        for (std::size_t i = begin; i < end; ++i) {
            auto const * decoration = m_Maker.GetSegment(cell.m_Pieces[i]).m_Decoration;
            Placement const where = stack.Place(cell.m_Pieces[i], decoration);
            SetPiece(cell.m_Pieces[i], where, x + table.m_Columns[c].m_Left + table.m_PaddingX);
            stack.Advance(cell.m_Pieces[i], decoration, where);
        }
        if (!m_IsRepeat) {
            cell.m_Next = std::max(begin, end);
        }
    }
}

void FlowSetter::SetHeaderAgain(Table const & table)
{
    m_IsRepeat = true;
    float y = 0;
    for (Row * row : table.m_Header) {
        SetRow(*row, y, 0);
        y += row->m_Height;
    }
    m_IsRepeat = false;
    SetTableRule(table, 0, true);
    SetTableRule(table, y, false);
}

void FlowSetter::SetTableRule(Table const & table, float y, bool isHeavy)
{
    float const half = (isHeavy ? HeavyRule : LightRule) / 2;
    m_Layout.AddBox({table.m_Left, y - half, table.m_Right, y + half, table.m_RuleColour,
                     LayoutItem::Box::Kind::TableRule, 0});
}

}
