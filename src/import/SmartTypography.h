#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace Import
{

/// One change of a text: `m_Length` units from `m_Start` become `m_Replacement`.
struct TextEdit
{
    std::uint32_t m_Start = 0;
    std::uint32_t m_Length = 0;
    std::u16string m_Replacement;

    friend bool operator==(TextEdit const &, TextEdit const &) = default;
};

/// Turns typewriter characters into those of print, by the customs of a language: quotation marks and apostrophes,
/// "--" and "---", "...", hyphens in number ranges, and the spaces that French sets inside its punctuation.
class SmartTypography
{
public:
    /// `language` is a BCP 47 tag; one without known customs gets English quotation marks.
    explicit SmartTypography(std::string_view language);

    /// The edits for one paragraph, in order and without overlap. Where `verbatim` is set, nothing is changed (code);
    /// it is empty or as long as the text.
    [[nodiscard]] std::vector<TextEdit> FindEdits(std::u16string_view text, std::vector<bool> const & verbatim) const;

private:
    [[nodiscard]] std::u16string_view QuoteFor(std::u16string_view text, std::size_t at) const;

    std::u16string_view m_Open;
    std::u16string_view m_Close;
    std::u16string_view m_InnerOpen;
    std::u16string_view m_InnerClose;
    bool m_CapitalisesNouns = false;
    bool m_IsFrench = false;
};

}
