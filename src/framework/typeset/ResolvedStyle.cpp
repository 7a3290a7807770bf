#include "framework/typeset/ResolvedStyle.h"

#include "framework/typeset/FontLibrary.h"
#include "framework/typeset/ShapeCache.h"
#include "framework/typeset/ShapingContext.h"

#include <hb-ot.h>

#include <algorithm>

namespace Typeset
{

namespace
{

constexpr double scaledCapitalSize = 0.8;

hb_feature_t MakeFeature(hb_tag_t tag, std::uint32_t value)
{
    return {tag, value, HB_FEATURE_GLOBAL_START, HB_FEATURE_GLOBAL_END};
}

}

ResolvedStyle::ResolvedStyle(Kernel::Counted<TextStyle const> style, ShapeCache & cache) :
    m_Style(std::move(style)), m_Cache(cache)
{
    FontLibrary & library = FontLibrary::GetInstance();
    FontMatch const first = library.Find(m_Style->m_Families, m_Style->m_Weight, m_Style->m_Italic, m_Style->m_Size);
    m_FamilyFound = first.m_FamilyFound;
    if (first.m_Face) {
        m_Faces.push_back(first.m_Face);
    }
    for (String const & family : m_Style->m_Families) {
        FontMatch const match = library.Find(family, m_Style->m_Weight, m_Style->m_Italic, m_Style->m_Size);
        if (match.m_FamilyFound && std::find(m_Faces.begin(), m_Faces.end(), match.m_Face) == m_Faces.end()) {
            m_Faces.push_back(match.m_Face);
        }
    }
    if (m_Style->m_Hyphenate && !m_Style->m_Language.Empty()) {
        m_Hyphenator = Hyphenator::Get(m_Style->m_Language);
    }
    CollectFeatures();
    CollectPositionGlyphs();
}

ResolvedStyle::~ResolvedStyle() { hb_set_destroy(m_PositionGlyphs); }

void ResolvedStyle::CollectFeatures()
{
    TextStyle const & style = *m_Style;
    auto const add = [this](char const (&tag)[5], std::uint32_t value) {
        m_Features.push_back(MakeFeature(HB_TAG(tag[0], tag[1], tag[2], tag[3]), value));
    };
    if (!style.m_Kerning) {
        add("kern", 0);
    }
    if (!style.m_Ligatures || style.m_Tracking != 0) {
        add("liga", 0);
        add("clig", 0);
    }
    if (style.m_Figures != FigureStyle::FontDefault) {
        add("lnum", style.m_Figures == FigureStyle::Lining);
        add("onum", style.m_Figures == FigureStyle::OldStyle);
    }
    if (style.m_FigureSpacing != FigureSpacing::FontDefault) {
        add("pnum", style.m_FigureSpacing == FigureSpacing::Proportional);
        add("tnum", style.m_FigureSpacing == FigureSpacing::Tabular);
    }
    bool const wantsSmall = style.m_Capitals == Capitals::SmallCaps || style.m_Capitals == Capitals::AllSmallCaps;
    if (wantsSmall) {
        m_ScalesCapitals = m_Faces.empty() || !m_Faces.front()->HasFeature("smcp");
        if (!m_ScalesCapitals) {
            add("smcp", 1);
            if (style.m_Capitals == Capitals::AllSmallCaps) {
                add("c2sc", 1);
            }
        }
    }
    for (FontFeature const & feature : style.m_Features) {
        m_Features.push_back(MakeFeature(
            HB_TAG(feature.m_Tag[0], feature.m_Tag[1], feature.m_Tag[2], feature.m_Tag[3]), feature.m_Value));
    }
}

void ResolvedStyle::CollectPositionGlyphs()
{
    m_PositionFeatures = m_Features;
    if (m_Style->m_Position == ScriptPosition::Normal || m_Faces.empty()) {
        return;
    }
    hb_tag_t const tag = m_Style->m_Position == ScriptPosition::Superscript ? HB_TAG('s', 'u', 'p', 's')
                                                                            : HB_TAG('s', 'u', 'b', 's');
    hb_face_t * face = m_Faces.front()->GetHbFace();
    hb_tag_t const wanted[] = {tag, HB_TAG_NONE};
    hb_set_t * lookups = hb_set_create();
    m_PositionGlyphs = hb_set_create();
    hb_ot_layout_collect_lookups(face, HB_OT_TAG_GSUB, nullptr, nullptr, wanted, lookups);
    hb_codepoint_t lookup = HB_SET_VALUE_INVALID;
    while (hb_set_next(lookups, &lookup)) {
        hb_ot_layout_lookup_collect_glyphs(face, HB_OT_TAG_GSUB, lookup, nullptr, m_PositionGlyphs, nullptr, nullptr);
    }
    hb_set_destroy(lookups);
    m_PositionFeatures.push_back(MakeFeature(tag, 1));
}

bool ResolvedStyle::HasPositionGlyph(char32_t character) const
{
    return m_PositionGlyphs && hb_set_has(m_PositionGlyphs, m_Faces.front()->GetGlyph(character));
}

Kernel::Counted<FontFace const> const & ResolvedStyle::FindFace(char32_t character)
{
    for (Kernel::Counted<FontFace const> const & face : m_Faces) {
        if (m_Cache.GetCoverage(face).Has(character)) {
            return face;
        }
    }
    for (KnownFallback const & known : m_Fallbacks) {
        if (known.m_Character == character || (known.m_Face && m_Cache.GetCoverage(known.m_Face).Has(character) &&
                                               known.m_Character >> 7 == character >> 7)) {
            return known.m_Face;
        }
    }
    Kernel::Counted<FontFace const> face;
    if (!m_Faces.empty()) {
        face = FontLibrary::GetInstance().FindFallback(character, m_Style->m_Language, *m_Faces.front());
    }
    return m_Fallbacks.emplace_back(KnownFallback{character, face}).m_Face;
}

ShapingContext & ResolvedStyle::GetContext(Kernel::Counted<FontFace const> const & face, StyleVariant variant,
                                           std::uint8_t script, bool rightToLeft)
{
    StyleVariant const kind = variant == StyleVariant::PositionFeature ? variant : StyleVariant::Plain;
    for (KnownContext const & known : m_Contexts) {
        if (known.m_Face == face.Get() && known.m_Variant == kind && known.m_Script == script &&
            known.m_RightToLeft == rightToLeft) {
            return *known.m_Context;
        }
    }
    ShapingContext & context =
        m_Cache.GetContext(face, kind == StyleVariant::PositionFeature ? m_PositionFeatures : m_Features, script,
                           m_Style->m_Language, rightToLeft);
    m_Contexts.push_back({face.Get(), kind, script, rightToLeft, &context});
    return context;
}

double ResolvedStyle::GetSize(StyleVariant variant) const noexcept
{
    double size = m_Style->m_Size;
    if (m_Style->m_Position != ScriptPosition::Normal && variant != StyleVariant::PositionFeature &&
        !m_Faces.empty()) {
        // Fonts' own figures range from useless to huge: they count within what looks right.
        FaceMetrics const & metrics = m_Faces.front()->GetMetrics();
        int const own = m_Style->m_Position == ScriptPosition::Superscript ? metrics.m_SuperscriptSize
                                                                           : metrics.m_SubscriptSize;
        size *= std::clamp(static_cast<double>(own) / metrics.m_UnitsPerEm, 0.55, 0.68);
    }
    return variant == StyleVariant::ScaledCapitals ? size * scaledCapitalSize : size;
}

double ResolvedStyle::GetRise(StyleVariant variant) const noexcept
{
    double rise = m_Style->m_BaselineShift;
    if (variant == StyleVariant::PositionFeature || m_Faces.empty()) {
        return rise;
    }
    FaceMetrics const & metrics = m_Faces.front()->GetMetrics();
    double const em = metrics.m_UnitsPerEm;
    if (m_Style->m_Position == ScriptPosition::Superscript) {
        rise += std::clamp(metrics.m_SuperscriptRise / em, 0.3, 0.45) * m_Style->m_Size;
    } else if (m_Style->m_Position == ScriptPosition::Subscript) {
        rise -= std::clamp(metrics.m_SubscriptDrop / em, 0.08, 0.25) * m_Style->m_Size;
    }
    return rise;
}

}
