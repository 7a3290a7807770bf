#pragma once

#include "framework/kernel/StringT.h"

#include <array>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <memory>

namespace Kernel
{

/// SHA-256 (FIPS 180-4) of a file or a block: what pins a font to its content, where nobody may be able to make another
/// content with the same hash. The default value, all zeros, stands for "none".
class ContentHash
{
public:
    using Bytes = std::array<std::uint8_t, 32>;

    ContentHash() = default;
    explicit ContentHash(Bytes const & bytes) : m_Bytes(bytes) {}

    [[nodiscard]] static ContentHash OfBytes(void const * data, std::size_t size);
    /// False, and `hash` as it was, if the file cannot be read to its end.
    static bool OfFile(String const & path, ContentHash & hash);
    /// From 64 hexadecimal digits; false for anything else.
    static bool FromString(String const & text, ContentHash & hash);

    [[nodiscard]] Bytes const & GetBytes() const { return m_Bytes; }
    [[nodiscard]] bool IsNone() const { return m_Bytes == Bytes{}; }
    /// 64 hexadecimal digits in lower case.
    [[nodiscard]] String ToString() const;

    friend auto operator<=>(ContentHash const &, ContentHash const &) = default;

private:
    Bytes m_Bytes{};
};

/// Computes a `ContentHash` piece by piece.
class ContentHasher
{
public:
    ContentHasher();
    ~ContentHasher();
    ContentHasher(ContentHasher const &) = delete;
    ContentHasher & operator=(ContentHasher const &) = delete;

    void AddBytes(void const * data, std::size_t size);
    /// The hash of all that was added; the hasher starts anew.
    [[nodiscard]] ContentHash Finish();

private:
    struct State;
    std::unique_ptr<State> m_State;
};

}
