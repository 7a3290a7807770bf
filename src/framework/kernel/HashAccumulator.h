#pragma once

#include "framework/kernel/StringT.h"

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <span>
#include <type_traits>

namespace Kernel
{

/// 128 bits of a fast hash: two different contents practically never agree by chance; somebody who wants them to can
/// make them. For caches and change detection.
struct Hash128
{
    std::uint64_t m_Low = 0;
    std::uint64_t m_High = 0;

    friend constexpr auto operator<=>(Hash128 const &, Hash128 const &) = default;
    /// 32 hexadecimal digits, the high half first.
    [[nodiscard]] String ToString() const;
};

/// Feeds values one after the other into one hash (XXH3). The result depends on every value and on their order, not on
/// how bytes are cut into calls; it is the same on every machine of the same byte order.
class HashAccumulator
{
public:
    HashAccumulator();
    ~HashAccumulator();
    HashAccumulator(HashAccumulator const &) = delete;
    HashAccumulator & operator=(HashAccumulator const &) = delete;

    void AddBytes(void const * data, std::size_t size);
    /// With the length, so that ("ab", "c") differs from ("a", "bc").
    void Add(String const & text) { AddText(text.View()); }
    void AddText(std::string_view text);
    template <typename T>
    requires(std::is_arithmetic_v<T> || std::is_enum_v<T>) void Add(T value) { AddBytes(&value, sizeof(value)); }
    /// The bytes of the elements, with their number. The type has no padding.
    template <typename T>
    requires std::has_unique_object_representations_v<T>
    void AddArray(std::span<T const> values)
    {
        Add(static_cast<std::uint64_t>(values.size()));
        AddBytes(values.data(), values.size_bytes());
    }
    void Add(Hash128 const & hash)
    {
        Add(hash.m_Low);
        Add(hash.m_High);
    }

    /// The hash of all that was added so far; more may follow.
    [[nodiscard]] Hash128 Get128() const;
    [[nodiscard]] std::uint64_t Get64() const { return Get128().m_Low; }

private:
    struct State;
    std::unique_ptr<State> m_State;
};

/// The hash of one block: faster than an accumulator for short ones, and the same result as adding it there.
[[nodiscard]] Hash128 HashBytes128(void const * data, std::size_t size);
[[nodiscard]] std::uint64_t HashBytes64(void const * data, std::size_t size);

}

template <>
struct std::hash<Kernel::Hash128>
{
    std::size_t operator()(Kernel::Hash128 const & value) const noexcept { return value.m_Low; }
};
