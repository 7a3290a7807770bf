#pragma once

#include "framework/story/Colour.h"

#include <cstdint>

/// What a layout is made of: plain records in flat arrays, written to files as they lie in memory (little-endian).
///
/// Lengths are points. Positions are relative to the top left of the frame that an item stands in, y down. Items of
/// each array stand in the order of frames, and within a frame in reading order, so a frame names its items by the
/// first and their number. Indices into other arrays are checked when a layout is loaded.

namespace Story::LayoutItem
{

inline constexpr std::uint32_t None = 0xFFFFFFFF;

/// A glyph of a run. The pen moves right by the advance after each.
struct Glyph
{
    /// The glyph stands for a word space.
    static constexpr std::uint16_t Space = 0x8000;
    /// The glyph stands for no text: a hyphen at a break, a continuation sign, a leader.
    static constexpr std::uint16_t Synthetic = 0x4000;
    /// No installed font has the character.
    static constexpr std::uint16_t Missing = 0x2000;
    static constexpr std::uint16_t ClusterMask = 0x1FFF;

    std::uint16_t m_Glyph = 0;
    /// Flags, and in the lower bits the first unit that the glyph stands for, from the run's `m_TextStart`.
    std::uint16_t m_Text = 0;
    float m_Advance = 0;
};

/// Displacement of a glyph from its pen position, to the right and downwards, for runs that have such.
struct Offset
{
    float m_X = 0;
    float m_Y = 0;
};

/// Glyphs of one font, size, colour and direction on one line, left to right.
struct Run
{
    static constexpr std::uint16_t RightToLeft = 1;

    std::uint32_t m_FirstGlyph = 0;
    std::uint32_t m_GlyphCount = 0;
    /// First entry in the offsets, parallel to the glyphs, or None if no glyph is displaced.
    std::uint32_t m_FirstOffset = None;
    /// Stretch of the layout's text that the run shows.
    std::uint32_t m_TextStart = 0;
    std::uint32_t m_TextLength = 0;
    std::uint16_t m_Font = 0;
    std::uint16_t m_Colour = 0;
    std::uint16_t m_Flags = 0;
    std::uint16_t m_Role = 0; ///< `Role`.
    float m_Size = 0;
    /// Origin of the first glyph.
    float m_X = 0;
    float m_Baseline = 0;
    float m_Width = 0;
};

/// What a piece of content is, for structure in output.
enum class Role : std::uint16_t
{
    Text = 0,
    Heading = 1, ///< Its level is that of the line's heading.
    ListMarker = 2,
    NoteReference = 3,
    NoteNumber = 4,
    NoteText = 5,
    TableCell = 6,
    Code = 7,
    Quotation = 8,
    Caption = 9,
    Generated = 10 ///< Set by the layout itself: the notes' heading, the text in a missing picture's box.
};

/// A line of text: runs on one baseline.
struct Line
{
    /// The text of this line goes on in the next one without a space: a word was divided, with or without a hyphen.
    static constexpr std::uint32_t JoinsNext = 1;
    static constexpr std::uint32_t ParagraphEnd = 2;
    static constexpr std::uint32_t ParagraphBegin = 4;

    std::uint32_t m_FirstRun = 0;
    std::uint32_t m_RunCount = 0;
    /// Offset in the main story of the line's first unit; for lines of notes and cells, of the element that holds
    /// them.
    std::uint32_t m_StoryOffset = 0;
    std::uint32_t m_Flags = 0;
    float m_Left = 0;
    float m_Right = 0;
    float m_Baseline = 0;
    float m_Ascent = 0;
    float m_Descent = 0;
};

/// A filled or outlined rectangle behind or beside the text: backgrounds, borders, rules of tables, underlines.
/// Rectangles are drawn before the text of their frame, in their order.
struct Box
{
    enum class Kind : std::uint16_t
    {
        Background = 0,
        Border = 1,
        Rule = 2,       ///< A thematic break, or the rule over notes.
        TableRule = 3,
        Underline = 4,
        Strike = 5,     ///< Drawn after the text.
        MissingPicture = 6 ///< Outlined, with both diagonals, to be seen.
    };

