#include "framework/typeset/BreakFinder.h"

#include <unicode/uchar.h>

namespace Typeset
{

namespace
{

/// The pair rules, with what little they must know besides the pair. Where the standard leaves a choice, the choices
/// are ICU's: numbers keep together as whole expressions, a hyphen that starts a word stays with it.
class PairRules
{
public:
    PairRules(std::u16string_view text, CharacterTable & characters) : m_Text(text), m_Characters(characters) {}

    void Find(std::vector<BreakPlace> & places);

private:
    static constexpr std::uint8_t Start = 0xFF;

    enum class Number : std::uint8_t
    {
        None,
        Inside, ///< After a digit, with separators that may follow.
        Closed  ///< After a closing bracket behind that.
    };

    [[nodiscard]] bool MayBreak(std::size_t at, std::uint8_t after) const;
    [[nodiscard]] bool MayBreakSideBySide(std::size_t at, std::uint8_t after) const;
    void Advance(std::uint8_t after);
    /// A number stands here, perhaps with its point or comma first.
    [[nodiscard]] bool StartsNumber(std::size_t at) const
    {
        bool separator = false;
        for (; at < m_Text.size(); ++at) {
            std::uint8_t const found = m_Characters.Get(m_Text[at]).m_LineClass;
            if (found == U_LB_INFIX_NUMERIC && !separator) {
                separator = true;
            } else if (found != U_LB_COMBINING_MARK) {
                return found == U_LB_NUMERIC;
            }
        }
        return false;
    }

