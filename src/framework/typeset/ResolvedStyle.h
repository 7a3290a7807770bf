#pragma once

#include "framework/kernel/Counted.h"
#include "framework/typeset/FontFace.h"
#include "framework/typeset/Hyphenator.h"
#include "framework/typeset/TextStyle.h"

#include <hb.h>

#include <cstdint>
#include <vector>

namespace Typeset
{

class ShapeCache;
class ShapingContext;

/// How the characters of a style are made where the fonts leave a choice.
enum class StyleVariant : std::uint8_t
{
    Plain,
    ScaledCapitals,  ///< Upper-cased lower-case letters, made smaller: the face has no small capitals.
    PositionFeature, ///< The face's own superiors or inferiors.
    Count
};

/// A style with its faces found. Belongs to a ShapeCache.
class ResolvedStyle
{
public:
    ResolvedStyle(Kernel::Counted<TextStyle const> style, ShapeCache & cache);
    ~ResolvedStyle();
    ResolvedStyle(ResolvedStyle const &) = delete;
    ResolvedStyle & operator=(ResolvedStyle const &) = delete;

    [[nodiscard]] TextStyle const & GetStyle() const noexcept { return *m_Style; }
    /// The installed faces of the style's families, in order. Empty only on a machine without fonts.
    [[nodiscard]] std::vector<Kernel::Counted<FontFace const>> const & GetFaces() const noexcept { return m_Faces; }
    [[nodiscard]] bool IsFamilyFound() const noexcept { return m_FamilyFound; }
    [[nodiscard]] Hyphenator const * GetHyphenator() const noexcept { return m_Hyphenator; }
    /// Small capitals have to be made by scaling.
    [[nodiscard]] bool ScalesCapitals() const noexcept { return m_ScalesCapitals; }
    /// The first face's feature for superscripts (or subscripts) replaces this character.
    [[nodiscard]] bool HasPositionGlyph(char32_t character) const;

    /// The face for a character that starts a cluster; null if no installed font has it.
    [[nodiscard]] Kernel::Counted<FontFace const> const & FindFace(char32_t character);

    [[nodiscard]] ShapingContext & GetContext(Kernel::Counted<FontFace const> const & face, StyleVariant variant,
                                              std::uint8_t script, bool rightToLeft);

    /// Points to the em, and points above the baseline, of a variant.
    [[nodiscard]] double GetSize(StyleVariant variant) const noexcept;
    [[nodiscard]] double GetRise(StyleVariant variant) const noexcept;
    [[nodiscard]] double GetTracking() const noexcept { return m_Style->m_Tracking * m_Style->m_Size / 1000; }

private:
    struct KnownContext
    {
        FontFace const * m_Face;
        StyleVariant m_Variant;
        std::uint8_t m_Script;
        bool m_RightToLeft;
        ShapingContext * m_Context;
    };
    struct KnownFallback
    {
        char32_t m_Character;
        Kernel::Counted<FontFace const> m_Face;
    };

    void CollectFeatures();
    void CollectPositionGlyphs();

    Kernel::Counted<TextStyle const> m_Style;
    ShapeCache & m_Cache;
    std::vector<Kernel::Counted<FontFace const>> m_Faces;
    std::vector<hb_feature_t> m_Features;
    std::vector<hb_feature_t> m_PositionFeatures;
    std::vector<KnownContext> m_Contexts;
    std::vector<KnownFallback> m_Fallbacks;
    Hyphenator const * m_Hyphenator = nullptr;
    hb_set_t * m_PositionGlyphs = nullptr;
    bool m_FamilyFound = true;
    bool m_ScalesCapitals = false;
};

}
