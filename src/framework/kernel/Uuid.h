#pragma once

#include "framework/kernel/StringT.h"

#include <array>
#include <cstdint>

namespace Kernel
{

/// A new unique id (RFC 9562, version 4). Copies are equal.
class Uuid
{
public:
    /// A new one each time, from `Entropy`.
    Uuid();

    /// 36 characters in lower case: "f81d4fae-7dec-41d0-a765-00a0c91e6bf6".
    [[nodiscard]] String ToString() const;

    friend bool operator==(Uuid const &, Uuid const &) = default;

private:
    std::array<std::uint8_t, 16> m_Bytes;
};

}
