#include "framework/typeset/ContentHash.h"

#include <array>
#include <bit>
#include <cstring>

namespace Typeset
{

namespace
{

std::uint64_t Read64(unsigned char const * bytes) noexcept
{
    std::uint64_t value = 0;
    std::memcpy(&value, bytes, 8);
    if constexpr (std::endian::native == std::endian::big) {
        value = __builtin_bswap64(value);
    }
    return value;
}

std::uint64_t Finish(std::uint64_t value) noexcept
{
    value ^= value >> 33;
    value *= 0xFF51AFD7ED558CCDULL;
    value ^= value >> 33;
    value *= 0xC4CEB9FE1A85EC53ULL;
    value ^= value >> 33;
    return value;
}

constexpr std::uint64_t c1 = 0x87C37B91114253D5ULL;
constexpr std::uint64_t c2 = 0x4CF5AD432745937FULL;

std::uint64_t Scramble1(std::uint64_t value) noexcept { return std::rotl(value * c1, 31) * c2; }
std::uint64_t Scramble2(std::uint64_t value) noexcept { return std::rotl(value * c2, 33) * c1; }

}

String ContentHash::ToString() const
{
    static constexpr char digits[] = "0123456789abcdef";
    std::array<char, 32> text{};
    for (std::size_t i = 0; i < 16; ++i) {
        text[i] = digits[m_High >> (60 - 4 * i) & 15];
        text[i + 16] = digits[m_Low >> (60 - 4 * i) & 15];
    }
    return {text.data(), text.size()};
}

ContentHash HashContent(void const * data, std::size_t length) noexcept
{
    auto const * bytes = static_cast<unsigned char const *>(data);
    std::uint64_t h1 = 0;
    std::uint64_t h2 = 0;
    std::size_t const blocks = length / 16;
    for (std::size_t i = 0; i < blocks; ++i) {
        h1 ^= Scramble1(Read64(bytes + i * 16));
        h1 = (std::rotl(h1, 27) + h2) * 5 + 0x52DCE729;
        h2 ^= Scramble2(Read64(bytes + i * 16 + 8));
        h2 = (std::rotl(h2, 31) + h1) * 5 + 0x38495AB5;
    }

    std::array<unsigned char, 16> tail{};
    std::size_t const rest = length % 16;
    if (rest) {
        std::memcpy(tail.data(), bytes + blocks * 16, rest);
        h2 ^= Scramble2(Read64(tail.data() + 8));
        h1 ^= Scramble1(Read64(tail.data()));
    }

    h1 ^= length;
    h2 ^= length;
    h1 += h2;
    h2 += h1;
    h1 = Finish(h1);
    h2 = Finish(h2);
    h1 += h2;
    h2 += h1;
    return {h1, h2 == 0 && h1 == 0 ? 1 : h2};
}

}
