#pragma once

#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/StringT.h"

#include <array>
#include <concepts>

namespace Kernel
{

/// How a number shows its sign. A negative number has a minus sign in either.
enum class SignStyle
{
    NegativeOnly = 0,
    Always = 1,
};

/// How digits are grouped: `m_Separator` before every `m_GroupSize` digits from the right. A null pointer to it means
/// no grouping.
struct CharacterGrouping
{
    char m_Separator = ',';
    int m_GroupSize = 3;
};

/// Plain decimal digits, in ASCII whatever the locale is.
template <typename TString>
TString ToStringT(int number, SignStyle style, CharacterGrouping const * grouping);
template <typename TString>
TString ToStringT(long long number, SignStyle style, CharacterGrouping const * grouping);

/// One value of a message, as the text that stands in for its placeholder.
template <typename TString>
class FormatHolderT
{
public:
    FormatHolderT(TString const & text) : m_Text(text) {}
    FormatHolderT(char const * text) : m_Text(text) {}
    FormatHolderT(std::string_view text) : m_Text(text) {}
    FormatHolderT(std::string const & text) : m_Text(text) {}
    FormatHolderT(LocalisedString const & text) : m_Text(text.ToString()) {}
    template <std::integral TNumber>
    FormatHolderT(TNumber number)
        : m_Text(ToStringT<TString>(static_cast<long long>(number), SignStyle::NegativeOnly, nullptr))
    {
    }

    [[nodiscard]] TString const & Get() const { return m_Text; }

private:
    TString m_Text;
};

/// Appends `format` to `target` with `%1`, `%2` ... replaced by the holders in order (`%1` is the first; up to `%99`).
/// Anything else stays as it is written, a placeholder without a holder included. What a holder brings in is not looked
/// at for placeholders again.
template <typename TString>
void AppendFormatVT(TString & target, char const * format, FormatHolderT<TString> const * holders,
                    unsigned long long count);

extern template void AppendFormatVT<String>(String &, char const *, FormatHolderT<String> const *, unsigned long long);
extern template String ToStringT<String>(int, SignStyle, CharacterGrouping const *);
extern template String ToStringT<String>(long long, SignStyle, CharacterGrouping const *);

/// A number as plain decimal text.
template <std::integral TNumber>
[[nodiscard]] String ToString(TNumber number)
{
    return ToStringT<String>(static_cast<long long>(number), SignStyle::NegativeOnly, nullptr);
}

/// The message with its values: Format("Chapter %1 of %2", name, 7). The format may be a `LocalisedString`, which is
/// translated first.
template <typename... TValues>
[[nodiscard]] String Format(char const * format, TValues const &... values)
{
    String result;
    std::array<FormatHolderT<String>, sizeof...(values)> const holders{FormatHolderT<String>(values)...};
    AppendFormatVT<String>(result, format, holders.data(), holders.size());
    return result;
}
template <typename... TValues>
[[nodiscard]] String Format(LocalisedString const & format, TValues const &... values)
{
    return Format(format.ToString().c_str(), values...);
}
template <typename... TValues>
[[nodiscard]] String Format(String const & format, TValues const &... values)
{
    return Format(format.c_str(), values...);
}

}
