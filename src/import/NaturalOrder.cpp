#include "import/NaturalOrder.h"

#include <cstddef>

namespace Import
{

namespace
{

bool IsDigit(char c)
{
    return '0' <= c && c <= '9';
}

unsigned char Folded(char c)
{
    return static_cast<unsigned char>('A' <= c && c <= 'Z' ? c + ('a' - 'A') : c);
}

/// Takes the run of digits at the start of `text` off, without its leading zeros.
std::string_view TakeNumber(std::string_view & text)
{
    std::size_t end = 0;
    while (end < text.size() && IsDigit(text[end])) {
        ++end;
    }
    std::string_view number = text.substr(0, end);
    text.remove_prefix(end);
    while (1 < number.size() && '0' == number.front()) {
        number.remove_prefix(1);
    }
    return number;
}

}

bool ComesBefore(std::string_view a, std::string_view b)
{
    std::string_view const wholeA = a;
    std::string_view const wholeB = b;
    while (!a.empty() && !b.empty()) {
        if (IsDigit(a.front()) && IsDigit(b.front())) {
            std::string_view const numberA = TakeNumber(a);
            std::string_view const numberB = TakeNumber(b);
            if (numberA.size() != numberB.size()) {
                return numberA.size() < numberB.size();
            }
            if (int const order = numberA.compare(numberB); 0 != order) {
                return order < 0;
            }
            continue;
        }
        if (Folded(a.front()) != Folded(b.front())) {
            return Folded(a.front()) < Folded(b.front());
        }
        a.remove_prefix(1);
        b.remove_prefix(1);
    }
    if (a.empty() != b.empty()) {
        return a.empty();
    }
    if (wholeA.size() != wholeB.size()) {
        return wholeA.size() < wholeB.size();
    }
    return wholeA < wholeB;
}

}
