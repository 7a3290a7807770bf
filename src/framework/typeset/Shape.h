#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <type_traits>
#include <vector>

namespace Typeset
{

/// Memory for plain data that lives and dies together. Addresses stay.
class BumpArena
{
public:
    template <typename T>
    [[nodiscard]] T * Allocate(std::size_t count)
    {
        static_assert(std::is_trivially_destructible_v<T> && alignof(T) <= 8);
        std::size_t const size = (count * sizeof(T) + 7) & ~std::size_t{7};
        if (size > m_Left) {
            Grow(size);
        }
        auto * place = reinterpret_cast<T *>(m_Next);
        m_Next += size;
        m_Left -= size;
        return place;
    }

    /// Forgets everything; keeps the first chunk.
    void Clear();

    [[nodiscard]] std::size_t GetSize() const noexcept { return m_Size; }

private:
    static constexpr std::size_t ChunkSize = 256 * 1024;
    void Grow(std::size_t size);

    std::vector<std::unique_ptr<std::byte[]>> m_Chunks;
    std::byte * m_Next = nullptr;
    std::size_t m_Left = 0;
    std::size_t m_Size = 0;
    std::size_t m_FirstSize = 0;
};

/// A shaped glyph in font units, y up.
struct ShapeGlyph
{
    std::uint16_t m_Glyph = 0;
    std::uint16_t m_Unsafe = 0;  ///< Text cut before this glyph's cluster must be shaped again.
    std::uint32_t m_Cluster = 0; ///< Offset in the shape's text.
    std::int32_t m_Advance = 0;
    std::int16_t m_OffsetX = 0;
    std::int16_t m_OffsetY = 0;
};

/// A shaped stretch of text: glyphs from left to right.
struct Shape
{
    ShapeGlyph const * m_Glyphs = nullptr;
    std::uint16_t const * m_Hyphens = nullptr;
    std::uint32_t m_GlyphCount = 0;
    std::uint32_t m_Length = 0; ///< Of the text, in code units.
    std::uint32_t m_Clusters = 0;
    std::int32_t m_Width = 0;
    std::int32_t m_LeadKern = 0;  ///< Added to the space before it, where there is one.
    std::int32_t m_TrailKern = 0; ///< Added to the space after it.
    std::uint8_t m_HyphenCount = 0;
    bool m_Cached = false;     ///< A word of the cache. Its text stands behind this.
    bool m_Hyphenated = false; ///< m_Hyphens is known.

    [[nodiscard]] char16_t * GetText() noexcept { return reinterpret_cast<char16_t *>(this + 1); }
};

}