    std::u16string_view m_Text;
    CharacterTable & m_Characters;
    std::uint8_t m_Before = Start; ///< Class of the last character that is no space; marks count as what they are on.
    bool m_Spaces = false;         ///< Spaces have come since.
    bool m_StartsWord = false;     ///< The last character is a hyphen that nothing stands before.
    Number m_Number = Number::None;
};

bool PairRules::MayBreak(std::size_t at, std::uint8_t after) const
{
    if ((m_Before == Start && !m_Spaces) || after == U_LB_ZWSPACE) { // LB2, LB7
        return false;
    }
    if (m_Before == U_LB_ZWSPACE) { // LB8
        return true;
    }
    if (after == U_LB_WORD_JOINER || (m_Before == U_LB_WORD_JOINER && !m_Spaces)) { // LB11
        return false;
    }
    if (!m_Spaces && (m_Before == U_LB_GLUE || (after == U_LB_GLUE && m_Before != U_LB_BREAK_AFTER &&
                                                m_Before != U_LB_HYPHEN))) { // LB12, LB12a
        return false;
    }
    switch (after) { // LB13
    case U_LB_CLOSE_PUNCTUATION:
    case U_LB_CLOSE_PARENTHESIS:
    case U_LB_EXCLAMATION:
    case U_LB_BREAK_SYMBOLS:
        return false;
    case U_LB_INFIX_NUMERIC:
        return m_Spaces && m_Before != U_LB_OPEN_PUNCTUATION && StartsNumber(at); // A number like ".5".
    default:
        break;
    }
    if (m_Before == U_LB_OPEN_PUNCTUATION ||                                        // LB14
        (m_Before == U_LB_QUOTATION && after == U_LB_OPEN_PUNCTUATION) ||           // LB15
        (m_Before == U_LB_BREAK_BOTH && after == U_LB_BREAK_BOTH)) {                // LB17
        return false;
    }
    return m_Spaces || MayBreakSideBySide(at, after); // LB18
}

bool PairRules::MayBreakSideBySide(std::size_t at, std::uint8_t after) const
{
    if (m_Before == U_LB_QUOTATION || after == U_LB_QUOTATION) { // LB19
        return false;
    }
    if (m_Before == U_LB_CONTINGENT_BREAK || after == U_LB_CONTINGENT_BREAK) { // LB20
        return true;
    }
    if (after == U_LB_BREAK_AFTER || after == U_LB_HYPHEN || m_Before == U_LB_BREAK_BEFORE || // LB21
        after == U_LB_INSEPARABLE) {                                                          // LB22
        return false;
    }
    bool const letterAfter = after == U_LB_ALPHABETIC;
    bool const numberAfter = after == U_LB_NUMERIC;
    bool const signAfter = after == U_LB_PREFIX_NUMERIC || after == U_LB_POSTFIX_NUMERIC;
    switch (m_Before) {
    case U_LB_ALPHABETIC: // LB23, LB24, LB28, LB30
    case U_LB_NUMERIC:    // LB23, LB25, LB30
        return !(letterAfter || numberAfter || signAfter || after == U_LB_OPEN_PUNCTUATION);
    case U_LB_PREFIX_NUMERIC: // LB24, LB25
    case U_LB_POSTFIX_NUMERIC:
        return !(letterAfter || numberAfter ||
                 (after == U_LB_OPEN_PUNCTUATION && StartsNumber(at + 1)));
    case U_LB_CLOSE_PARENTHESIS: // LB25, LB30
        return !(letterAfter || numberAfter || (signAfter && m_Number == Number::Closed));
    case U_LB_CLOSE_PUNCTUATION: // LB25
        return !(signAfter && m_Number == Number::Closed);
    case U_LB_INFIX_NUMERIC: // LB25, LB29
        return !(letterAfter || numberAfter || (signAfter && m_Number == Number::Inside));
    case U_LB_BREAK_SYMBOLS: // LB25
        return !((numberAfter || signAfter) && m_Number == Number::Inside);
    case U_LB_HYPHEN:
        return !(numberAfter || (letterAfter && m_StartsWord)); // LB25
    default:
        return !(m_StartsWord && letterAfter); // LB31
    }
}

void PairRules::Advance(std::uint8_t after)
{
    bool const isSeparator = after == U_LB_INFIX_NUMERIC || after == U_LB_BREAK_SYMBOLS;
    bool const isClosing = after == U_LB_CLOSE_PUNCTUATION || after == U_LB_CLOSE_PARENTHESIS;
    if (after == U_LB_NUMERIC) {
        m_Number = Number::Inside;
    } else if (m_Spaces || m_Number != Number::Inside || !(isSeparator || isClosing)) {
        m_Number = Number::None;
    } else if (isClosing) {
        m_Number = Number::Closed;
    }
    m_StartsWord = after == U_LB_HYPHEN && ((m_Spaces && m_Before != U_LB_OPEN_PUNCTUATION) || m_Before == Start ||
                                            m_Before == U_LB_ZWSPACE || m_Before == U_LB_CONTINGENT_BREAK);
    m_Before = after;
    m_Spaces = false;
}

void PairRules::Find(std::vector<BreakPlace> & places)
{
    std::size_t const length = m_Text.size();
    for (std::size_t i = 0; i < length; ++i) {
        std::uint8_t after = m_Characters.Get(m_Text[i]).m_LineClass;
        if (after == U_LB_ALPHABETIC && m_Before == U_LB_ALPHABETIC && !m_Spaces) { // LB28, which is most of any text.
            continue;
        }
        if (m_Text[i] == u'\u2028') {
            if (i + 1 < length) {
                places.push_back({static_cast<std::uint32_t>(i + 1), BreakPlace::Kind::Mandatory});
            }
            m_Before = Start;
            m_Spaces = false;
            m_Number = Number::None;
            continue;
        }
        if (after == U_LB_SPACE) { // LB7
            m_Spaces = true;
            continue;
        }
        if (after == U_LB_COMBINING_MARK) { // LB9, LB10
            if (m_Before != Start && m_Before != U_LB_ZWSPACE && !m_Spaces) {
                continue;
            }
            after = U_LB_ALPHABETIC;
        }
        if (MayBreak(i, after) && i > 0) {
            places.push_back({static_cast<std::uint32_t>(i), BreakPlace::Kind::Allowed});
        }
        Advance(after);
    }
}

}

void BreakFinder::FindByRules(std::u16string_view text, CharacterTable & characters, std::vector<BreakPlace> & places)
{
    PairRules(text, characters).Find(places);
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
