#include "framework/kernel/HashAccumulator.h"

#include "framework/kernel/Hexadecimal.h"

// The library keeps its state type from callers otherwise.
#define XXH_STATIC_LINKING_ONLY
#include <xxhash.h>

namespace Kernel
{

namespace
{

Hash128 ToHash(XXH128_hash_t const & hash)
{
    return {hash.low64, hash.high64};
}

}

struct HashAccumulator::State
{
    XXH3_state_t m_Native;
};

String Hash128::ToString() const
{
    std::uint8_t bytes[16];
    for (std::size_t i = 0; i < 8; ++i) {
        bytes[i] = static_cast<std::uint8_t>(m_High >> (56 - 8 * i));
        bytes[8 + i] = static_cast<std::uint8_t>(m_Low >> (56 - 8 * i));
    }
    return ToHexadecimal(bytes);
}

HashAccumulator::HashAccumulator() : m_State(std::make_unique<State>())
{
    XXH3_128bits_reset(&m_State->m_Native);
}

HashAccumulator::~HashAccumulator() = default;

void HashAccumulator::AddBytes(void const * data, std::size_t size)
{
    XXH3_128bits_update(&m_State->m_Native, data, size);
}

void HashAccumulator::AddText(std::string_view text)
{
    Add(static_cast<std::uint64_t>(text.size()));
    AddBytes(text.data(), text.size());
}

Hash128 HashAccumulator::Get128() const
{
    return ToHash(XXH3_128bits_digest(&m_State->m_Native));
}

Hash128 HashBytes128(void const * data, std::size_t size)
{
    return ToHash(XXH3_128bits(data, size));
}

std::uint64_t HashBytes64(void const * data, std::size_t size)
{
    return HashBytes128(data, size).m_Low;
}

}
