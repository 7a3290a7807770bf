#include "framework/kernel/Hexadecimal.h"

#include <string>

namespace Kernel
{

String ToHexadecimal(std::span<std::uint8_t const> bytes)
{
    static constexpr char Digits[] = "0123456789abcdef";
    std::string text;
    text.reserve(bytes.size() * 2);
    for (std::uint8_t const byte : bytes) {
        text += Digits[byte >> 4];
        text += Digits[byte & 0x0F];
    }
    return String(text);
}

}
