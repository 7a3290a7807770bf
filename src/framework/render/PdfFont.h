#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "framework/kernel/Counted.h"
#include "framework/typeset/FontFace.h"

namespace Renderer::RenderTree
{

/// One face in the file: which glyphs are used, and what text each of them stands for. Glyph ids stay as they are in the
/// face (Type 0 font, Identity-H), so that pages can be written before the set of glyphs is known.
class PdfFont
{
public:
    /// Widths are whole hundredths of a thousandth of the em.
    using Width = std::int32_t;
    static constexpr Width EmWidth = 100000;

    /// `name` is the resource name, such as "F1".
    PdfFont(Kernel::Counted<Typeset::FontFace const> face, std::string name);

    [[nodiscard]] Typeset::FontFace const & GetFace() const { return *m_Face; }
    [[nodiscard]] std::string const & GetName() const { return m_Name; }

    /// False if the face may not or can't be embedded; its glyphs are then drawn as outlines.
    [[nodiscard]] bool IsEmbedded() const { return m_Embedded; }
    /// True if `IsEmbedded` is false because the licence bits say so.
    [[nodiscard]] bool IsForbidden() const { return !m_Face->MayEmbed(); }

    /// The glyph itself, or 0 for one that the face does not have.
    [[nodiscard]] std::uint16_t Checked(std::uint16_t glyph) const { return glyph < m_Widths.size() ? glyph : 0; }

    /// The width that the file will state for the glyph. Marks the glyph as used.
    Width Use(std::uint16_t glyph)
    {
        Width & width = m_Widths[glyph];
        return width >= 0 ? width : Measure(glyph);
    }

    /// Says that the glyph stands for this text. True if a reader will see so: the glyph stood for nothing or for the
    /// same before. False if it stands for another text elsewhere; the text must then be given beside the glyph.
    bool Map(std::uint16_t glyph, char16_t text)
    {
        std::uint32_t & known = m_Texts[glyph];
        if (known == Unknown) {
            known = text;
        }
        return known == text;
    }
    bool Map(std::uint16_t glyph, std::u16string_view text);

    /// The font program of the used glyphs.
    struct Program
    {
        /// The bytes of a CFF table, or of a TrueType file.
        std::string m_Bytes;
        bool m_IsCff = false;
        /// Six letters that tell this subset from others, from the set of glyphs.
        std::string m_Tag;
    };
    /// Throws std::runtime_error with a sentence if the face can't be cut down.
    [[nodiscard]] Program MakeProgram() const;

    /// The ToUnicode map (ISO 32000-2, 9.10.3). Used glyphs that never stood for a text get the character that the face
    /// has them for.
    [[nodiscard]] std::string MakeToUnicode() const;

    /// The W array's text.
    [[nodiscard]] std::string MakeWidths() const;

private:
    static constexpr std::uint32_t Unknown = 0xFFFFFFFF;
    /// Texts of more than one unit are numbers from here into `m_LongTexts`.
    static constexpr std::uint32_t LongText = 0x10000;

    Width Measure(std::uint16_t glyph);
    [[nodiscard]] std::u16string_view TextOf(std::uint16_t glyph, char16_t (&single)[1]) const;
    [[nodiscard]] std::vector<std::uint16_t> UsedGlyphs() const;

    Kernel::Counted<Typeset::FontFace const> m_Face;
    std::string m_Name;
    bool m_Embedded = true;
    /// By glyph; -1 is not used.
    std::vector<Width> m_Widths;
    std::vector<std::uint32_t> m_Texts;
    std::vector<std::u16string> m_LongTexts;
};

}
