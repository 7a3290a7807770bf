#pragma once

#include "framework/kernel/Counted.h"
#include "framework/typeset/FontFace.h"

#include <cstdint>
#include <span>
#include <vector>

namespace Typeset
{

/// One glyph, placed. Lengths in points.
struct PlacedGlyph
{
    enum Flags : std::uint16_t
    {
        Space = 1,     ///< Stands for a word space (its advance holds the line's justification).
        Synthetic = 2, ///< Stands for no text: hyphen at a break, leader, continuation sign.
        Missing = 4    ///< The face's glyph for "not here": no installed font has the character.
    };

    std::uint16_t m_Glyph = 0;
    std::uint16_t m_Flags = 0;
    std::uint32_t m_Cluster = 0; ///< Offset in the paragraph's text of the first code unit that the glyph stands for.
    float m_Advance = 0;         ///< To the next glyph's origin, always to the right.
    float m_OffsetX = 0;         ///< From the pen to the origin, to the right.
    float m_OffsetY = 0;         ///< The same, downwards.
};

/// Glyphs of one face, size, style and direction, from left to right; or one box.
struct GlyphRun
{
    static constexpr std::uint32_t NoObject = 0xFFFFFFFF;

    std::uint32_t m_FirstGlyph = 0; ///< Index into LineArena::m_Glyphs.
    std::uint32_t m_GlyphCount = 0;
    std::uint32_t m_TextStart = 0; ///< The stretch of text that it shows; clusters ascend, or descend at odd levels.
    std::uint32_t m_TextEnd = 0;
    std::uint32_t m_Style = 0;           ///< Index of the style in the input.
    std::uint32_t m_Object = NoObject;   ///< Index of the object in the input: a box, or the text set in its place.
    std::uint16_t m_Face = 0;            ///< Index into LineArena::m_Faces. Not used by a box.
    std::uint8_t m_Level = 0;            ///< Bidirectional embedding level; odd = right to left.
    std::uint8_t m_IsBox = 0;
    float m_Size = 0;                    ///< Points to the em, after any scaling for superscripts or small capitals.
    float m_X = 0;                       ///< Left edge, from the left edge of the column.
    float m_Width = 0;
    float m_Rise = 0;                    ///< Baseline shift upwards.
};

/// One line, runs in visual order from left to right.
struct Line
{
    enum Flags : std::uint16_t
    {
        Hyphenated = 1,  ///< A hyphen was added at the end.
        ForcedBreak = 2, ///< Ends with a forced line break.
        LastLine = 4,
        FirstLine = 8,
        Overfull = 16, ///< Wider than its room.
        Wrapped = 32,  ///< Of code: goes on in the next line.
        Justified = 64
    };

    std::uint32_t m_TextStart = 0; ///< Lines cover the text without gaps; spaces at a break belong to the line before.
    std::uint32_t m_TextEnd = 0;
    std::uint32_t m_FirstRun = 0; ///< Index into LineArena::m_Runs.
    std::uint32_t m_RunCount = 0;
    float m_X = 0;            ///< Left edge of the content, from the left edge of the column.
    float m_NaturalWidth = 0; ///< Before justification, without the spaces at the break.
    float m_SetWidth = 0;     ///< As set.
    float m_Ascent = 0;       ///< Of the tallest run or box, from the baseline; baseline shifts included.
    float m_Descent = 0;      ///< Positive downwards.
    float m_FontSize = 0;     ///< Largest em of the line, superscripts by their full size; of a style if it is empty.
    float m_SpaceRatio = 0;   ///< Set spaces: 1 = at the maximum, 0 = natural, -1 = at the minimum.
    std::uint16_t m_Flags = 0;
};

/// Something that the user should know of.
struct LayoutProblem
{
    enum class Kind : std::uint8_t
    {
        MissingCharacter, ///< No installed font has it.
        MissingFamily,    ///< None of the style's first choice is installed; a substitute was used.
        OverfullLine      ///< A line could not be broken to fit.
    };
    Kind m_Kind = Kind::MissingCharacter;
    std::uint32_t m_Position = 0; ///< Offset in the text.
    std::uint32_t m_Style = 0;
    char32_t m_Character = 0; ///< For MissingCharacter.
};

/// Composed lines of one paragraph or of many, in flat vectors. A builder appends; offsets in the text are those of
/// the paragraph that a line belongs to. Move or copy it freely; not locked.
struct LineArena
{
    std::vector<Line> m_Lines;
    std::vector<GlyphRun> m_Runs;
    std::vector<PlacedGlyph> m_Glyphs;
    std::vector<Kernel::Counted<FontFace const>> m_Faces; ///< Each once.
    std::vector<LayoutProblem> m_Problems;                ///< Each character and style once a paragraph.

    void Clear()
    {
        m_Lines.clear();
        m_Runs.clear();
        m_Glyphs.clear();
        m_Faces.clear();
        m_Problems.clear();
    }
    [[nodiscard]] std::span<GlyphRun const> RunsOf(Line const & line) const
    {
        return std::span(m_Runs).subspan(line.m_FirstRun, line.m_RunCount);
    }
    [[nodiscard]] std::span<PlacedGlyph const> GlyphsOf(GlyphRun const & run) const
    {
        return std::span(m_Glyphs).subspan(run.m_FirstGlyph, run.m_GlyphCount);
    }
};

}
