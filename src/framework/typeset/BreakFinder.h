#pragma once

#include "framework/kernel/StringT.h"
#include "framework/typeset/ShapeCache.h"

#include <cstdint>
#include <string_view>
#include <vector>

namespace Typeset
{

/// A place where a line may end.
struct BreakPlace
{
    enum class Kind : std::uint8_t
    {
        Allowed,
        SoftHyphen, ///< With a hyphen set if the line ends here.
        Mandatory   ///< After a line separator.
    };
    std::uint32_t m_Position = 0; ///< The next line's first code unit.
    Kind m_Kind = Kind::Allowed;
};

/// Line-break opportunities by UAX #14 (Unicode 15). ICU finds them where a text needs its dictionaries or the rules
/// for East Asian text; for the rest the pair rules are applied here, many times faster and with the same result.
class BreakFinder
{
public:
    /// Appends the places inside the text, ascending; none at its start or end. `flags` are the CharacterInfo flags
    /// that occur in it.
    static void Find(std::u16string_view text, unsigned flags, String const & language, ShapeCache & cache,
                     std::vector<BreakPlace> & places);

    /// The pair rules alone. The text must not contain CharacterInfo::Complex.
    static void FindByRules(std::u16string_view text, CharacterTable & characters, std::vector<BreakPlace> & places);

    /// ICU's iterator alone.
    static void FindByIterator(std::u16string_view text, String const & language, ShapeCache & cache,
                               std::vector<BreakPlace> & places);
};

/// The stretch is an address on the web: it has a scheme, or starts as such addresses do without one.
[[nodiscard]] bool IsWebAddress(std::u16string_view stretch);

/// Appends the places where an address may be broken without a hyphen: after slashes, before full stops and after
/// "&", "=", "?" and "#", but not beside one another. Offsets in the stretch.
void FindAddressBreaks(std::u16string_view stretch, std::vector<std::uint32_t> & places);

}
