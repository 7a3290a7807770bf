#pragma once

#include "framework/kernel/StringT.h"
#include "framework/typeset/HyphenPatterns.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace Typeset
{

/// Hyphenation patterns of one language, from the dictionaries of libhyphen in /usr/share/hyphen (or the folders in
/// KORVANE_HYPHEN_PATH). Made once a language and kept for the process. Any thread.
class Hyphenator
{
public:
    /// By BCP 47 tag: the dictionary of language and region, else of the language ("de-AT", then "de"; "el-polyton"
    /// is "el"). Null if none is installed.
    [[nodiscard]] static Hyphenator const * Get(String const & language);

    /// Offsets in the word after which a hyphen may stand, ascending, appended to `positions` (relative to the word,
    /// in code units: 2 = between the second and the third). The word is taken as it stands in the text: letters, with
    /// apostrophes and combining marks. Words shorter than the two minima together give none.
    void Hyphenate(std::u16string_view word, std::vector<std::uint16_t> & positions) const;

    /// Least number of letters before and after a hyphen.
    [[nodiscard]] int GetLeftMinimum() const noexcept { return m_LeftMinimum; }
    [[nodiscard]] int GetRightMinimum() const noexcept { return m_RightMinimum; }

    Hyphenator(Hyphenator const &) = delete;
    Hyphenator & operator=(Hyphenator const &) = delete;

private:
    Hyphenator() = default;

    HyphenPatterns m_Patterns;
    int m_LeftMinimum = 2;
    int m_RightMinimum = 2;
};

}
