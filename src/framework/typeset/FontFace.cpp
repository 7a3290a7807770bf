#include "framework/typeset/FontFace.h"

#include <hb-ot.h>
#include <hb.h>
#include <unicode/uchar.h>

#include <array>
#include <vector>

namespace Typeset
{

namespace
{

/// One table of a face, for reading big-endian numbers. Reading past the end gives 0.
class TableReader
{
public:
    TableReader(hb_face_t * face, hb_tag_t tag) : m_Blob(hb_face_reference_table(face, tag))
    {
        unsigned length = 0;
        m_Data = reinterpret_cast<unsigned char const *>(hb_blob_get_data(m_Blob, &length));
        m_Length = length;
    }
    ~TableReader() { hb_blob_destroy(m_Blob); }
    TableReader(TableReader const &) = delete;
    TableReader & operator=(TableReader const &) = delete;

    [[nodiscard]] std::size_t Length() const noexcept { return m_Length; }
    [[nodiscard]] std::uint16_t U16(std::size_t at) const noexcept
    {
        return at + 2 > m_Length ? 0 : static_cast<std::uint16_t>(m_Data[at] << 8 | m_Data[at + 1]);
    }
    [[nodiscard]] std::int16_t S16(std::size_t at) const noexcept { return static_cast<std::int16_t>(U16(at)); }
    [[nodiscard]] std::int32_t S32(std::size_t at) const noexcept
    {
        return static_cast<std::int32_t>(static_cast<std::uint32_t>(U16(at)) << 16 | U16(at + 2));
    }

private:
    hb_blob_t * m_Blob;
    unsigned char const * m_Data = nullptr;
    std::size_t m_Length = 0;
};

String ReadName(hb_face_t * face, hb_ot_name_id_t id)
{
    hb_language_t const english = hb_language_from_string("en", -1);
    std::array<char, 256> text{};
    unsigned size = text.size();
    hb_ot_name_get_utf8(face, id, english, &size, text.data());
    return {text.data(), size};
}

OutlineSink & SinkOf(void * data) { return *static_cast<OutlineSink *>(data); }

void OnMove(hb_draw_funcs_t *, void * data, hb_draw_state_t *, float x, float y, void *) { SinkOf(data).MoveTo(x, y); }
void OnLine(hb_draw_funcs_t *, void * data, hb_draw_state_t *, float x, float y, void *) { SinkOf(data).LineTo(x, y); }
void OnQuad(hb_draw_funcs_t *, void * data, hb_draw_state_t *, float cx, float cy, float x, float y, void *)
{
    SinkOf(data).QuadTo(cx, cy, x, y);
}
void OnCubic(hb_draw_funcs_t *, void * data, hb_draw_state_t *, float c1x, float c1y, float c2x, float c2y, float x,
             float y, void *)
{
    SinkOf(data).CubicTo(c1x, c1y, c2x, c2y, x, y);
}
void OnClose(hb_draw_funcs_t *, void * data, hb_draw_state_t *, void *) { SinkOf(data).Close(); }

hb_draw_funcs_t * DrawFunctions()
{
    static hb_draw_funcs_t * const functions = [] {
        hb_draw_funcs_t * made = hb_draw_funcs_create();
        hb_draw_funcs_set_move_to_func(made, OnMove, nullptr, nullptr);
        hb_draw_funcs_set_line_to_func(made, OnLine, nullptr, nullptr);
        hb_draw_funcs_set_quadratic_to_func(made, OnQuad, nullptr, nullptr);
        hb_draw_funcs_set_cubic_to_func(made, OnCubic, nullptr, nullptr);
        hb_draw_funcs_set_close_path_func(made, OnClose, nullptr, nullptr);
        hb_draw_funcs_make_immutable(made);
        return made;
    }();
    return functions;
}

int Estimate(int value, double share, int unitsPerEm)
{
    return value > 0 ? value : static_cast<int>(share * unitsPerEm);
}

}

Kernel::Counted<FontFace const> FontFace::Load(String const & path, unsigned index)
{
    hb_blob_t * blob = hb_blob_create_from_file_or_fail(path.c_str());
    if (!blob) {
        return nullptr;
    }
    Kernel::Counted<FontFace> face(new FontFace);
    face->m_Path = path;
    face->m_Index = index;
    face->m_Blob = blob;
    if (index >= hb_face_count(blob)) {
        return nullptr;
    }
    face->m_HbFace = hb_face_create(blob, index);
    face->m_GlyphCount = hb_face_get_glyph_count(face->m_HbFace);
    if (face->m_GlyphCount == 0 || face->m_GlyphCount > 0xFFFF) {
        return nullptr;
    }
    std::span<std::byte const> const data = face->GetData();
    face->m_Hash = HashContent(data.data(), data.size());
    face->m_HbFont = hb_font_create(face->m_HbFace);
    face->ReadTables();
    if (!face->m_Cff && TableReader(face->m_HbFace, HB_TAG('g', 'l', 'y', 'f')).Length() == 0) {
        return nullptr;
    }
    face->ReadMetrics();
    hb_face_make_immutable(face->m_HbFace);
    hb_font_make_immutable(face->m_HbFont);
    return face;
}

FontFace::~FontFace()
{
    hb_font_destroy(m_HbFont);
    hb_face_destroy(m_HbFace);
    hb_blob_destroy(m_Blob);
}

void FontFace::ReadTables()
{
    m_Family = ReadName(m_HbFace, HB_OT_NAME_ID_TYPOGRAPHIC_FAMILY);
    if (m_Family.Empty()) {
        m_Family = ReadName(m_HbFace, HB_OT_NAME_ID_FONT_FAMILY);
    }
    m_Subfamily = ReadName(m_HbFace, HB_OT_NAME_ID_TYPOGRAPHIC_SUBFAMILY);
    if (m_Subfamily.Empty()) {
        m_Subfamily = ReadName(m_HbFace, HB_OT_NAME_ID_FONT_SUBFAMILY);
    }
    m_PostScriptName = ReadName(m_HbFace, HB_OT_NAME_ID_POSTSCRIPT_NAME);
    if (m_Family.Empty()) {
        std::string_view const path = m_Path.View();
        m_Family = String(path.substr(path.rfind('/') + 1));
    }
    if (m_Subfamily.Empty()) {
        m_Subfamily = "Regular";
    }
    if (m_PostScriptName.Empty()) {
        m_PostScriptName = Kernel::ConcatString({m_Family.View(), "-", m_Subfamily.View()});
    }

    TableReader const os2(m_HbFace, HB_TAG('O', 'S', '/', '2'));
    TableReader const post(m_HbFace, HB_TAG('p', 'o', 's', 't'));
    TableReader const head(m_HbFace, HB_TAG('h', 'e', 'a', 'd'));
    std::uint16_t const macStyle = head.U16(44);
    if (os2.Length() >= 64) {
        m_Weight = os2.U16(4);
        m_EmbeddingFlags = os2.U16(8);
        m_Italic = (os2.U16(62) & 0x201) != 0; // Italic or oblique.
    } else {
        m_Weight = macStyle & 1 ? 700 : 400;
        m_Italic = (macStyle & 2) != 0;
    }
    m_Monospaced = post.S32(12) != 0;
    m_Metrics.m_ItalicAngle = post.S32(4) / 65536.0;
    m_Cff = TableReader(m_HbFace, HB_TAG('C', 'F', 'F', ' ')).Length() != 0 ||
            TableReader(m_HbFace, HB_TAG('C', 'F', 'F', '2')).Length() != 0;
    m_Metrics.m_BoxLeft = head.S16(36);
    m_Metrics.m_BoxBottom = head.S16(38);
    m_Metrics.m_BoxRight = head.S16(40);
    m_Metrics.m_BoxTop = head.S16(42);
}

void FontFace::ReadMetrics()
{
    FaceMetrics & metrics = m_Metrics;
    int const em = static_cast<int>(hb_face_get_upem(m_HbFace));
    metrics.m_UnitsPerEm = em;

    hb_font_extents_t extents{};
    hb_font_get_h_extents(m_HbFont, &extents);
    metrics.m_Ascent = Estimate(extents.ascender, 0.8, em);
    metrics.m_Descent = Estimate(-extents.descender, 0.2, em);
    metrics.m_LineGap = extents.line_gap;

    auto const get = [this](hb_ot_metrics_tag_t tag) {
        hb_position_t value = 0;
        return hb_ot_metrics_get_position(m_HbFont, tag, &value) ? value : 0;
    };
    auto const heightOf = [this](char32_t character) {
        hb_glyph_extents_t box{};
        std::uint32_t const glyph = GetGlyph(character);
        return glyph && hb_font_get_glyph_extents(m_HbFont, glyph, &box) ? box.y_bearing : 0;
    };
    metrics.m_CapHeight = get(HB_OT_METRICS_TAG_CAP_HEIGHT);
    if (metrics.m_CapHeight <= 0) {
        metrics.m_CapHeight = Estimate(heightOf(U'H'), 0.7, em);
    }
    metrics.m_XHeight = get(HB_OT_METRICS_TAG_X_HEIGHT);
    if (metrics.m_XHeight <= 0) {
        metrics.m_XHeight = Estimate(heightOf(U'x'), 0.45, em);
    }
    metrics.m_UnderlineThickness = Estimate(get(HB_OT_METRICS_TAG_UNDERLINE_SIZE), 0.05, em);
    // The post table gives the middle of the stroke, the OS/2 table the top of the strike-through's.
    int const underline = get(HB_OT_METRICS_TAG_UNDERLINE_OFFSET);
    metrics.m_UnderlinePosition = underline < 0 ? underline : -em / 10;
    metrics.m_StrikeThickness = Estimate(get(HB_OT_METRICS_TAG_STRIKEOUT_SIZE), 0.05, em);
    int const strike = get(HB_OT_METRICS_TAG_STRIKEOUT_OFFSET);
    metrics.m_StrikePosition = strike > 0 ? strike - metrics.m_StrikeThickness / 2 : metrics.m_XHeight / 2;
    metrics.m_SuperscriptSize = Estimate(get(HB_OT_METRICS_TAG_SUPERSCRIPT_EM_Y_SIZE), 0.6, em);
    metrics.m_SuperscriptRise = Estimate(get(HB_OT_METRICS_TAG_SUPERSCRIPT_EM_Y_OFFSET), 0.35, em);
    metrics.m_SubscriptSize = Estimate(get(HB_OT_METRICS_TAG_SUBSCRIPT_EM_Y_SIZE), 0.6, em);
    metrics.m_SubscriptDrop = Estimate(get(HB_OT_METRICS_TAG_SUBSCRIPT_EM_Y_OFFSET), 0.15, em);
}

bool FontFace::MayEmbed() const noexcept
{
    // Of several usage bits the least restrictive one counts (OpenType, OS/2, "fsType").
    bool const restricted = (m_EmbeddingFlags & 0x000E) == 0x0002;
    bool const bitmapOnly = (m_EmbeddingFlags & 0x0200) != 0;
    return !restricted && !bitmapOnly;
}

bool FontFace::MaySubset() const noexcept { return (m_EmbeddingFlags & 0x0100) == 0; }

std::uint32_t FontFace::GetGlyph(char32_t character) const noexcept
{
    hb_codepoint_t glyph = 0;
    if (!hb_font_get_nominal_glyph(m_HbFont, character, &glyph)) {
        return 0;
    }
    // Unfinished fonts name letters that nobody has drawn yet: another font has to set these, or they are gaps in the text.
    hb_glyph_extents_t box{};
    bool const mayBeBlank = !u_isalpha(static_cast<UChar32>(character)) ||
                            u_hasBinaryProperty(static_cast<UChar32>(character), UCHAR_DEFAULT_IGNORABLE_CODE_POINT);
    bool const isBlank = !mayBeBlank && hb_font_get_glyph_extents(m_HbFont, glyph, &box) && 0 == box.width &&
                         0 == box.height;
    return isBlank ? 0 : glyph;
}

int FontFace::GlyphAdvance(std::uint32_t glyph) const noexcept { return hb_font_get_glyph_h_advance(m_HbFont, glyph); }

void FontFace::DrawGlyph(std::uint32_t glyph, OutlineSink & sink) const
{
    hb_font_get_glyph_shape(m_HbFont, glyph, DrawFunctions(), &sink);
}

bool FontFace::HasFeature(char const * tag) const noexcept
{
    hb_tag_t const wanted = HB_TAG(tag[0], tag[1], tag[2], tag[3]);
    std::array<hb_tag_t, 64> tags{};
    unsigned start = 0;
    for (;;) {
        unsigned count = tags.size();
        unsigned const total =
            hb_ot_layout_table_get_feature_tags(m_HbFace, HB_OT_TAG_GSUB, start, &count, tags.data());
        for (unsigned i = 0; i < count; ++i) {
            if (tags[i] == wanted) {
                return true;
            }
        }
        start += count;
        if (count == 0 || start >= total) {
            return false;
        }
    }
}

SpaceUse FontFace::GetSpaceUse() const
{
    std::call_once(m_SpaceOnce, [this] { m_SpaceUse = FindSpaceUse(); });
    return m_SpaceUse;
}

SpaceUse FontFace::FindSpaceUse() const
{
    std::uint32_t const space = GetGlyph(U' ');
    if (!space) {
        return SpaceUse::None;
    }
    // Features that are on by default, and those that a style can ask for by name.
    static constexpr std::array features{
        HB_TAG('c', 'c', 'm', 'p'), HB_TAG('l', 'o', 'c', 'l'), HB_TAG('l', 'i', 'g', 'a'), HB_TAG('c', 'l', 'i', 'g'),
        HB_TAG('c', 'a', 'l', 't'), HB_TAG('r', 'l', 'i', 'g'), HB_TAG('r', 'c', 'l', 't'), HB_TAG('s', 'm', 'c', 'p'),
        HB_TAG('c', '2', 's', 'c'), HB_TAG('k', 'e', 'r', 'n'), HB_TAG('d', 'i', 's', 't'), HB_TAG_NONE};
    hb_set_t * lookups = hb_set_create();
    hb_set_t * input = hb_set_create();
    hb_set_t * context = hb_set_create();
    SpaceUse use = SpaceUse::None;
    for (hb_tag_t const table : {HB_OT_TAG_GSUB, HB_OT_TAG_GPOS}) {
        hb_set_clear(lookups);
        hb_ot_layout_collect_lookups(m_HbFace, table, nullptr, nullptr, features.data(), lookups);
        hb_codepoint_t lookup = HB_SET_VALUE_INVALID;
        while (use != SpaceUse::Substitution && hb_set_next(lookups, &lookup)) {
            hb_set_clear(input);
            hb_set_clear(context);
            hb_ot_layout_lookup_collect_glyphs(m_HbFace, table, lookup, context, input, context, nullptr);
            if (hb_set_has(input, space) && table == HB_OT_TAG_GSUB) {
                use = SpaceUse::Substitution;
            } else if (hb_set_has(input, space) || hb_set_has(context, space)) {
                use = SpaceUse::Neighbour;
            }
        }
    }
    for (hb_set_t * set : {lookups, input, context}) {
        hb_set_destroy(set);
    }
    return use;
}

std::span<std::byte const> FontFace::GetData() const noexcept
{
    unsigned length = 0;
    char const * data = hb_blob_get_data(m_Blob, &length);
    return {reinterpret_cast<std::byte const *>(data), length};
}

}
