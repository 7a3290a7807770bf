#pragma once

#include "framework/kernel/StringT.h"

#include <compare>
#include <cstddef>
#include <cstdint>
#include <functional>

namespace Typeset
{

/// 128-bit fingerprint of a font file's bytes. It pins a font in a saved document: two files with the same hash are
/// taken for the same font. Not for use against forgery.
struct ContentHash
{
    std::uint64_t m_High = 0;
    std::uint64_t m_Low = 0;

    [[nodiscard]] bool IsNull() const noexcept { return m_High == 0 && m_Low == 0; }

    /// 32 lower-case hexadecimal digits.
    [[nodiscard]] String ToString() const;

    friend bool operator==(ContentHash const &, ContentHash const &) noexcept = default;
    friend auto operator<=>(ContentHash const &, ContentHash const &) noexcept = default;
};

/// MurmurHash3_x64_128 with seed 0 (Austin Appleby, public domain): several GB/s, the same on every machine of
/// either byte order. The result is never null.
[[nodiscard]] ContentHash HashContent(void const * data, std::size_t length) noexcept;

}

template <>
struct std::hash<Typeset::ContentHash>
{
    std::size_t operator()(Typeset::ContentHash const & value) const noexcept { return value.m_High ^ value.m_Low; }
};
