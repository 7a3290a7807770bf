#pragma once

#include "framework/typeset/CharacterTable.h"
#include "framework/typeset/ResolvedStyle.h"
#include "framework/typeset/ShapingContext.h"
#include "framework/typeset/TextStyle.h"

#include <unicode/ubidi.h>
#include <unicode/ubrk.h>

#include <array>
#include <map>
#include <memory>
#include <string>
#include <tuple>
#include <unordered_map>
#include <vector>

namespace Typeset
{

/// Which characters of the Basic Multilingual Plane a face has, looked up block by block.
class FaceCoverage
{
public:
    explicit FaceCoverage(FontFace const & face) : m_Face(face) {}

    [[nodiscard]] bool Has(char32_t character)
    {
        if (character > 0xFFFF) {
            return m_Face.HasGlyph(character);
        }
        auto & block = m_Blocks[character >> 8];
        if (!block) {
            Fill(character >> 8);
        }
        return (*block)[character >> 6 & 3] >> (character & 63) & 1;
    }

private:
    void Fill(std::size_t page);

    FontFace const & m_Face;
    std::array<std::unique_ptr<std::array<std::uint64_t, 4>>, 256> m_Blocks;
};

/// All that a paragraph builder finds out and may use again: shaped words, resolved styles, properties of characters,
/// ICU's objects. Nothing in it changes a result; it only makes it come sooner. One thread at a time.
class ShapeCache
{
public:
    ShapeCache();
    ~ShapeCache();
    ShapeCache(ShapeCache const &) = delete;
    ShapeCache & operator=(ShapeCache const &) = delete;

    /// A cache for the caller alone, warm if one has been given back.
    [[nodiscard]] static std::unique_ptr<ShapeCache> Borrow();
    static void GiveBack(std::unique_ptr<ShapeCache> cache);
    /// Destroys the caches that nobody has borrowed.
    static void DropIdle();

    [[nodiscard]] ResolvedStyle & Resolve(Kernel::Counted<TextStyle const> const & style);
    [[nodiscard]] ShapingContext & GetContext(Kernel::Counted<FontFace const> const & face,
                                              std::vector<hb_feature_t> const & features, std::uint8_t script,
                                              String const & language, bool rightToLeft);
    [[nodiscard]] FaceCoverage & GetCoverage(Kernel::Counted<FontFace const> const & face);
    [[nodiscard]] CharacterTable & GetCharacters() noexcept { return m_Characters; }
    [[nodiscard]] UBreakIterator * GetLineIterator(String const & language);
    [[nodiscard]] UBreakIterator * GetCharacterIterator();
    [[nodiscard]] UBiDi * GetBidi() noexcept { return m_Bidi; }

    /// Gives memory back when the cache has become large. Call between paragraphs: shapes do not survive it.
    void Trim();

private:
    using ContextKey = std::tuple<FontFace const *, std::string, std::uint8_t, std::string, bool>;

    CharacterTable m_Characters;
    hb_buffer_t * m_Buffer = nullptr;
    UBiDi * m_Bidi = nullptr;
    UBreakIterator * m_CharacterIterator = nullptr;
    std::map<std::string, UBreakIterator *> m_LineIterators;
    std::map<ContextKey, std::unique_ptr<ShapingContext>> m_Contexts;
    std::unordered_map<TextStyle const *, std::unique_ptr<ResolvedStyle>> m_Styles;
    std::map<FontFace const *, std::unique_ptr<FaceCoverage>> m_Coverages;
};

}
