#include "framework/story/StoryPos.h"

#include "framework/kernel/Assert.h"
#include "framework/story/Story.h"

#include <algorithm>

namespace Story
{

int StoryPos::Compare(StoryPos const & other) const
{
    KORVANE_ASSERT(m_Story == other.m_Story);
    return m_Offset < other.m_Offset ? -1 : m_Offset > other.m_Offset ? 1 : 0;
}

StoryPos & StoryPos::operator++()
{
    MoveBy(1);
    return *this;
}

void StoryPos::MoveBy(long count)
{
    KORVANE_ASSERT(m_Story);
    auto const target = static_cast<long>(m_Offset) + count;
    m_Offset = static_cast<std::size_t>(std::clamp(target, 0L, static_cast<long>(m_Story->GetLength())));
}

bool StoryPos::IsEnd() const
{
    return !m_Story || m_Offset >= m_Story->GetLength();
}

char16_t StoryPos::GetUnit() const
{
    return IsEnd() ? u'\0' : m_Story->GetText()[m_Offset];
}

Kernel::Counted<Glyph const> StoryPos::GetGlyph() const
{
    return IsEnd() ? nullptr : m_Story->GetGlyph(m_Offset);
}

Kernel::Counted<GlyphAtts const> StoryPos::GetGlyphAtts() const
{
    return IsEnd() ? nullptr : m_Story->GetGlyphRuns()[m_Story->GetRunIndex(m_Offset)].m_Atts;
}

Kernel::Counted<ParagraphAtts const> StoryPos::GetParagraphAtts() const
{
    return !m_Story || m_Story->Empty() ? nullptr : m_Story->GetParagraphs()[m_Story->GetParagraphIndex(m_Offset)].m_Atts;
}

bool StoryPos::IsParagraphBegin() const
{
    return m_Story && (m_Offset == 0 || m_Story->GetText()[m_Offset - 1] == ParagraphEnd);
}

StoryPos StoryPos::GetParagraphBegin() const
{
    if (!m_Story || m_Story->Empty()) {
        return *this;
    }
    return {*m_Story, m_Story->GetParagraphBegin(m_Story->GetParagraphIndex(m_Offset))};
}

StoryPos StoryPos::GetParagraphEnd(bool pastEndUnit) const
{
    if (!m_Story || m_Story->Empty()) {
        return *this;
    }
    std::size_t end = m_Story->GetParagraphs()[m_Story->GetParagraphIndex(m_Offset)].m_End;
    if (!pastEndUnit && end > 0 && m_Story->GetText()[end - 1] == ParagraphEnd) {
        --end;
    }
    // Behind the last end unit there is an empty place that belongs to the last paragraph.
    return {*m_Story, std::max(end, m_Offset)};
}

StoryPos StoryPos::GetParagraphEnd(StoryPos limit, bool pastEndUnit) const
{
    StoryPos const end = GetParagraphEnd(pastEndUnit);
    return end.GetOffset() > limit.GetOffset() ? limit : end;
}

}
