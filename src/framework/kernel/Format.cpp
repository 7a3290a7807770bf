#include "framework/kernel/Format.h"

#include <string>

namespace Kernel
{

namespace
{

bool IsDigit(char c)
{
    return '0' <= c && c <= '9';
}

}

template <typename TString>
TString ToStringT(long long number, SignStyle style, CharacterGrouping const * grouping)
{
    // The smallest number has no positive counterpart in its own type.
    unsigned long long rest =
        number < 0 ? 0ULL - static_cast<unsigned long long>(number) : static_cast<unsigned long long>(number);
    char buffer[64];
    char * const end = buffer + sizeof(buffer);
    char * first = end;
    int digits = 0;
    do {
        if (grouping && 0 < grouping->m_GroupSize && 0 < digits && digits % grouping->m_GroupSize == 0) {
            *--first = grouping->m_Separator;
        }
        *--first = static_cast<char>('0' + rest % 10);
        rest /= 10;
        ++digits;
    } while (rest != 0);
    if (number < 0) {
        *--first = '-';
    } else if (style == SignStyle::Always) {
        *--first = '+';
    }
    return TString(std::string_view(first, static_cast<std::size_t>(end - first)));
}

template <typename TString>
TString ToStringT(int number, SignStyle style, CharacterGrouping const * grouping)
{
    return ToStringT<TString>(static_cast<long long>(number), style, grouping);
}

template <typename TString>
void AppendFormatVT(TString & target, char const * format, FormatHolderT<TString> const * holders,
                    unsigned long long count)
{
    std::string result;
    for (char const * at = format; *at != 0;) {
        if (at[0] != '%' || !IsDigit(at[1])) {
            result += *at++;
            continue;
        }
        unsigned number = static_cast<unsigned>(at[1] - '0');
        std::size_t length = 2;
        // "%10" is the tenth value only if there are that many; else it is the first, and a zero.
        if (IsDigit(at[2]) && number * 10 + static_cast<unsigned>(at[2] - '0') <= count) {
            number = number * 10 + static_cast<unsigned>(at[2] - '0');
            length = 3;
        }
        if (1 <= number && number <= count) {
            result += holders[number - 1].Get().View();
        } else {
            result.append(at, length);
        }
        at += length;
    }
    target.Append(result);
}

template void AppendFormatVT<String>(String &, char const *, FormatHolderT<String> const *, unsigned long long);
template String ToStringT<String>(int, SignStyle, CharacterGrouping const *);
template String ToStringT<String>(long long, SignStyle, CharacterGrouping const *);

}
