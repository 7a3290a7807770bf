#pragma once

#include "framework/kernel/Countable.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <utility>
#include <vector>

namespace Kernel
{

/// Memory of a `RawDataT` comes from the ordinary heap.
struct AllocatorNew
{
    template <typename T>
    using StandardAllocator = std::allocator<T>;
};

/// A shared block of bytes of known length, such as an encoded picture.
template <typename TBase, typename TAllocator>
class RawDataT : public virtual TBase
{
public:
    using Bytes = std::vector<std::uint8_t, typename TAllocator::template StandardAllocator<std::uint8_t>>;

    RawDataT() = default;
    explicit RawDataT(std::size_t size) : m_Bytes(size) {}
    explicit RawDataT(Bytes bytes) : m_Bytes(std::move(bytes)) {}

    [[nodiscard]] std::uint8_t const * GetData() const { return m_Bytes.data(); }
    [[nodiscard]] std::uint8_t * GetMutableData() { return m_Bytes.data(); }
    [[nodiscard]] std::size_t GetSize() const { return m_Bytes.size(); }
    [[nodiscard]] std::span<std::uint8_t const> GetSpan() const { return m_Bytes; }

private:
    Bytes m_Bytes;
};

/// The form that the whole program uses.
using RawData = RawDataT<Countable, AllocatorNew>;

}
