#pragma once

#include <compare>
#include <cstdint>

namespace Kernel
{

/// Four characters in 32 bits, the first in the most significant byte: the name of a field or of a file type.
class IDTag
{
public:
    constexpr IDTag() = default;
    constexpr explicit IDTag(std::uint32_t value) : m_Value(value) {}
    /// From a literal of exactly four characters, such as IDTag("KvBk").
    constexpr IDTag(char const (&text)[5])
        : m_Value(static_cast<std::uint32_t>(static_cast<unsigned char>(text[0])) << 24 |
                  static_cast<std::uint32_t>(static_cast<unsigned char>(text[1])) << 16 |
                  static_cast<std::uint32_t>(static_cast<unsigned char>(text[2])) << 8 |
                  static_cast<std::uint32_t>(static_cast<unsigned char>(text[3])))
    {
    }

    [[nodiscard]] constexpr std::uint32_t Value() const { return m_Value; }
    friend constexpr auto operator<=>(IDTag const &, IDTag const &) = default;

private:
    std::uint32_t m_Value = 0;
};

/// Names a class in a stream; the same packing.
class ClassUID
{
public:
    constexpr ClassUID() = default;
    constexpr explicit ClassUID(std::uint32_t value) : m_Value(value) {}
    constexpr ClassUID(char const (&text)[5]) : m_Value(IDTag(text).Value()) {}

    [[nodiscard]] constexpr std::uint32_t Value() const { return m_Value; }
    friend constexpr auto operator<=>(ClassUID const &, ClassUID const &) = default;

private:
    std::uint32_t m_Value = 0;
};

}