    float m_Left = 0;
    float m_Top = 0;
    float m_Right = 0;
    float m_Bottom = 0;
    /// Fill, or colour of the outline.
    std::uint16_t m_Colour = 0;
    Kind m_Kind = Kind::Background;
    /// Width of the outline; 0 means filled.
    float m_Stroke = 0;
};

/// A picture, scaled into the rectangle.
struct Picture
{
    float m_Left = 0;
    float m_Top = 0;
    float m_Right = 0;
    float m_Bottom = 0;
    /// Index into the layout's strings: the document's picture item, and the text for who cannot see it.
    std::uint32_t m_DataId = 0;
    std::uint32_t m_AltText = 0;
    std::uint32_t m_StoryOffset = 0;
};

/// A frame that was used. The rectangle's place on its page is the caller's.
struct Frame
{
    float m_Width = 0;
    float m_Height = 0;
    /// Stretch of the main story that stands here; the same offset twice if there is only derived text (notes).
    std::uint32_t m_TextBegin = 0;
    std::uint32_t m_TextEnd = 0;
    std::uint32_t m_FirstLine = 0;
    std::uint32_t m_LineCount = 0;
    std::uint32_t m_FirstBox = 0;
    std::uint32_t m_BoxCount = 0;
    std::uint32_t m_FirstPicture = 0;
    std::uint32_t m_PictureCount = 0;
    std::uint32_t m_FirstLink = 0;
    std::uint32_t m_LinkCount = 0;
    /// Bottom of the lowest item; 0 if the frame is empty.
    float m_UsedHeight = 0;
};

/// A place.
struct Place
{
    std::uint32_t m_Frame = None;
    float m_X = 0;
    float m_Y = 0;
    [[nodiscard]] bool IsPlaced() const { return m_Frame != None; }
};

/// A clickable rectangle. A link that breaks over lines has one on each.
struct Link
{
    float m_Left = 0;
    float m_Top = 0;
    float m_Right = 0;
    float m_Bottom = 0;
    /// Index into the layout's hyperlinks, or None for a link within the layout.
    std::uint32_t m_Hyperlink = None;
    /// Index into the layout's notes for a link between a note and its reference, or None.
    std::uint32_t m_Note = None;
    /// With a note: the link stands at the note and leads back to the reference.
    std::uint32_t m_LeadsBack = 0;
};

/// A heading. The point is the top left of its first line.
struct Heading
{
    Place m_Place;
    std::uint32_t m_Level = 0;
    /// Index into the strings.
    std::uint32_t m_Text = 0;
    std::uint32_t m_StoryOffset = 0;
};

/// A note of the story, in the order of the references.
struct Note
{
    std::int32_t m_Number = 0;
    std::int32_t m_Kind = 0;
    std::uint32_t m_StoryOffset = 0;
    /// Top left of the reference and of the note's text.
    Place m_Reference;
    Place m_Text;
};

/// An index mark.
struct IndexMark
{
    Place m_Place;
    /// Index into the strings: the topic's full name.
    std::uint32_t m_Topic = 0;
    std::uint32_t m_StoryOffset = 0;
};

/// Something that the user should know.
struct Problem
{
    enum class Kind : std::uint32_t
    {
        MissingCharacter = 0, ///< `m_Text` is the character.
        MissingFamily = 1,    ///< `m_Text` is the family.
        OverfullLine = 2,
        PictureMissing = 3,   ///< `m_Text` is its path and the reason.
        Overset = 4,          ///< Text from `m_StoryOffset` on has no frame.
        Clipped = 5           ///< A piece is larger than its frame and is cut off.
    };
    Kind m_Kind = Kind::MissingCharacter;
    std::uint32_t m_StoryOffset = 0;
    std::uint32_t m_Text = 0;
};

}
