#pragma once

#include <cstdint>

/// The attributes of text, by type. The numbers are written in files: they stay, and new ones are added behind.
///
/// An attribute that nothing sets has the value that the format structures (`GlyphFormat`, `ParagraphFormat`) start
/// with.

namespace Story::GlyphAtt
{

enum Int : int
{
    Weight = 0,      ///< 100 to 900, as fonts count; 400 is regular, 700 bold.
    Italic = 1,      ///< 0 or 1.
    Underline = 2,   ///< 0 or 1.
    Strike = 3,      ///< 0 or 1.
    Position = 4,    ///< `VerticalPosition`.
    Hyphenate = 5,   ///< 0 or 1: whether words may be divided; code sets 0.
    Ligatures = 6,   ///< 0 or 1: whether standard ligatures are formed.
    SmallCaps = 7,   ///< 0 or 1.
};

enum Double : int
{
    Size = 0,            ///< Points.
    Tracking = 1,        ///< Added after each glyph, in thousandths of the size.
    SizeFactor = 3,      ///< Multiplies the paragraph's size, for code that has to match the text's x-height.
};

enum String : int
{
    Style = 0,    ///< Name of the character style.
    Families = 1, ///< Font families in order of preference, separated by commas.
    Language = 2, ///< BCP 47 tag, such as "en-GB".
    Features = 3, ///< OpenType features, as in "onum,-liga,ss01=2".
};

enum Colour : int
{
    Text = 0,
    Background = 1, ///< Behind the glyphs; nothing is drawn if it is not set.
};

/// Values of `Position`.
enum VerticalPosition : int
{
    OnBaseline = 0,
    Superscript = 1,
    Subscript = 2
};

}

namespace Story::ParagraphAtt
{

enum Int : int
{
    Alignment = 0,        ///< `AlignmentKind`.
    KeepWithNext = 1,     ///< 0 or 1: the last line stands with the first line of the next paragraph.
    KeepTogether = 2,     ///< 0 or 1: no break inside.
    Orphans = 3,          ///< Least lines at the foot of a frame before a break; 2.
    Widows = 4,           ///< Least lines at the head of a frame after a break; 2.
    Hyphenate = 5,        ///< 0 or 1.
    AlignToGrid = 6,      ///< 0 or 1: baselines sit on the frame's grid.
    PageBreakBefore = 7,  ///< 0 or 1: begins a new frame, unless it is the first thing in the flow.
    OutlineLevel = 8,     ///< 1 to 6 for headings, 0 for other text.
    TabSize = 9,          ///< Width of a tab in spaces, for code.
    MarkWraps = 10,       ///< 0 or 1: lines that were too long and run over are marked, as code wants it.
    BorderSides = 11,     ///< Bits of `BorderSide`.
    KeepWithPrevious = 12,///< 0 or 1: a caption below its picture.
    CollatedEndnotes = 18 ///< 0 or 1: the paragraph belongs to the collated notes of a book.
};

enum Double : int
{
    LeftIndent = 0,      ///< Points from the frame's left edge.
    RightIndent = 1,     ///< Points from the frame's right edge.
    FirstLineIndent = 2, ///< Points, relative to the left indent; negative hangs.
    SpaceBefore = 3,     ///< Points; dropped at the head of a frame.
    SpaceAfter = 4,      ///< Points. Between two paragraphs the larger of after and before counts.
    Leading = 5,         ///< Baseline to baseline in points; 0 means 1.2 times the size.
    Padding = 6,         ///< Points between a background's edge and the text.
    BorderWidth = 7,     ///< Points.
    ListIndent = 8,      ///< Points added to the left indent for each list level, the first included.
};

enum String : int
{
    Style = 0, ///< Name of the paragraph style.
};

enum Colour : int
{
    Background = 0, ///< Filled behind the paragraph from indent to indent; neighbours of one style join.
    Border = 1,
};

/// Values of `Alignment`. Left and right are the reading direction's start and end.
enum AlignmentKind : int
{
    Left = 0,
    Centre = 1,
    Right = 2,
    Justify = 3
};

enum BorderSide : int
{
    BorderLeft = 1,
    BorderTop = 2,
    BorderRight = 4,
    BorderBottom = 8
};

}
