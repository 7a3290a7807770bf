#include "framework/typeset/ShapingContext.h"

#include <algorithm>
#include <cstring>

namespace Typeset
{

namespace
{

constexpr std::size_t longestCachedWord = 40;

std::uint32_t HashWord(std::u16string_view word, unsigned variant)
{
    std::uint64_t hash = 0x9E3779B97F4A7C15ULL + variant + word.size() * 4;
    char const * bytes = reinterpret_cast<char const *>(word.data());
    std::size_t left = word.size() * 2;
    while (left >= 8) {
        std::uint64_t block = 0;
        std::memcpy(&block, bytes, 8);
        hash = (hash ^ block) * 0xFF51AFD7ED558CCDULL;
        hash ^= hash >> 32;
        bytes += 8;
        left -= 8;
    }
    std::uint64_t block = 0;
    std::memcpy(&block, bytes, left);
    hash = (hash ^ block) * 0xC4CEB9FE1A85EC53ULL;
    hash ^= hash >> 29;
    return static_cast<std::uint32_t>(hash ^ hash >> 32);
}

std::int16_t Clamp16(hb_position_t value) { return static_cast<std::int16_t>(std::clamp(value, -32768, 32767)); }

}

ShapingContext::ShapingContext(Kernel::Counted<FontFace const> face, std::vector<hb_feature_t> features,
                               hb_script_t script, hb_language_t language, bool rightToLeft, hb_buffer_t * buffer) :
    m_Face(std::move(face)),
    m_Features(std::move(features)), m_Buffer(buffer), m_RightToLeft(rightToLeft)
{
    m_Properties.direction = rightToLeft ? HB_DIRECTION_RTL : HB_DIRECTION_LTR;
    m_Properties.script = script;
    m_Properties.language = language;
    m_Plan = hb_shape_plan_create_cached(m_Face->GetHbFace(), &m_Properties, m_Features.data(),
                                         static_cast<unsigned>(m_Features.size()), nullptr);
    switch (m_Face->GetSpaceUse()) {
    case SpaceUse::None:
        m_Mode = ShapingMode::Words;
        break;
    case SpaceUse::Neighbour:
        m_Mode = ShapingMode::SpacedWords;
        break;
    case SpaceUse::Substitution:
        m_Mode = ShapingMode::WholeRuns;
        break;
    }
    std::uint32_t space = m_Face->GetGlyph(U' ');
    if (!space) {
        space = m_Face->GetGlyph(U'\u00A0');
    }
    m_SpaceGlyph = static_cast<std::uint16_t>(space);
    m_SpaceAdvance = space ? m_Face->GlyphAdvance(space) : m_Face->GetUnitsPerEm() / 4;
    if (!m_Face->HasGlyph(U'-') && m_Face->HasGlyph(U'\u2010')) {
        m_Hyphen = u'\u2010';
    }
    m_HyphenAdvance = m_Face->GlyphAdvance(m_Face->GetGlyph(m_Hyphen));
    m_Slots.resize(1024);
}

ShapingContext::~ShapingContext() { hb_shape_plan_destroy(m_Plan); }

void ShapingContext::ClearCache()
{
    std::fill(m_Slots.begin(), m_Slots.end(), Slot());
    m_Used = 0;
    m_Arena.Clear();
}

void ShapingContext::GrowTable()
{
    std::vector<Slot> old(m_Slots.size() * 2);
    old.swap(m_Slots);
    std::size_t const mask = m_Slots.size() - 1;
    for (Slot const & slot : old) {
        if (slot.m_Shape) {
            std::size_t at = (slot.m_Hash >> 2) & mask;
            while (m_Slots[at].m_Shape) {
                at = (at + 1) & mask;
            }
            m_Slots[at] = slot;
        }
    }
}

std::uint32_t ShapingContext::GetKey(std::u16string_view word, bool spaceBefore, bool spaceAfter) const
{
    bool const spaced = m_Mode == ShapingMode::SpacedWords;
    unsigned const variant = (spaced && spaceBefore ? 1U : 0U) | (spaced && spaceAfter ? 2U : 0U);
    // The variant is part of the key in whole, so that words that differ in it alone are told apart by the key.
    std::uint32_t const key = (HashWord(word, variant) & ~3U) | variant;
    __builtin_prefetch(&m_Slots[(key >> 2) & (m_Slots.size() - 1)]);
    return key;
}

Shape * ShapingContext::GetWord(std::u16string_view word, std::uint32_t key, BumpArena & scratch)
{
    bool const lead = (key & 1) != 0;
    bool const trail = (key & 2) != 0;
    auto const shapeInto = [&](BumpArena & arena) {
        if (!lead && !trail) {
            return Execute(word, 0, word.size(), 0, word.size(), arena);
        }
        m_Spaced.clear();
        if (lead) {
            m_Spaced.push_back(u' ');
        }
        m_Spaced.insert(m_Spaced.end(), word.begin(), word.end());
        if (trail) {
            m_Spaced.push_back(u' ');
        }
        return Execute({m_Spaced.data(), m_Spaced.size()}, 0, m_Spaced.size(), lead ? 1 : 0, word.size(), arena);
    };
    if (word.size() > longestCachedWord) {
        return shapeInto(scratch);
    }

    std::size_t const mask = m_Slots.size() - 1;
    std::size_t at = (key >> 2) & mask;
    while (Shape * known = m_Slots[at].m_Shape) {
        if (m_Slots[at].m_Hash == key && known->m_Length == word.size() &&
            std::memcmp(known->GetText(), word.data(), word.size() * 2) == 0) {
            return known;
        }
        at = (at + 1) & mask;
    }
    Shape * made = shapeInto(m_Arena);
    std::memcpy(made->GetText(), word.data(), word.size() * 2);
    made->m_Cached = true;
    m_Slots[at] = {key, made};
    if (++m_Used * 3 > m_Slots.size() * 2) {
        GrowTable();
    }
    return made;
}

Shape * ShapingContext::ShapeStretch(std::u16string_view text, std::size_t start, std::size_t end, BumpArena & scratch)
{
    return Execute(text, start, end, 0, end - start, scratch);
}

Shape * ShapingContext::Execute(std::u16string_view text, std::size_t start, std::size_t end, std::size_t leadLength,
                                std::size_t wordLength, BumpArena & arena)
{
    // Context further away than this decides nothing, and HarfBuzz would walk over it.
    constexpr std::size_t context = 8;
    std::size_t const from = start > context ? start - context : 0;
    std::size_t const to = std::min(end + context, text.size());
    hb_buffer_clear_contents(m_Buffer);
    hb_buffer_set_segment_properties(m_Buffer, &m_Properties);
    hb_buffer_add_utf16(m_Buffer, reinterpret_cast<std::uint16_t const *>(text.data() + from),
                        static_cast<int>(to - from), static_cast<unsigned>(start - from),
                        static_cast<int>(end - start));
    hb_shape_plan_execute(m_Plan, m_Face->GetHbFont(), m_Buffer, m_Features.data(),
                          static_cast<unsigned>(m_Features.size()));
    unsigned count = 0;
    hb_glyph_info_t const * infos = hb_buffer_get_glyph_infos(m_Buffer, &count);
    hb_glyph_position_t const * positions = hb_buffer_get_glyph_positions(m_Buffer, &count);

    // Room for the text behind the shape: a look-up in the cache then touches one place.
    std::size_t const textSize = wordLength <= longestCachedWord ? wordLength * sizeof(char16_t) : 0;
    auto * shape = new (arena.Allocate<std::byte>(sizeof(Shape) + textSize)) Shape;
    auto * glyphs = arena.Allocate<ShapeGlyph>(count);
    std::uint32_t kept = 0;
    std::uint32_t lastCluster = 0xFFFFFFFF;
    std::size_t const offset = start - from + leadLength;
    for (unsigned i = 0; i < count; ++i) {
        std::size_t const cluster = infos[i].cluster;
        if (cluster < offset) {
            shape->m_LeadKern += positions[i].x_advance - m_SpaceAdvance;
            continue;
        }
        if (cluster >= offset + wordLength) {
            shape->m_TrailKern += positions[i].x_advance - m_SpaceAdvance;
            continue;
        }
        ShapeGlyph & glyph = *new (glyphs + kept++) ShapeGlyph;
        glyph.m_Glyph = static_cast<std::uint16_t>(infos[i].codepoint);
        glyph.m_Unsafe = (hb_glyph_info_get_glyph_flags(&infos[i]) & HB_GLYPH_FLAG_UNSAFE_TO_BREAK) ? 1 : 0;
        glyph.m_Cluster = static_cast<std::uint32_t>(cluster - offset);
        glyph.m_Advance = positions[i].x_advance;
        glyph.m_OffsetX = Clamp16(positions[i].x_offset);
        glyph.m_OffsetY = Clamp16(positions[i].y_offset);
        shape->m_Width += glyph.m_Advance;
        if (glyph.m_Cluster != lastCluster) {
            lastCluster = glyph.m_Cluster;
            ++shape->m_Clusters;
        }
    }
    shape->m_Glyphs = glyphs;
    shape->m_GlyphCount = kept;
    shape->m_Length = static_cast<std::uint32_t>(wordLength);
    return shape;
}

}
