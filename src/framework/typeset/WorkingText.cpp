#include "framework/typeset/WorkingText.h"

#include <unicode/casemap.h>
#include <unicode/edits.h>
#include <unicode/uchar.h>
#include <unicode/utf16.h>

#include <algorithm>

namespace Typeset
{

namespace
{

bool IsLineEnd(char16_t unit)
{
    return (unit >= 0x0A && unit <= 0x0D) || unit == 0x85 || unit == 0x2028 || unit == 0x2029;
}

}

void WorkingText::Prepare(ParagraphInput const & input, std::vector<ResolvedStyle *> const & styles,
                          ShapeCache & cache)
{
    m_Runs.clear();
    m_SoftHyphens.clear();
    m_Ties.clear();
    m_Copy.clear();
    m_Map.clear();

    CharacterTable & characters = cache.GetCharacters();
    m_Flags = 0;
    for (char16_t const unit : input.m_Text) {
        m_Flags |= characters.Get(unit).m_Flags;
    }
    bool changesCase = false;
    for (ResolvedStyle const * style : styles) {
        changesCase |= style && (style->ScalesCapitals() || style->GetStyle().m_Capitals == Capitals::AllCaps);
    }
    bool const isPlain = !(m_Flags & (CharacterInfo::Special | CharacterInfo::Surrogate)) && !changesCase;
    if (!isPlain) {
        Copy(input, styles, cache);
        return;
    }
    m_Text = input.m_Text;
    for (StyleRun const & run : input.m_Runs) {
        AppendRun({static_cast<std::uint32_t>(std::min<std::size_t>(run.m_End, m_Text.size())), run.m_Style});
    }
    std::uint32_t const lastStyle = input.m_Runs.empty() ? 0 : input.m_Runs.back().m_Style;
    AppendRun({static_cast<std::uint32_t>(m_Text.size()), lastStyle});
    if (m_Runs.empty()) {
        m_Runs.push_back({0, lastStyle});
    }
}

void WorkingText::AppendRun(WorkRun run)
{
    std::uint32_t const start = m_Runs.empty() ? 0 : m_Runs.back().m_End;
    if (run.m_End <= start) {
        return;
    }
    if (!m_Runs.empty()) {
        WorkRun & last = m_Runs.back();
        if (last.m_Style == run.m_Style && last.m_Object == run.m_Object &&
            last.m_ScaledCapitals == run.m_ScaledCapitals) {
            last.m_End = run.m_End;
            return;
        }
    }
    m_Runs.push_back(run);
}

void WorkingText::Copy(ParagraphInput const & input, std::vector<ResolvedStyle *> const & styles, ShapeCache & cache)
{
    std::u16string_view const text = input.m_Text;
    m_Copy.reserve(text.size());
    m_Map.reserve(text.size() + 1);
    auto object = input.m_Objects.begin();
    std::size_t start = 0;
    std::size_t runIndex = 0;
    while (start < text.size()) {
        while (runIndex < input.m_Runs.size() && input.m_Runs[runIndex].m_End <= start) {
            ++runIndex;
        }
        bool const isLast = runIndex >= input.m_Runs.size();
        std::size_t const end = isLast ? text.size() : std::min<std::size_t>(input.m_Runs[runIndex].m_End, text.size());
        std::uint32_t style = 0;
        if (!input.m_Runs.empty()) {
            style = isLast ? input.m_Runs.back().m_Style : input.m_Runs[runIndex].m_Style;
        }
        ResolvedStyle const & resolved = *styles[style];
        WorkRun run{0, style};

        // Up to the next object of the run, then the object.
        std::size_t stretchStart = start;
        while (stretchStart < end) {
            while (object != input.m_Objects.end() && object->m_Position < stretchStart) {
                ++object;
            }
            std::size_t stretchEnd = end;
            bool const hasObject = object != input.m_Objects.end() && object->m_Position < end;
            if (hasObject) {
                stretchEnd = object->m_Position;
            }
            CopyStretch(input, stretchStart, stretchEnd, resolved.GetStyle(), resolved.ScalesCapitals(), run, cache);
            stretchStart = stretchEnd;
            if (hasObject && text[stretchEnd] == u'\uFFFC') {
                if (object->m_Attached) {
                    m_Ties.push_back(static_cast<std::uint32_t>(m_Copy.size()));
                }
                WorkRun objectRun{0, style, static_cast<std::uint32_t>(object - input.m_Objects.begin())};
                if (object->m_Text.empty()) {
                    m_Copy.push_back(u'\uFFFC');
                } else {
                    for (char16_t const unit : object->m_Text) {
                        CharacterInfo const & info = cache.GetCharacters().Get(unit);
                        m_Flags |= info.m_Flags;
                        bool const isSet = !(info.m_Flags & CharacterInfo::Special) || U16_IS_SURROGATE(unit);
                        m_Copy.push_back(isSet && unit != u'\t' ? unit : u' ');
                    }
                }
                m_Map.resize(m_Copy.size(), static_cast<std::uint32_t>(stretchEnd));
                objectRun.m_End = static_cast<std::uint32_t>(m_Copy.size());
                AppendRun(objectRun);
                ++stretchStart;
            }
            if (hasObject) {
                ++object;
            }
        }
        start = end;
    }
    if (m_Runs.empty()) {
        m_Runs.push_back({0, input.m_Runs.empty() ? 0 : input.m_Runs.back().m_Style});
    }
    m_Map.push_back(static_cast<std::uint32_t>(text.size()));

    // Pairs may be broken by the text itself, by runs or by objects: what stands alone is replaced.
    std::size_t const length = m_Copy.size();
    for (std::size_t i = 0; i < length; ++i) {
        if (U16_IS_SURROGATE(m_Copy[i])) {
            if (U16_IS_LEAD(m_Copy[i]) && i + 1 < length && U16_IS_TRAIL(m_Copy[i + 1])) {
                m_Flags |= cache.GetCharacters().Get(
                    static_cast<char32_t>(U16_GET_SUPPLEMENTARY(m_Copy[i], m_Copy[i + 1]))).m_Flags;
                ++i;
            } else {
                m_Copy[i] = u'\uFFFD';
            }
        }
    }
    m_Text = m_Copy;
}

void WorkingText::CopyStretch(ParagraphInput const & input, std::size_t start, std::size_t end,
                              TextStyle const & style, bool scalesCapitals, WorkRun run, ShapeCache & cache)
{
    std::u16string_view const text = input.m_Text;
    CharacterTable & characters = cache.GetCharacters();
    std::size_t segment = m_Copy.size();
    bool small = false;
    auto const closeSegment = [&] {
        if (style.m_Capitals == Capitals::AllCaps || small) {
            UpperCase(segment, style.m_Language);
        }
        run.m_End = static_cast<std::uint32_t>(m_Copy.size());
        run.m_ScaledCapitals = small;
        AppendRun(run);
        segment = m_Copy.size();
    };
    for (std::size_t i = start; i < end; ++i) {
        char16_t unit = text[i];
        if (characters.Get(unit).m_Flags & CharacterInfo::Special) {
            if (unit == 0xAD) {
                m_SoftHyphens.push_back(static_cast<std::uint32_t>(m_Copy.size()));
                continue;
            }
            if (IsLineEnd(unit)) {
                if (unit == u'\n' && i > 0 && text[i - 1] == u'\r') {
                    continue;
                }
                unit = LineSeparator;
            } else if (!U16_IS_SURROGATE(unit)) {
                continue;
            }
        }
        if (scalesCapitals && !U16_IS_SURROGATE(unit)) {
            bool const isSmall = style.m_Capitals == Capitals::AllSmallCaps
                                     ? u_isalnum(unit) != 0
                                     : u_isULowercase(unit) != 0 || (small && u_charType(unit) == U_NON_SPACING_MARK);
            if (isSmall != small) {
                closeSegment();
                small = isSmall;
            }
        }
        m_Copy.push_back(unit);
        m_Map.push_back(static_cast<std::uint32_t>(i));
    }
    closeSegment();
}

void WorkingText::UpperCase(std::size_t start, String const & language)
{
    std::size_t const length = m_Copy.size() - start;
    if (length == 0) {
        return;
    }
    std::u16string const source = m_Copy.substr(start);
    std::vector<std::uint32_t> const sourceMap(m_Map.begin() + static_cast<std::ptrdiff_t>(start), m_Map.end());
    std::u16string upper(length * 3 + 8, u'\0');
    icu::Edits edits;
    UErrorCode error = U_ZERO_ERROR;
    std::int32_t const count = icu::CaseMap::toUpper(language.c_str(), 0, source.data(),
                                                     static_cast<std::int32_t>(length), upper.data(),
                                                     static_cast<std::int32_t>(upper.size()), &edits, error);
    if (U_FAILURE(error)) {
        return;
    }
    m_Copy.replace(start, length, upper.data(), static_cast<std::size_t>(count));
    m_Map.resize(m_Copy.size());
    error = U_ZERO_ERROR;
    for (icu::Edits::Iterator edit = edits.getFineIterator(); edit.next(error);) {
        for (std::int32_t i = 0; i < edit.newLength(); ++i) {
            // What one letter becomes stands for that letter; what stays as long keeps its places.
            std::int32_t const at = std::min(i, std::max(edit.oldLength() - 1, 0)) + edit.sourceIndex();
            std::int32_t const index = edit.hasChange() && edit.oldLength() != edit.newLength() ? edit.sourceIndex() : at;
            m_Map[start + static_cast<std::size_t>(edit.destinationIndex() + i)] =
                sourceMap[static_cast<std::size_t>(index)];
        }
    }
}

}
