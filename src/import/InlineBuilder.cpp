#include "import/InlineBuilder.h"

#include <algorithm>
#include <unicode/uchar.h>
#include <unicode/uscript.h>
#include <unicode/utf16.h>

namespace Import
{

namespace
{

/// Scripts that write without spaces between words: a line end of the source is no space there.
bool IsWithoutSpaces(UChar32 character)
{
    UErrorCode error = U_ZERO_ERROR;
    switch (uscript_getScript(character, &error)) {
    case USCRIPT_HAN:
    case USCRIPT_HIRAGANA:
    case USCRIPT_KATAKANA:
    case USCRIPT_BOPOMOFO:
        return true;
    default:
        return (0x3000 <= character && character <= 0x303F) || (0xFF00 <= character && character <= 0xFF65);
    }
}

UChar32 CharacterBefore(std::u16string const & text, std::size_t at)
{
    UChar32 character = 0;
    auto position = static_cast<std::int32_t>(at);
    U16_PREV(text.data(), 0, position, character);
    return character;
}

UChar32 CharacterAt(std::u16string const & text, std::size_t at)
{
    UChar32 character = 0;
    U16_NEXT(text.data(), at, text.size(), character);
    return character;
}

}

void InlineBuilder::StartRun(bool isVerbatim)
{
    Run const run{Position(), m_Marks, m_Link, isVerbatim};
    if (!m_Runs.empty()) {
        Run & last = m_Runs.back();
        if (last.m_Marks == run.m_Marks && last.m_Link == run.m_Link && last.m_IsVerbatim == run.m_IsVerbatim) {
            return;
        }
        if (last.m_Start == run.m_Start) {
            last = run;
            return;
        }
    }
    m_Runs.push_back(run);
}

void InlineBuilder::Append(std::u16string_view text, bool isVerbatim)
{
    if (!text.empty()) {
        StartRun(isVerbatim);
        m_Text += text;
    }
}

void InlineBuilder::Append(char16_t character)
{
    StartRun(false);
    m_Text += character;
}

void InlineBuilder::AddObject(ObjectKind kind, std::uint32_t index)
{
    m_Objects.push_back({Position(), kind, index});
    if (ObjectKind::NoteReference == kind || ObjectKind::Picture == kind) {
        Append(u'\uFFFC');
    }
}

void InlineBuilder::AddObjectAt(std::uint32_t position, ObjectKind kind, std::uint32_t index)
{
    auto const place =
        std::lower_bound(m_Objects.begin(), m_Objects.end(), position,
                         [](InlineObject const & object, std::uint32_t at) { return object.m_Position < at; });
    m_Objects.insert(place, {position, kind, index});
}

void InlineBuilder::StartLine(int line)
{
    m_Lines.emplace_back(Position(), line);
}

bool InlineBuilder::HasObjectsOf(ObjectKind kind) const
{
    return std::any_of(m_Objects.begin(), m_Objects.end(),
                       [kind](InlineObject const & object) { return kind == object.m_Kind; });
}

InlineBuilder::Run const * InlineBuilder::RunAt(std::size_t position) const
{
    auto const next = std::upper_bound(m_Runs.begin(), m_Runs.end(), position,
                                       [](std::size_t at, Run const & run) { return at < run.m_Start; });
    return next == m_Runs.begin() ? nullptr : &*(next - 1);
}

bool InlineBuilder::IsVerbatim(std::size_t position) const
{
    Run const * run = RunAt(position);
    return run && run->m_IsVerbatim;
}

std::vector<bool> InlineBuilder::VerbatimMask() const
{
    std::vector<bool> mask;
    if (std::none_of(m_Runs.begin(), m_Runs.end(), [](Run const & run) { return run.m_IsVerbatim; })) {
        return mask;
    }
    mask.resize(m_Text.size());
    for (std::size_t at = 0; at < m_Runs.size(); ++at) {
        std::size_t const end = at + 1 < m_Runs.size() ? m_Runs[at + 1].m_Start : m_Text.size();
        if (m_Runs[at].m_IsVerbatim) {
            std::fill(mask.begin() + m_Runs[at].m_Start, mask.begin() + static_cast<std::ptrdiff_t>(end), true);
        }
    }
    return mask;
}

int InlineBuilder::LineAt(std::size_t position) const
{
    int line = 0;
    for (auto const & [start, number] : m_Lines) {
        if (position < start) {
            break;
        }
        line = number;
    }
    return line;
}

void InlineBuilder::AddMarks(std::uint32_t start, std::uint32_t end, Mark marks)
{
    auto const split = [this](std::uint32_t at) {
        auto const next =
            std::upper_bound(m_Runs.begin(), m_Runs.end(), at,
                             [](std::uint32_t position, Run const & run) { return position < run.m_Start; });
        if (next != m_Runs.begin() && (next - 1)->m_Start < at && at < Position()) {
            Run run = *(next - 1);
            run.m_Start = at;
            m_Runs.insert(next, run);
        }
    };
    split(start);
    split(end);
    for (Run & run : m_Runs) {
        if (start <= run.m_Start && run.m_Start < end) {
            run.m_Marks = run.m_Marks | marks;
        }
    }
}

void InlineBuilder::Apply(std::vector<TextEdit> const & edits)
{
    if (edits.empty()) {
        return;
    }
    std::u16string text;
    text.reserve(m_Text.size() + edits.size());
    std::size_t run = 0;
    std::size_t object = 0;
    std::size_t line = 0;
    std::size_t from = 0;
    // Everything up to `end` moves by what has been written so far; what lies inside of an edit goes to its end.
    auto const move = [&](std::size_t start, std::size_t end, std::size_t base, bool isReplaced) {
        auto const moved = [&](std::uint32_t at) {
            return static_cast<std::uint32_t>(isReplaced && start < at ? text.size() : base + (at - start));
        };
        for (; run < m_Runs.size() && m_Runs[run].m_Start < end; ++run) {
            m_Runs[run].m_Start = moved(m_Runs[run].m_Start);
        }
        for (; object < m_Objects.size() && m_Objects[object].m_Position < end; ++object) {
            m_Objects[object].m_Position = moved(m_Objects[object].m_Position);
        }
        for (; line < m_Lines.size() && m_Lines[line].first < end; ++line) {
            m_Lines[line].first = moved(m_Lines[line].first);
        }
    };
    for (TextEdit const & edit : edits) {
        std::size_t base = text.size();
        text.append(m_Text, from, edit.m_Start - from);
        move(from, edit.m_Start, base, false);
        base = text.size();
        text += edit.m_Replacement;
        from = edit.m_Start + edit.m_Length;
        move(edit.m_Start, from, base, true);
    }
    std::size_t const base = text.size();
    text.append(m_Text, from);
    move(from, SIZE_MAX, base, false);
    m_Text = std::move(text);

    // Removed text leaves empty runs behind: the last of those that start together counts.
    std::vector<Run> runs;
    for (Run const & candidate : m_Runs) {
        if (!runs.empty() && runs.back().m_Start == candidate.m_Start) {
            runs.back() = candidate;
        } else if (candidate.m_Start < m_Text.size()) {
            runs.push_back(candidate);
        }
    }
    m_Runs = std::move(runs);
}

InlineText InlineBuilder::Finish()
{
    std::vector<TextEdit> edits;
    std::size_t first = 0;
    while (first < m_Text.size() && (u' ' == m_Text[first] || u'\n' == m_Text[first] || u'\t' == m_Text[first])) {
        ++first;
    }
    std::size_t last = m_Text.size();
    while (first < last && (u' ' == m_Text[last - 1] || u'\n' == m_Text[last - 1] || u'\t' == m_Text[last - 1])) {
        --last;
    }
    if (0 < first) {
        edits.push_back({0, static_cast<std::uint32_t>(first), {}});
    }
    for (std::size_t at = first; at < last; ++at) {
        if (u'\n' == m_Text[at]) {
            bool const vanishes =
                IsWithoutSpaces(CharacterBefore(m_Text, at)) && IsWithoutSpaces(CharacterAt(m_Text, at + 1));
            edits.push_back({static_cast<std::uint32_t>(at), 1, vanishes ? u"" : u" "});
        }
    }
    if (last < m_Text.size()) {
        edits.push_back({static_cast<std::uint32_t>(last), static_cast<std::uint32_t>(m_Text.size() - last), {}});
    }
    Apply(edits);

    InlineText result;
    result.m_Text = std::move(m_Text);
    result.m_Objects = std::move(m_Objects);
    auto const length = static_cast<std::uint32_t>(result.m_Text.size());
    for (InlineObject & object : result.m_Objects) {
        object.m_Position = std::min(object.m_Position, length);
    }
    for (std::size_t at = 0; at < m_Runs.size(); ++at) {
        std::uint32_t const end = at + 1 < m_Runs.size() ? m_Runs[at + 1].m_Start : length;
        Span const span{m_Runs[at].m_Start, end - m_Runs[at].m_Start, m_Runs[at].m_Marks, m_Runs[at].m_Link};
        if (!result.m_Spans.empty() && result.m_Spans.back().m_Marks == span.m_Marks &&
            result.m_Spans.back().m_Link == span.m_Link) {
            result.m_Spans.back().m_Length += span.m_Length;
        } else if (0 < span.m_Length) {
            result.m_Spans.push_back(span);
        }
    }
    *this = InlineBuilder();
    return result;
}

}
