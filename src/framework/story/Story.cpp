#include "framework/story/Story.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Utf.h"
#include "framework/story/Delta.h"
#include "framework/story/GlyphCloneContext.h"

#include <algorithm>
#include <map>

namespace Story
{

namespace
{

bool SameAtts(Kernel::Counted<GlyphAtts const> const & a, Kernel::Counted<GlyphAtts const> const & b)
{
    return a == b || (a && b && a->IsEqual(*b));
}

/// Appends a run, or extends the last one if it has the same attributes.
void PushRun(std::vector<Story::GlyphRun> & runs, std::size_t end, Kernel::Counted<GlyphAtts const> const & atts)
{
    if (!runs.empty() && SameAtts(runs.back().m_Atts, atts)) {
        runs.back().m_End = static_cast<std::uint32_t>(end);
    } else {
        runs.push_back({static_cast<std::uint32_t>(end), atts});
    }
}

}

StoryPos Story::gend(bool beforeLastEnd) const
{
    bool const hasEnd = !m_Text.empty() && m_Text.back() == ParagraphEnd;
    return {*this, m_Text.size() - (beforeLastEnd && hasEnd ? 1 : 0)};
}

std::size_t Story::GetParagraphIndex(std::size_t offset) const
{
    KORVANE_ASSERT(offset <= m_Text.size() && !m_Paragraphs.empty());
    auto const place = std::upper_bound(m_Paragraphs.begin(), m_Paragraphs.end(), offset,
                                        [](std::size_t o, Paragraph const & paragraph) { return o < paragraph.m_End; });
    return std::min<std::size_t>(static_cast<std::size_t>(place - m_Paragraphs.begin()), m_Paragraphs.size() - 1);
}

std::size_t Story::GetRunIndex(std::size_t offset) const
{
    KORVANE_ASSERT(offset < m_Text.size());
    auto const place = std::upper_bound(m_Runs.begin(), m_Runs.end(), offset,
                                        [](std::size_t o, GlyphRun const & run) { return o < run.m_End; });
    return static_cast<std::size_t>(place - m_Runs.begin());
}

std::size_t Story::GetObjectIndex(std::size_t offset) const
{
    auto const place = std::lower_bound(m_Objects.begin(), m_Objects.end(), offset,
                                        [](Object const & object, std::size_t o) { return object.m_Offset < o; });
    return static_cast<std::size_t>(place - m_Objects.begin());
}

Kernel::Counted<Glyph const> Story::GetGlyph(std::size_t offset) const
{
    std::size_t const index = GetObjectIndex(offset);
    return index < m_Objects.size() && m_Objects[index].m_Offset == offset ? m_Objects[index].m_Glyph : nullptr;
}

String Story::GetString(std::size_t begin, std::size_t end) const
{
    KORVANE_ASSERT(begin <= end && end <= m_Text.size());
    std::u16string text = m_Text.substr(begin, end - begin);
    std::erase(text, ObjectCharacter);
    return Kernel::Utf16ToUtf8(text);
}

void Story::AppendRange(Story const & source, std::size_t begin, std::size_t end, GlyphCloneContext * context)
{
    KORVANE_ASSERT(&source != this && begin <= end && end <= source.GetLength());
    if (begin == end) {
        return;
    }
    std::size_t const base = m_Text.size();
    m_Text.append(source.m_Text, begin, end - begin);

    for (std::size_t i = source.GetRunIndex(begin); i < source.m_Runs.size(); ++i) {
        auto const & run = source.m_Runs[i];
        PushRun(m_Runs, base + std::min<std::size_t>(run.m_End, end) - begin, run.m_Atts);
        if (run.m_End >= end) {
            break;
        }
    }

    // A paragraph that was left open goes on in the first one here. Its attributes are those of whichever part has the
    // end unit; with none in sight they stay.
    bool const wasOpen = base > 0 && m_Text[base - 1] != ParagraphEnd;
    Kernel::Counted<ParagraphAtts const> openAtts;
    if (wasOpen) {
        openAtts = m_Paragraphs.back().m_Atts;
        m_Paragraphs.pop_back();
    }
    for (std::size_t i = source.GetParagraphIndex(begin); i < source.m_Paragraphs.size(); ++i) {
        auto const & paragraph = source.m_Paragraphs[i];
        std::size_t const pieceEnd = std::min<std::size_t>(paragraph.m_End, end);
        bool const keepsOpen = wasOpen && pieceEnd == end && source.m_Text[pieceEnd - 1] != ParagraphEnd &&
                               source.GetParagraphBegin(i) <= begin;
        m_Paragraphs.push_back(
            {static_cast<std::uint32_t>(base + pieceEnd - begin), keepsOpen ? openAtts : paragraph.m_Atts});
        if (pieceEnd == end) {
            break;
        }
    }

    for (std::size_t i = source.GetObjectIndex(begin); i < source.m_Objects.size(); ++i) {
        auto const & object = source.m_Objects[i];
        if (object.m_Offset >= end) {
            break;
        }
        Kernel::Counted<Glyph const> glyph = object.m_Glyph;
        if (context) {
            glyph = glyph->Clone(*context);
        }
        m_Objects.push_back({static_cast<std::uint32_t>(base + object.m_Offset - begin), std::move(glyph)});
    }
}

void Story::AppendText(StoryRange const & range, GlyphCloneContext & context)
{
    KORVANE_ASSERT(range.m_Begin.GetStory() == range.m_End.GetStory());
    if (range.m_Begin.IsNull()) {
        return;
    }
    Story const & source = *range.m_Begin.GetStory();
    if (&source == this) {
        auto const copy = Clone();
        AppendRange(*copy, range.m_Begin.GetOffset(), range.m_End.GetOffset(), &context);
    } else {
        AppendRange(source, range.m_Begin.GetOffset(), range.m_End.GetOffset(), &context);
    }
}

void Story::AppendText(GlyphString const & text, Kernel::Counted<GlyphAtts const> const & glyphAtts,
                       Kernel::Counted<ParagraphAtts const> const & paragraphAtts)
{
    if (text.Empty()) {
        return;
    }
    std::size_t const base = m_Text.size();
    if (base > 0 && m_Text[base - 1] != ParagraphEnd) {
        m_Paragraphs.pop_back();
    }
    m_Text += text.GetText();
    PushRun(m_Runs, m_Text.size(), glyphAtts);
    for (std::size_t i = base; i < m_Text.size(); ++i) {
        if (m_Text[i] == ParagraphEnd || i + 1 == m_Text.size()) {
            m_Paragraphs.push_back({static_cast<std::uint32_t>(i + 1), paragraphAtts});
        }
    }
    for (GlyphString::Object const & object : text.GetObjects()) {
        m_Objects.push_back({static_cast<std::uint32_t>(base + object.m_Offset), object.m_Glyph});
    }
}

void Story::ReplaceText(std::size_t begin, std::size_t end, Story const & text, GlyphCloneContext & context)
{
    KORVANE_ASSERT(begin <= end && end <= m_Text.size());
    Story result;
    result.AppendRange(*this, 0, begin, nullptr);
    result.AppendRange(text, 0, text.GetLength(), &context);
    result.AppendRange(*this, end, m_Text.size(), nullptr);
    SwapContent(result);
}

void Story::ReplaceGlyph(std::size_t offset, Kernel::Counted<Glyph const> glyph)
{
    std::size_t const index = GetObjectIndex(offset);
    KORVANE_ASSERT(glyph && index < m_Objects.size() && m_Objects[index].m_Offset == offset);
    m_Objects[index].m_Glyph = std::move(glyph);
}

void Story::FormatText(Kernel::Counted<Delta const> const & delta)
{
    FormatText(delta, 0, m_Text.size());
}

void Story::FormatText(Kernel::Counted<Delta const> const & delta, std::size_t begin, std::size_t end)
{
    KORVANE_ASSERT(delta && begin <= end && end <= m_Text.size());
    if (m_Text.empty()) {
        return;
    }
    // Shared attribute objects stay shared: each is changed once.
    if (delta->TouchesGlyphs() && begin < end) {
        std::map<GlyphAtts const *, Kernel::Counted<GlyphAtts const>> changed;
        std::vector<GlyphRun> runs;
        runs.reserve(m_Runs.size() + 2);
        std::size_t runBegin = 0;
        for (GlyphRun const & run : m_Runs) {
            std::size_t const from = std::clamp<std::size_t>(begin, runBegin, run.m_End);
            std::size_t const to = std::clamp<std::size_t>(end, runBegin, run.m_End);
            if (runBegin < from) {
                PushRun(runs, from, run.m_Atts);
            }
            if (from < to) {
                auto & atts = changed[run.m_Atts.Get()];
                if (!atts) {
                    atts = delta->Apply(run.m_Atts);
                }
                PushRun(runs, to, atts);
            }
            if (to < run.m_End && from < run.m_End) {
                PushRun(runs, run.m_End, run.m_Atts);
            }
            runBegin = run.m_End;
        }
        m_Runs = std::move(runs);
    }
    if (delta->TouchesParagraphs()) {
        std::map<ParagraphAtts const *, Kernel::Counted<ParagraphAtts const>> changed;
        std::size_t const last = GetParagraphIndex(end > begin ? end - 1 : begin);
        for (std::size_t i = GetParagraphIndex(begin); i <= last; ++i) {
            auto & atts = changed[m_Paragraphs[i].m_Atts.Get()];
            if (!atts) {
                atts = delta->Apply(m_Paragraphs[i].m_Atts);
            }
            m_Paragraphs[i].m_Atts = atts;
        }
    }
}

Kernel::Counted<Story> Story::Clone() const
{
    auto copy = Kernel::MakeCounted<Story>();
    copy->m_Text = m_Text;
    copy->m_Runs = m_Runs;
    copy->m_Paragraphs = m_Paragraphs;
    copy->m_Objects = m_Objects;
    return copy;
}

void Story::SwapContent(Story & other)
{
    m_Text.swap(other.m_Text);
    m_Runs.swap(other.m_Runs);
    m_Paragraphs.swap(other.m_Paragraphs);
    m_Objects.swap(other.m_Objects);
}

}
