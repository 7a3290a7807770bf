#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/typeset/ContentHash.h"

#include <cstdint>
#include <mutex>
#include <span>

struct hb_blob_t;
struct hb_face_t;
struct hb_font_t;

namespace Typeset
{

/// Measures of a face in its own units (GetUnitsPerEm to the em), y up. Ascent and cap height are positive, descent is
/// positive downwards. What the file does not tell is estimated from its glyphs or from the em.
struct FaceMetrics
{
    int m_UnitsPerEm = 1000;
    int m_Ascent = 800;
    int m_Descent = 200;
    int m_LineGap = 0;
    int m_CapHeight = 700;
    int m_XHeight = 450;
    int m_UnderlinePosition = -100; ///< Middle of the stroke; negative = below the baseline.
    int m_UnderlineThickness = 50;
    int m_StrikePosition = 250; ///< Middle of the stroke.
    int m_StrikeThickness = 50;
    int m_SuperscriptRise = 350;
    int m_SuperscriptSize = 600; ///< Height of a scaled superscript's em.
    int m_SubscriptDrop = 150;
    int m_SubscriptSize = 600;
    double m_ItalicAngle = 0; ///< Degrees anticlockwise from the vertical: negative leans to the right.
    int m_BoxLeft = 0;        ///< Bounding box of all glyphs (head table).
    int m_BoxBottom = 0;
    int m_BoxRight = 0;
    int m_BoxTop = 0;
};

/// Whether a word's shape may depend on the spaces beside it.
enum class SpaceUse : std::uint8_t
{
    None,
    Neighbour,   ///< It is kerned, or decides how the letter beside it looks.
    Substitution ///< It is replaced, perhaps together with others: such text must be shaped in one go.
};

/// Receives a glyph's outline in font units, y up.
class OutlineSink
{
public:
    virtual ~OutlineSink() = default;
    virtual void MoveTo(double x, double y) = 0;
    virtual void LineTo(double x, double y) = 0;
    virtual void QuadTo(double controlX, double controlY, double x, double y) = 0;
    virtual void CubicTo(double control1X, double control1Y, double control2X, double control2Y, double x,
                         double y) = 0;
    virtual void Close() = 0;
};

/// One face of a font file. Made by FontLibrary, which hands out one object for each (content, index), so that faces
/// may be compared by address. Immutable: every operation may be called from any thread at once.
class FontFace : public Kernel::Countable
{
public:
    /// Reads a font file (OpenType with TrueType or CFF outlines). Null if it is not one. FontLibrary is the way to
    /// get a face; this one knows nothing of faces that are already loaded.
    [[nodiscard]] static Kernel::Counted<FontFace const> Load(String const & path, unsigned index);

    ~FontFace() override;

    [[nodiscard]] String const & GetPath() const noexcept { return m_Path; }
    /// Position in a collection file; 0 in a plain font.
    [[nodiscard]] unsigned GetIndex() const noexcept { return m_Index; }
    /// Fingerprint of the whole file.
    [[nodiscard]] ContentHash const & GetHash() const noexcept { return m_Hash; }

    /// Typographic family (name 16, else 1), subfamily (17, else 2), and PostScript name (6); English where there is a
    /// choice. Never empty.
    [[nodiscard]] String const & GetFamily() const noexcept { return m_Family; }
    [[nodiscard]] String const & GetSubfamily() const noexcept { return m_Subfamily; }
    [[nodiscard]] String const & GetPostScriptName() const noexcept { return m_PostScriptName; }

    [[nodiscard]] FaceMetrics const & GetMetrics() const noexcept { return m_Metrics; }
    [[nodiscard]] int GetUnitsPerEm() const noexcept { return m_Metrics.m_UnitsPerEm; }
    [[nodiscard]] unsigned GetGlyphCount() const noexcept { return m_GlyphCount; }
    /// As in the OS/2 table: 400 regular, 700 bold.
    [[nodiscard]] int GetWeight() const noexcept { return m_Weight; }
    [[nodiscard]] bool IsItalic() const noexcept { return m_Italic; }
    [[nodiscard]] bool IsMonospaced() const noexcept { return m_Monospaced; }
    /// Outlines are cubic (CFF or CFF2 table) and not quadratic (glyf table).
    [[nodiscard]] bool HasCffOutlines() const noexcept { return m_Cff; }

    /// OS/2 fsType (OpenType specification, OS/2, "fsType").
    [[nodiscard]] std::uint16_t GetEmbeddingFlags() const noexcept { return m_EmbeddingFlags; }
    /// False for "restricted licence embedding" and "bitmap embedding only".
    [[nodiscard]] bool MayEmbed() const noexcept;
    /// False for "no subsetting": such a font may only be embedded whole.
    [[nodiscard]] bool MaySubset() const noexcept;

    /// Glyph of a code point; 0 when the face has none, or has one for a letter that is empty.
    [[nodiscard]] std::uint32_t GetGlyph(char32_t character) const noexcept;
    [[nodiscard]] bool HasGlyph(char32_t character) const noexcept { return GetGlyph(character) != 0; }
    /// Horizontal advance in font units.
    [[nodiscard]] int GlyphAdvance(std::uint32_t glyph) const noexcept;
    /// Sends the outline to the sink; nothing for a glyph without one (a space, a bitmap).
    void DrawGlyph(std::uint32_t glyph, OutlineSink & sink) const;

    /// The GSUB table has this feature (four-character tag) in any script.
    [[nodiscard]] bool HasFeature(char const * tag) const noexcept;
    /// How the space takes part in the layout tables. Found out at the first call.
    [[nodiscard]] SpaceUse GetSpaceUse() const;

    /// Bytes of the whole file, mapped for the life of the face.
    [[nodiscard]] std::span<std::byte const> GetData() const noexcept;

    /// HarfBuzz objects, immutable; the font's scale is the units per em. Borrowed: the face owns them.
    [[nodiscard]] hb_face_t * GetHbFace() const noexcept { return m_HbFace; }
    [[nodiscard]] hb_font_t * GetHbFont() const noexcept { return m_HbFont; }

private:
    FontFace() = default;
    void ReadTables();
    void ReadMetrics();
    [[nodiscard]] SpaceUse FindSpaceUse() const;

    String m_Path;
    String m_Family;
    String m_Subfamily;
    String m_PostScriptName;
    ContentHash m_Hash;
    FaceMetrics m_Metrics;
    hb_blob_t * m_Blob = nullptr;
    hb_face_t * m_HbFace = nullptr;
    hb_font_t * m_HbFont = nullptr;
    unsigned m_Index = 0;
    unsigned m_GlyphCount = 0;
    int m_Weight = 400;
    std::uint16_t m_EmbeddingFlags = 0;
    bool m_Italic = false;
    bool m_Monospaced = false;
    bool m_Cff = false;
    mutable std::once_flag m_SpaceOnce;
    mutable SpaceUse m_SpaceUse = SpaceUse::None; ///< Valid after m_SpaceOnce.
};

}
