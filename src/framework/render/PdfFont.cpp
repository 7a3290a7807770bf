#include "framework/render/PdfFont.h"

#include "framework/kernel/Format.h"
#include "framework/kernel/HashAccumulator.h"
#include "framework/kernel/Utf.h"
#include "framework/render/PdfText.h"

#include <cmath>
#include <hb-ot.h>
#include <hb-subset.h>
#include <hb.h>
#include <memory>
#include <stdexcept>

namespace Renderer::RenderTree
{

namespace
{

template <auto Destroy>
struct Destroyer
{
    template <typename T>
    void operator()(T * object) const
    {
        Destroy(object);
    }
};
using BlobPtr = std::unique_ptr<hb_blob_t, Destroyer<hb_blob_destroy>>;
using FacePtr = std::unique_ptr<hb_face_t, Destroyer<hb_face_destroy>>;
using SetPtr = std::unique_ptr<hb_set_t, Destroyer<hb_set_destroy>>;
using InputPtr = std::unique_ptr<hb_subset_input_t, Destroyer<hb_subset_input_destroy>>;

bool HasTable(Typeset::FontFace const & face, hb_tag_t tag)
{
    BlobPtr const blob(hb_face_reference_table(face.GetHbFace(), tag));
    return hb_blob_get_length(blob.get()) > 0;
}

std::string BytesOf(hb_blob_t * blob)
{
    unsigned length = 0;
    char const * data = hb_blob_get_data(blob, &length);
    return std::string(data, length);
}

void AppendHexGlyph(std::string & text, std::uint16_t glyph)
{
    static char const digits[] = "0123456789ABCDEF";
    text += '<';
    for (int shift = 12; shift >= 0; shift -= 4) {
        text += digits[glyph >> shift & 15];
    }
    text += '>';
}

/// The face's glyphs by character, turned round: for each wanted glyph the first character that has it.
void FindCharacters(Typeset::FontFace const & face, std::vector<std::uint16_t> const & wanted,
                    std::vector<char32_t> & characters)
{
    SetPtr const all(hb_set_create());
    hb_face_collect_unicodes(face.GetHbFace(), all.get());
    characters.assign(wanted.size(), 0xFFFD);
    hb_codepoint_t character = HB_SET_VALUE_INVALID;
    while (hb_set_next(all.get(), &character)) {
        std::uint32_t const glyph = face.GetGlyph(character);
        auto const found = std::lower_bound(wanted.begin(), wanted.end(), glyph);
        if (found != wanted.end() && *found == glyph) {
            char32_t & known = characters[static_cast<std::size_t>(found - wanted.begin())];
            known = known == 0xFFFD ? character : known;
        }
    }
}

}

PdfFont::PdfFont(Kernel::Counted<Typeset::FontFace const> face, std::string name)
    : m_Face(std::move(face)), m_Name(std::move(name)), m_Widths(std::max(1U, m_Face->GetGlyphCount()), -1),
      m_Texts(m_Widths.size(), Unknown)
{
    // CFF2 and bitmap fonts have no place in a PDF file.
    m_Embedded = m_Face->MayEmbed() && (HasTable(*m_Face, HB_TAG('C', 'F', 'F', ' ')) ||
                                        HasTable(*m_Face, HB_TAG('g', 'l', 'y', 'f')));
}

PdfFont::Width PdfFont::Measure(std::uint16_t glyph)
{
    double const em = m_Face->GetUnitsPerEm();
    m_Widths[glyph] = static_cast<Width>(std::lround(std::max(0, m_Face->GlyphAdvance(glyph)) * EmWidth / em));
    return m_Widths[glyph];
}

bool PdfFont::Map(std::uint16_t glyph, std::u16string_view text)
{
    if (text.size() == 1) {
        return Map(glyph, text[0]);
    }
    std::uint32_t & known = m_Texts[glyph];
    if (known == Unknown) {
        known = LongText + static_cast<std::uint32_t>(m_LongTexts.size());
        m_LongTexts.emplace_back(text);
        return true;
    }
    return known >= LongText && m_LongTexts[known - LongText] == text;
}

std::u16string_view PdfFont::TextOf(std::uint16_t glyph, char16_t (&single)[1]) const
{
    std::uint32_t const known = m_Texts[glyph];
    if (known == Unknown) {
        return {};
    }
    if (known >= LongText) {
        return m_LongTexts[known - LongText];
    }
    single[0] = static_cast<char16_t>(known);
    return {single, 1};
}

std::vector<std::uint16_t> PdfFont::UsedGlyphs() const
{
    std::vector<std::uint16_t> used;
    for (std::size_t glyph = 0; glyph < m_Widths.size(); ++glyph) {
        if (m_Widths[glyph] >= 0) {
            used.push_back(static_cast<std::uint16_t>(glyph));
        }
    }
    return used;
}

PdfFont::Program PdfFont::MakeProgram() const
{
    Program program;
    std::vector<std::uint16_t> const used = UsedGlyphs();
    std::uint64_t hash = Kernel::HashBytes64(used.data(), used.size() * sizeof(used[0]));
    for (int i = 0; i < 6; ++i) {
        program.m_Tag += static_cast<char>('A' + hash % 26);
        hash /= 26;
    }

    InputPtr const input(hb_subset_input_create_or_fail());
    if (!input) {
        throw std::bad_alloc();
    }
    unsigned flags = HB_SUBSET_FLAGS_RETAIN_GIDS | HB_SUBSET_FLAGS_NOTDEF_OUTLINE;
    hb_set_t * glyphs = hb_subset_input_glyph_set(input.get());
    if (m_Face->MaySubset()) {
        // Hints serve screens of a past age and are half of some fonts' bytes.
        flags |= HB_SUBSET_FLAGS_NO_HINTING;
        for (std::uint16_t const glyph : used) {
            hb_set_add(glyphs, glyph);
        }
    } else {
        hb_set_invert(glyphs);
    }
    hb_subset_input_set_flags(input.get(), flags);
    hb_set_t * dropped = hb_subset_input_set(input.get(), HB_SUBSET_SETS_DROP_TABLE_TAG);
    for (hb_tag_t const tag : {HB_TAG('G', 'S', 'U', 'B'), HB_TAG('G', 'P', 'O', 'S'), HB_TAG('G', 'D', 'E', 'F'),
                               HB_TAG('n', 'a', 'm', 'e'), HB_TAG('O', 'S', '/', '2'), HB_TAG('p', 'o', 's', 't'),
                               HB_TAG('c', 'm', 'a', 'p'), HB_TAG('V', 'O', 'R', 'G'), HB_TAG('v', 'h', 'e', 'a'),
                               HB_TAG('v', 'm', 't', 'x'), HB_TAG('B', 'A', 'S', 'E'), HB_TAG('g', 'a', 's', 'p'),
                               HB_TAG('S', 'T', 'A', 'T'), HB_TAG('h', 'd', 'm', 'x'), HB_TAG('V', 'D', 'M', 'X'),
                               HB_TAG('D', 'S', 'I', 'G'), HB_TAG('F', 'F', 'T', 'M'), HB_TAG('k', 'e', 'r', 'n')}) {
        hb_set_add(dropped, tag);
    }

    // A face object of our own: subsetting may use one from two threads, but caches in the shared one are not ours.
    std::span<std::byte const> const data = m_Face->GetData();
    BlobPtr const blob(hb_blob_create(reinterpret_cast<char const *>(data.data()), static_cast<unsigned>(data.size()),
                                      HB_MEMORY_MODE_READONLY, nullptr, nullptr));
    FacePtr const source(hb_face_create(blob.get(), m_Face->GetIndex()));
    FacePtr const subset(hb_subset_or_fail(source.get(), input.get()));
    if (!subset) {
        throw std::runtime_error(
            Kernel::Format(Kernel::LocalisedString("The font %1 can't be cut down to the glyphs in use.", "Output"),
                           m_Face->GetPath())
                .ToStd());
    }
    program.m_IsCff = HasTable(*m_Face, HB_TAG('C', 'F', 'F', ' '));
    BlobPtr const result(program.m_IsCff ? hb_face_reference_table(subset.get(), HB_TAG('C', 'F', 'F', ' '))
                                         : hb_face_reference_blob(subset.get()));
    program.m_Bytes = BytesOf(result.get());
    return program;
}

std::string PdfFont::MakeToUnicode() const
{
    std::vector<std::uint16_t> const used = UsedGlyphs();
    std::vector<std::uint16_t> unmapped;
    for (std::uint16_t const glyph : used) {
        if (m_Texts[glyph] == Unknown) {
            unmapped.push_back(glyph);
        }
    }
    std::vector<char32_t> characters;
    if (!unmapped.empty()) {
        FindCharacters(*m_Face, unmapped, characters);
    }

    std::string text = "/CIDInit /ProcSet findresource begin\n12 dict begin\nbegincmap\n/CIDSystemInfo\n"
                       "<</Registry(Adobe)/Ordering(UCS)/Supplement 0>> def\n/CMapName/Adobe-Identity-UCS def\n"
                       "/CMapType 2 def\n1 begincodespacerange\n<0000><FFFF>\nendcodespacerange\n";
    // At most 100 entries a block (ISO 32000-2, 9.10.3, after the CMap rules).
    for (std::size_t start = 0; start < used.size(); start += 100) {
        std::size_t const count = std::min<std::size_t>(100, used.size() - start);
        AppendInteger(text, static_cast<std::int64_t>(count));
        text += " beginbfchar\n";
        for (std::size_t i = start; i < start + count; ++i) {
            char16_t single[1];
            std::u16string own(TextOf(used[i], single));
            if (own.empty()) {
                auto const place = std::lower_bound(unmapped.begin(), unmapped.end(), used[i]) - unmapped.begin();
                Kernel::AppendUtf16(own, characters[static_cast<std::size_t>(place)]);
            }
            AppendHexGlyph(text, used[i]);
            std::string value;
            AppendHexText(value, own);
            text += '<';
            // Without the byte order mark that other text strings have.
            text += std::string_view(value).substr(5);
            text += '\n';
        }
        text += "endbfchar\n";
    }
    text += "endcmap\nCMapName currentdict /CMap defineresource pop\nend\nend\n";
    return text;
}

std::string PdfFont::MakeWidths() const
{
    std::string text = "[";
    std::vector<std::uint16_t> const used = UsedGlyphs();
    for (std::size_t i = 0; i < used.size(); ++i) {
        bool const follows = i > 0 && used[i] == used[i - 1] + 1;
        if (!follows) {
            text += i > 0 ? "]" : "";
            AppendInteger(text, used[i]);
            text += '[';
        } else {
            text += ' ';
        }
        AppendThousandths(text, static_cast<Thousandths>(m_Widths[used[i]]) * 10);
    }
    text += used.empty() ? "]" : "]]";
    return text;
}

}
