#include "framework/kernel/Uri.h"

#include <algorithm>

namespace Kernel
{

namespace
{

bool IsLetter(char c)
{
    return ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z');
}

bool IsSchemeCharacter(char c)
{
    return IsLetter(c) || ('0' <= c && c <= '9') || c == '+' || c == '-' || c == '.';
}

bool EqualsIgnoringCase(std::string_view a, std::string_view lowerCase)
{
    return std::equal(a.begin(), a.end(), lowerCase.begin(), lowerCase.end(),
                      [](char x, char y) { return (IsLetter(x) ? static_cast<char>(x | 0x20) : x) == y; });
}

}

bool HasUriProtocol(String const & text)
{
    std::string_view const view = text.View();
    std::size_t const colon = view.find(':');
    if (colon == std::string_view::npos || colon < 2) {
        return false;
    }
    std::string_view const scheme = view.substr(0, colon);
    if (!IsLetter(scheme[0]) || !std::all_of(scheme.begin(), scheme.end(), IsSchemeCharacter)) {
        return false;
    }
    return view.substr(colon).starts_with("://") || EqualsIgnoringCase(scheme, "mailto") ||
           EqualsIgnoringCase(scheme, "tel");
}

}
