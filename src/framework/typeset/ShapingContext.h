#pragma once

#include "framework/kernel/Counted.h"
#include "framework/typeset/FontFace.h"
#include "framework/typeset/Shape.h"

#include <hb.h>

#include <string_view>
#include <vector>

namespace Typeset
{

/// How the text of one face is cut up for shaping.
enum class ShapingMode : std::uint8_t
{
    Words,       ///< Words by themselves, spaces apart.
    SpacedWords, ///< Words together with the spaces beside them, which matter to them.
    WholeRuns    ///< Everything at once.
};

/// All that shaping depends on besides the text: face, features, script, language, direction. Keeps the words that it
/// has shaped. One thread at a time; belongs to a ShapeCache.
class ShapingContext
{
public:
    ShapingContext(Kernel::Counted<FontFace const> face, std::vector<hb_feature_t> features, hb_script_t script,
                   hb_language_t language, bool rightToLeft, hb_buffer_t * buffer);
    ~ShapingContext();
    ShapingContext(ShapingContext const &) = delete;
    ShapingContext & operator=(ShapingContext const &) = delete;

    [[nodiscard]] FontFace const & GetFace() const noexcept { return *m_Face; }
    [[nodiscard]] Kernel::Counted<FontFace const> const & GetCountedFace() const noexcept { return m_Face; }
    [[nodiscard]] ShapingMode GetMode() const noexcept { return m_Mode; }
    [[nodiscard]] bool IsRightToLeft() const noexcept { return m_RightToLeft; }
    [[nodiscard]] std::uint16_t GetSpaceGlyph() const noexcept { return m_SpaceGlyph; }
    [[nodiscard]] std::int32_t GetSpaceAdvance() const noexcept { return m_SpaceAdvance; }
    /// The character to set at the end of a hyphenated line.
    [[nodiscard]] char16_t GetHyphen() const noexcept { return m_Hyphen; }
    [[nodiscard]] std::int32_t GetHyphenAdvance() const noexcept { return m_HyphenAdvance; }

    /// Key of a word among those that were shaped. The flags tell of spaces beside it and count only in the mode
    /// SpacedWords. Starts to bring what is known of the word near: ask for keys first, for words afterwards.
    [[nodiscard]] std::uint32_t GetKey(std::u16string_view word, bool spaceBefore, bool spaceAfter) const;
    /// The second step of bringing near, worth taking a few words ahead.
    void BringNear(std::uint32_t key) const { __builtin_prefetch(m_Slots[(key >> 2) & (m_Slots.size() - 1)].m_Shape); }

    /// A word by itself, from the cache if it was met before. Long strings are put into `scratch`, not into the cache.
    /// Valid as long as the arena that it lies in.
    [[nodiscard]] Shape * GetWord(std::u16string_view word, std::uint32_t key, BumpArena & scratch);
    [[nodiscard]] Shape * GetWord(std::u16string_view word, bool spaceBefore, bool spaceAfter, BumpArena & scratch)
    {
        return GetWord(word, GetKey(word, spaceBefore, spaceAfter), scratch);
    }

    /// The stretch [start, end) of a text with what stands around it as context (joining scripts need it).
    [[nodiscard]] Shape * ShapeStretch(std::u16string_view text, std::size_t start, std::size_t end,
                                       BumpArena & scratch);

    /// Memory of the cached words.
    [[nodiscard]] std::size_t GetCacheSize() const noexcept { return m_Arena.GetSize() + m_Slots.size() * sizeof(Slot); }
    [[nodiscard]] BumpArena & GetArena() noexcept { return m_Arena; }
    void ClearCache();

private:
    Shape * Execute(std::u16string_view text, std::size_t start, std::size_t end, std::size_t leadLength,
                    std::size_t wordLength, BumpArena & arena);
    void GrowTable();

    Kernel::Counted<FontFace const> m_Face;
    std::vector<hb_feature_t> m_Features;
    hb_segment_properties_t m_Properties{};
    hb_shape_plan_t * m_Plan = nullptr;
    hb_buffer_t * m_Buffer = nullptr; ///< Borrowed from the cache.
    ShapingMode m_Mode = ShapingMode::Words;
    bool m_RightToLeft = false;
    std::uint16_t m_SpaceGlyph = 0;
    std::int32_t m_SpaceAdvance = 0;
    std::int32_t m_HyphenAdvance = 0;
    char16_t m_Hyphen = u'-';

    BumpArena m_Arena;
    struct Slot
    {
        std::uint32_t m_Hash = 0;
        Shape * m_Shape = nullptr;
    };
    std::vector<Slot> m_Slots; ///< Open addressing, a power of two.
    std::size_t m_Used = 0;
    std::vector<char16_t> m_Spaced;
};

}
