#include "framework/typeset/BreakFinder.h"

#include <unicode/uchar.h>

namespace Typeset
{

namespace
{

bool IsAlphabetic(std::uint8_t lineClass) { return lineClass == U_LB_ALPHABETIC; }

/// The rules of UAX #14 from LB19 on, for two classes that stand side by side without spaces.
bool MayBreakBetween(std::uint8_t before, std::uint8_t after)
{
    if (before == U_LB_QUOTATION || after == U_LB_QUOTATION) { // LB19
        return false;
    }
    if (before == U_LB_CONTINGENT_BREAK || after == U_LB_CONTINGENT_BREAK) { // LB20
        return true;
    }
    if (after == U_LB_BREAK_AFTER || after == U_LB_HYPHEN || before == U_LB_BREAK_BEFORE || // LB21
        after == U_LB_INSEPARABLE) {                                                        // LB22
        return false;
    }
    bool const numberBefore = before == U_LB_NUMERIC;
    bool const numberAfter = after == U_LB_NUMERIC;
    bool const prefixBefore = before == U_LB_PREFIX_NUMERIC || before == U_LB_POSTFIX_NUMERIC;
    bool const prefixAfter = after == U_LB_PREFIX_NUMERIC || after == U_LB_POSTFIX_NUMERIC;
    if (IsAlphabetic(before)) {
        // LB23, LB24, LB28, LB30
        return !(IsAlphabetic(after) || numberAfter || prefixAfter || after == U_LB_OPEN_PUNCTUATION);
    }
    if (numberBefore) {
        // LB23, LB25, LB30
        return !(IsAlphabetic(after) || numberAfter || prefixAfter || after == U_LB_OPEN_PUNCTUATION);
    }
    if (prefixBefore) {
        // LB24, LB25
        return !(IsAlphabetic(after) || numberAfter || after == U_LB_OPEN_PUNCTUATION);
    }
    switch (before) {
    case U_LB_CLOSE_PARENTHESIS:
        return !(IsAlphabetic(after) || numberAfter || prefixAfter); // LB25, LB30
    case U_LB_CLOSE_PUNCTUATION:
        return !prefixAfter; // LB25
    case U_LB_INFIX_NUMERIC:
        return !(IsAlphabetic(after) || numberAfter); // LB25, LB29
    case U_LB_HYPHEN:
    case U_LB_BREAK_SYMBOLS:
        return !numberAfter; // LB25
    default:
        return true; // LB31
    }
}

}

void BreakFinder::FindByRules(std::u16string_view text, CharacterTable & characters, std::vector<BreakPlace> & places)
{
    constexpr std::uint8_t start = 0xFF;
    std::uint8_t before = start; // Class of the last character that is no space; marks count as what they stand on.
    bool spaces = false;         // Spaces have come since.
    std::size_t const length = text.size();
    for (std::size_t i = 0; i < length; ++i) {
        std::uint8_t after = characters.Get(text[i]).m_LineClass;
        if (after == U_LB_ALPHABETIC && before == U_LB_ALPHABETIC && !spaces) { // LB28, which is most of any text.
            continue;
        }
        if (text[i] == u'\u2028') {
            if (i + 1 < length) {
                places.push_back({static_cast<std::uint32_t>(i + 1), BreakPlace::Kind::Mandatory});
            }
            before = start;
            spaces = false;
            continue;
        }
        if (after == U_LB_SPACE) { // LB7
            spaces = true;
            continue;
        }
        if (after == U_LB_COMBINING_MARK) { // LB9, LB10
            if (before != start && before != U_LB_ZWSPACE && !spaces) {
                continue;
            }
            after = U_LB_ALPHABETIC;
        }
        bool allowed = false;
        if (before == start && !spaces) {
            allowed = false; // LB2
        } else if (after == U_LB_ZWSPACE) { // LB7
            allowed = false;
        } else if (before == U_LB_ZWSPACE) { // LB8
            allowed = true;
        } else if (after == U_LB_WORD_JOINER || (before == U_LB_WORD_JOINER && !spaces)) { // LB11
            allowed = false;
        } else if (before == U_LB_GLUE && !spaces) { // LB12
            allowed = false;
        } else if (after == U_LB_GLUE && !spaces && before != U_LB_BREAK_AFTER && before != U_LB_HYPHEN) { // LB12a
            allowed = false;
        } else if (after == U_LB_CLOSE_PUNCTUATION || after == U_LB_CLOSE_PARENTHESIS || after == U_LB_EXCLAMATION ||
                   after == U_LB_INFIX_NUMERIC || after == U_LB_BREAK_SYMBOLS) { // LB13
            allowed = false;
        } else if (before == U_LB_OPEN_PUNCTUATION) { // LB14
            allowed = false;
        } else if (before == U_LB_QUOTATION && after == U_LB_OPEN_PUNCTUATION) { // LB15
            allowed = false;
        } else if (before == U_LB_BREAK_BOTH && after == U_LB_BREAK_BOTH) { // LB17
            allowed = false;
        } else {
            allowed = spaces || MayBreakBetween(before, after); // LB18 and on
        }
        if (allowed && i > 0) {
            places.push_back({static_cast<std::uint32_t>(i), BreakPlace::Kind::Allowed});
        }
        before = after;
        spaces = false;
    }
}

void BreakFinder::FindByIterator(std::u16string_view text, String const & language, ShapeCache & cache,
                                 std::vector<BreakPlace> & places)
{
    UBreakIterator * iterator = cache.GetLineIterator(language);
    if (!iterator) {
        return;
    }
    UErrorCode error = U_ZERO_ERROR;
    ubrk_setText(iterator, text.data(), static_cast<std::int32_t>(text.size()), &error);
    for (std::int32_t at = ubrk_first(iterator); at != UBRK_DONE; at = ubrk_next(iterator)) {
        if (at > 0 && static_cast<std::size_t>(at) < text.size()) {
            bool const isMandatory = text[static_cast<std::size_t>(at) - 1] == u'\u2028';
            places.push_back({static_cast<std::uint32_t>(at),
                              isMandatory ? BreakPlace::Kind::Mandatory : BreakPlace::Kind::Allowed});
        }
    }
}

void BreakFinder::Find(std::u16string_view text, unsigned flags, String const & language, ShapeCache & cache,
                       std::vector<BreakPlace> & places)
{
    if (flags & CharacterInfo::Complex) {
        FindByIterator(text, language, cache, places);
    } else {
        FindByRules(text, cache.GetCharacters(), places);
    }
}

bool IsWebAddress(std::u16string_view stretch)
{
    return stretch.find(u"://") != std::u16string_view::npos || stretch.starts_with(u"www.");
}

void FindAddressBreaks(std::u16string_view stretch, std::vector<std::uint32_t> & places)
{
    for (std::size_t i = 1; i + 1 < stretch.size(); ++i) {
        char16_t const before = stretch[i - 1];
        char16_t const after = stretch[i];
        bool const afterMark = (before == u'/' && after != u'/') || before == u'&' || before == u'=' || before == u'#';
        bool const beforeMark = after == u'.' || after == u'?';
        if ((afterMark || beforeMark) && i > 1 && before != u':') {
            places.push_back(static_cast<std::uint32_t>(i));
        }
    }
}

}
