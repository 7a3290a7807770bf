#pragma once

#include "framework/kernel/StringT.h"

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <span>
#include <string_view>
#include <type_traits>
#include <vector>

namespace Story
{

static_assert(std::endian::native == std::endian::little, "The arrays of stories and layouts are little-endian");

/// Puts together a block of bytes: the inner form of stories, style sheets and layouts.
class ByteWriter
{
public:
    template <typename T>
        requires(std::is_arithmetic_v<T> || std::is_enum_v<T>)
    void Write(T value)
    {
        WriteBytes(&value, sizeof(value));
    }
    void WriteBool(bool value) { Write(static_cast<std::uint8_t>(value)); }
    /// With its length.
    void WriteString(std::string_view text)
    {
        Write(static_cast<std::uint32_t>(text.size()));
        WriteBytes(text.data(), text.size());
    }
    /// With the number of elements, aligned to 8 bytes from the beginning of the block.
    template <typename T>
        requires std::is_trivially_copyable_v<T>
    void WriteArray(std::span<T const> values)
    {
        Write(static_cast<std::uint64_t>(values.size()));
        Align();
        WriteBytes(values.data(), values.size_bytes());
    }
    void WriteBytes(void const * data, std::size_t size)
    {
        if (size != 0) {
            auto const * bytes = static_cast<std::byte const *>(data);
            m_Bytes.insert(m_Bytes.end(), bytes, bytes + size);
        }
    }
    void Align() { m_Bytes.resize((m_Bytes.size() + 7) / 8 * 8); }
    void Reserve(std::size_t size) { m_Bytes.reserve(size); }

    [[nodiscard]] std::vector<std::byte> const & GetBytes() const { return m_Bytes; }
    [[nodiscard]] std::vector<std::byte> TakeBytes() { return std::move(m_Bytes); }

private:
    std::vector<std::byte> m_Bytes;
};

/// Takes such a block apart. The first read that goes past the end, or that a caller rejects, makes the reader fail;
/// from then on every read gives zero or nothing. So a caller may read on and ask once at the end.
class ByteReader
{
public:
    explicit ByteReader(std::span<std::byte const> bytes) : m_Bytes(bytes) {}

    template <typename T>
        requires(std::is_arithmetic_v<T> || std::is_enum_v<T>)
    [[nodiscard]] T Read()
    {
        T value{};
        if (auto const bytes = Take(sizeof(T)); !bytes.empty()) {
            std::memcpy(&value, bytes.data(), sizeof(T));
        }
        return value;
    }
    [[nodiscard]] bool ReadBool() { return Read<std::uint8_t>() != 0; }
    /// A number that counts things of at least `leastSize` bytes each that follow: fails if there cannot be so many.
    [[nodiscard]] std::uint32_t ReadCount(std::size_t leastSize)
    {
        auto const count = Read<std::uint32_t>();
        if (count > Remaining() / leastSize) {
            Fail();
            return 0;
        }
        return count;
    }
    [[nodiscard]] String ReadString()
    {
        auto const bytes = Take(ReadCount(1));
        return {reinterpret_cast<char const *>(bytes.data()), bytes.size()};
    }
    /// A view of the elements where they lie; fails if they do not lie aligned in memory.
    template <typename T>
        requires std::is_trivially_copyable_v<T>
    [[nodiscard]] std::span<T const> ReadArray()
    {
        auto const count = Read<std::uint64_t>();
        Align();
        if (count > Remaining() / sizeof(T)) {
            Fail();
            return {};
        }
        auto const bytes = Take(static_cast<std::size_t>(count) * sizeof(T));
        if (reinterpret_cast<std::uintptr_t>(bytes.data()) % alignof(T) != 0) {
            Fail();
            return {};
        }
        return {reinterpret_cast<T const *>(bytes.data()), bytes.size() / sizeof(T)};
    }
    /// The same, copied: for blocks that lie anywhere.
    template <typename T>
        requires std::is_trivially_copyable_v<T>
    void ReadArrayInto(std::vector<T> & values)
    {
        auto const count = Read<std::uint64_t>();
        Align();
        values.clear();
        if (count > Remaining() / sizeof(T)) {
            Fail();
            return;
        }
        values.resize(static_cast<std::size_t>(count));
        if (auto const bytes = Take(values.size() * sizeof(T)); !bytes.empty()) {
            std::memcpy(values.data(), bytes.data(), bytes.size());
        }
    }

    void Fail() { m_Failed = true; }
    [[nodiscard]] bool HasFailed() const { return m_Failed; }
    /// All was read, and nothing failed.
    [[nodiscard]] bool IsComplete() const { return !m_Failed && m_Place == m_Bytes.size(); }
    [[nodiscard]] std::size_t Remaining() const { return m_Failed ? 0 : m_Bytes.size() - m_Place; }

    /// Stories nest through notes and cells. `Enter` fails at a depth that only a forged file has.
    [[nodiscard]] bool Enter()
    {
        if (++m_Depth > MaximumDepth) {
            Fail();
        }
        return !m_Failed;
    }
    void Leave() { --m_Depth; }

private:
    static constexpr int MaximumDepth = 16;

    void Align()
    {
        auto const padding = (8 - m_Place % 8) % 8;
        if (padding != 0) {
            static_cast<void>(Take(padding));
        }
    }
    std::span<std::byte const> Take(std::size_t size)
    {
        if (m_Failed || size > m_Bytes.size() - m_Place) {
            Fail();
            return {};
        }
        auto const bytes = m_Bytes.subspan(m_Place, size);
        m_Place += size;
        return bytes;
    }

    std::span<std::byte const> m_Bytes;
    std::size_t m_Place = 0;
    int m_Depth = 0;
    bool m_Failed = false;
};

}
