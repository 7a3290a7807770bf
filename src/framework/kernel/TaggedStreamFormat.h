#pragma once

#include "framework/kernel/PropType.h"

#include <cstddef>
#include <cstdint>
#include <cstring>

/// The layout of a tagged stream, which docs/file-format.md shows with an example. Only the serialisers use this.
namespace Kernel::TaggedStream
{

/// The stream begins with these four bytes.
inline constexpr char Magic[4] = {'K', 'v', 'T', 's'};
/// Version of the format as such.
inline constexpr std::uint16_t FormatVersion = 1;
/// Magic, format version, content version, root tag, four zero bytes, 64-bit length of all that follows.
inline constexpr std::size_t StreamHeaderSize = 24;
/// Tag, type, three zero bytes, 64-bit length of the payload.
inline constexpr std::size_t FieldHeaderSize = 16;
/// Class uid, class version, two zero bytes.
inline constexpr std::size_t ObjectHeaderSize = 8;
/// Every field starts at a multiple of this, so that arrays can be used where they lie.
inline constexpr std::size_t Alignment = 8;
/// Objects within objects.
inline constexpr int MaximumDepth = 64;

[[nodiscard]] constexpr std::size_t Padded(std::size_t size)
{
    return (size + (Alignment - 1)) & ~(Alignment - 1);
}

/// Size of a scalar's payload; 0 for a type of variable size.
[[nodiscard]] constexpr std::size_t FixedSize(PropType type)
{
    switch (type) {
    case PropType::Bool:
    case PropType::Int8:
        return 1;
    case PropType::Int16:
        return 2;
    case PropType::Float:
    case PropType::Int32:
        return 4;
    case PropType::Double:
    case PropType::Int64:
        return 8;
    default:
        return 0;
    }
}

template <typename T>
[[nodiscard]] T GetNumber(std::uint8_t const * at)
{
    T value;
    std::memcpy(&value, at, sizeof(value));
    return value;
}

/// The four characters of a tag as they lie in the file, first character first.
[[nodiscard]] inline std::uint32_t GetTag(std::uint8_t const * at)
{
    return static_cast<std::uint32_t>(at[0]) << 24 | static_cast<std::uint32_t>(at[1]) << 16 |
           static_cast<std::uint32_t>(at[2]) << 8 | static_cast<std::uint32_t>(at[3]);
}

}
