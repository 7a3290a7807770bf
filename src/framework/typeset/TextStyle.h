#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"

#include <cstdint>
#include <vector>

namespace Typeset
{

/// An OpenType feature by tag, with its value (0 off, 1 on, more: which alternate).
struct FontFeature
{
    char m_Tag[4] = {};
    std::uint32_t m_Value = 1;
    friend bool operator==(FontFeature const &, FontFeature const &) noexcept = default;
};

enum class Capitals : std::uint8_t
{
    AsTyped,
    SmallCaps,    ///< Lower case as small capitals. By feature, else by scaling.
    AllSmallCaps, ///< Upper case too.
    AllCaps       ///< Upper-cased by the rules of the language; offsets stay those of the text.
};

enum class FigureStyle : std::uint8_t
{
    FontDefault,
    Lining,
    OldStyle
};

enum class FigureSpacing : std::uint8_t
{
    FontDefault,
    Proportional,
    Tabular
};

enum class ScriptPosition : std::uint8_t
{
    Normal,
    Superscript, ///< The font's own superiors if it has one for each character, else scaled and raised.
    Subscript
};

/// How a stretch of characters is to look, as far as its shape and width go. Immutable once it is handed to a
/// builder, which remembers by address what it found for the style: share one object between all the text that looks
/// alike.
class TextStyle : public Kernel::Countable
{
public:
    std::vector<String> m_Families; ///< In order of preference.
    String m_Language;              ///< BCP 47. Empty: not known, so no hyphenation.
    double m_Size = 10;             ///< Points.
    int m_Weight = 400;             ///< 100 to 900.
    double m_Tracking = 0;          ///< Added after each cluster, in thousandths of the em.
    double m_BaselineShift = 0;     ///< Points; positive raises.
    std::vector<FontFeature> m_Features;
    Capitals m_Capitals = Capitals::AsTyped;
    FigureStyle m_Figures = FigureStyle::FontDefault;
    FigureSpacing m_FigureSpacing = FigureSpacing::FontDefault;
    ScriptPosition m_Position = ScriptPosition::Normal;
    bool m_Italic = false;
    bool m_Ligatures = true; ///< The common ones; tracking switches them off too.
    bool m_Kerning = true;
    bool m_Hyphenate = true; ///< False for code, addresses and names.
    bool m_NoBreak = false;  ///< No line break between two characters of this style, spaces included.
};

}
