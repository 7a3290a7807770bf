#pragma once

#include "framework/kernel/Counted.h"
#include "framework/typeset/TextStyle.h"

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace Typeset
{

enum class Alignment : std::uint8_t
{
    Justified,
    Start, ///< Left in left-to-right paragraphs, right in others.
    Centre,
    End,
    Left,
    Right
};

enum class Direction : std::uint8_t
{
    LeftToRight,
    RightToLeft,
    FromText ///< By the first strong character (UAX #9 P2, P3), else left to right.
};

enum class BreakMode : std::uint8_t
{
    TotalFit, ///< The best set of breaks for the paragraph as a whole.
    Greedy,   ///< Each line as full as it goes.
    Code      ///< Each line as it stands, all spaces kept; what is too long is wrapped and marked with a sign.
};

enum class TabAlignment : std::uint8_t
{
    Start,
    Centre,
    End,
    Decimal ///< On the first full stop or comma.
};

struct TabStop
{
    double m_Position = 0; ///< Points from the paragraph's edge, before indents.
    TabAlignment m_Alignment = TabAlignment::Start;
    char32_t m_Leader = 0; ///< Repeated to fill the gap; 0 = nothing.
};

/// The room of one line: from the left edge of the column, before the paragraph's own indents are applied.
struct LineRoom
{
    double m_Left = 0;
    double m_Width = 0;
};

/// How a paragraph is broken into lines. Lengths in points. The defaults suit book text in one column.
struct ParagraphSettings
{
    double m_Width = 0; ///< Of the column. Zero or less: every line holds one unbreakable piece.
    /// Rooms of the first lines, where they differ from the column; later lines have {0, m_Width}, or the last room
    /// given if m_LastRoomRepeats.
    std::vector<LineRoom> m_Rooms;
    bool m_LastRoomRepeats = false;

    double m_StartIndent = 0; ///< Of all lines, at the side where reading starts.
    double m_EndIndent = 0;
    double m_FirstLineIndent = 0; ///< Added to m_StartIndent in the first line; negative hangs.
    Alignment m_Alignment = Alignment::Justified;
    Alignment m_LastLineAlignment = Alignment::Start; ///< Of the last line of a justified paragraph.
    Direction m_Direction = Direction::FromText;
    BreakMode m_Mode = BreakMode::TotalFit;

    // Spaces between words of a justified line, as multiples of the font's space.
    double m_SpaceMinimum = 0.75;
    double m_SpaceMaximum = 1.5;
    // Letter spacing that a justified line may add where its spaces reach their limits, in thousandths of the em.
    double m_LetterSpaceMinimum = 0;
    double m_LetterSpaceMaximum = 0;

    bool m_Hyphenate = true;
    int m_HyphenLimit = 3;           ///< Hyphenated lines in a row; 0 = no limit.
    double m_HyphenPenalty = 50;     ///< 0 = as good as a space, 10,000 = never.
    double m_Tolerance = 400;        ///< Badness that a line may have before an emergency pass (Knuth and Plass).
    double m_MinimumLastLine = 18;   ///< A last line shorter than this is avoided.
    double m_Protrusion = 0;         ///< Share of optical margin alignment: 0 none, 1 full.
    double m_DefaultTab = 36;        ///< Distance of the stops after the last of m_Tabs.
    std::vector<TabStop> m_Tabs;     ///< Ascending.
    char32_t m_ContinuationSign = 0x21AA; ///< Set at the end of a wrapped line of code; 0 = none.
};

/// What stands at one U+FFFC of the text. A U+FFFC without one takes no room and is not there for shaping, breaking
/// or hyphenation: "rab\uFFFCbit" is one word. (Anchors and index marks are such.)
struct InlineObject
{
    std::uint32_t m_Position = 0; ///< Of the U+FFFC in the text.
    /// Text to set in its place, in the style of the object's run (a note's number, a field); empty for a box. All
    /// its glyphs have the object's position as cluster. Borrowed until the paragraph is built.
    std::u16string_view m_Text;
    double m_Width = 0; ///< Of a box, in points.
    double m_Ascent = 0;
    double m_Descent = 0;
    bool m_Attached = false; ///< No line break before it (a note's reference).
};

/// A stretch of text in one style. Runs follow each other without gaps.
struct StyleRun
{
    std::uint32_t m_End = 0;   ///< Offset after its last code unit.
    std::uint32_t m_Style = 0; ///< Index into ParagraphInput::m_Styles, handed back in each glyph run.
};

/// One paragraph. Everything is borrowed for the call. Text offsets are in UTF-16 code units, everywhere.
///
/// U+2028, U+000B and U+000C end a line inside the paragraph, as do U+000A, U+000D and U+2029; at the very end of
/// the text they open no further line. U+0009 goes to the next tab stop, U+00AD is a place for a hyphen. Other control
/// characters set nothing. An unpaired surrogate is set as U+FFFD.
struct ParagraphInput
{
    std::u16string_view m_Text;
    std::span<StyleRun const> m_Runs; ///< Text after the last run has its style. With no runs: style 0.
    std::span<Kernel::Counted<TextStyle const> const> m_Styles; ///< At least one.
    std::span<InlineObject const> m_Objects;                    ///< Ascending by position.
    ParagraphSettings const * m_Settings = nullptr;             ///< Null: the defaults.
};

}
