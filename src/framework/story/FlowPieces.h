#pragma once

#include "framework/story/FlowStyles.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/typeset/LineArena.h"

#include <cstdint>
#include <deque>
#include <string>
#include <vector>

/// What the composer puts together between the story and the frames. Internal to it.

namespace Story::Flow
{

inline constexpr std::uint32_t None = 0xFFFFFFFF;

/// What stands at a special element of a paragraph that takes part in its lines.
struct LineObject
{
    enum class Kind : std::uint8_t
    {
        Note,
        Field,
        Picture
    };
    Kind m_Kind = Kind::Note;
    /// Number of the note, or None.
    std::uint32_t m_Note = None;
    PictureGlyph const * m_Picture = nullptr;
    float m_Height = 0;
    /// What is set in its place.
    std::u16string m_Text;
};

/// A zero-width element whose place is a fact.
struct Mark
{
    enum class Kind : std::uint8_t
    {
        Anchor,
        Index
    };
    Kind m_Kind = Kind::Anchor;
    /// Offset in the paragraph's stretch of text.
    std::uint32_t m_Offset = 0;
    /// Number of the anchor.
    std::uint32_t m_Number = 0;
    IndexMarkGlyph const * m_Index = nullptr;
    std::uint32_t m_StoryOffset = 0;
};

/// Where the maker of pieces stands: what it makes next.
struct Cursor
{
    /// Paragraph of the main story; behind the last, the notes.
    std::uint32_t m_Paragraph = 0;
    /// Note, and paragraph of it; before the first note stands their heading.
    std::uint32_t m_Note = 0;
    std::uint32_t m_NoteParagraph = 0;
    bool m_HeadingIsMade = false;
    /// What the paragraph before asks for.
    bool m_KeepsWithNext = false;
    bool m_BreaksBeforeNext = false;
};

/// A stretch of a paragraph without block elements in it, or one block element.
struct Segment
{
    Story const * m_Story = nullptr;
    /// Of the segment's first unit in its story.
    std::uint32_t m_Begin = 0;
    std::uint32_t m_End = 0;
    /// The main story's offset: of `m_Begin`, or of the element that the story hangs on.
    std::uint32_t m_MainBegin = 0;
    bool m_IsMain = false;
    ParagraphFormat const * m_Format = nullptr;
    Decoration const * m_Decoration = nullptr;
    LayoutItem::Role m_Role = LayoutItem::Role::Text;
    /// Entries of `PieceMaker::m_StyleRefs`, parallel to the styles given to the paragraph builder.
    std::uint32_t m_FirstStyle = 0;
    std::uint32_t m_FirstObject = 0;
    std::vector<Mark> m_Marks;
    /// Marks before this one have been placed.
    std::uint32_t m_NextMark = 0;
    std::uint32_t m_FirstLine = 0;
    std::uint32_t m_LineCount = 0;
    /// Line of the list marker or note number, its left edge, and the text.
    std::uint32_t m_MarkerLine = None;
    float m_MarkerX = 0;
    float m_MarkerWidth = 0;
    float m_MarkerGap = 0;
    bool m_IsRightToLeft = false;
    std::u16string m_MarkerText;
    RunStyle const * m_MarkerStyle = nullptr;
    /// Note whose text begins here, or None.
    std::uint32_t m_Note = None;
    /// Its first line begins a heading that is a fact.
    bool m_IsHeading = false;
    /// Problems of the lines, in the arena.
    std::uint32_t m_FirstProblem = 0;
    std::uint32_t m_ProblemCount = 0;
    /// Where to begin again to make this segment anew.
    Cursor m_Cursor;
    /// Begins a paragraph of the main flow, so that it may be made anew.
    bool m_BeginsParagraph = false;
};

struct Row;

/// The smallest thing that is put into a frame as a whole.
struct Piece
{
    enum class Kind : std::uint8_t
    {
        Line,
        Picture,
        Rule,
        Row
    };
    enum class Break : std::uint8_t
    {
        Allowed,
        Forbidden,
        Forced
    };

    Kind m_Kind = Kind::Line;
    /// Whether a frame may end before this piece.
    Break m_Break = Break::Allowed;
    bool m_IsFirst = false; ///< Of its segment.
    bool m_IsLast = false;
    bool m_OnGrid = false;
    std::uint32_t m_Segment = 0;
    /// Line in the arena.
    std::uint32_t m_Line = 0;
    /// Story offset behind this piece in the main story.
    std::uint32_t m_MainEnd = 0;
    /// Lines: from the slot's top to the baseline and from there to the slot's bottom; others: the height and 0.
    float m_Above = 0;
    float m_Below = 0;
    /// Ink: the least that a line needs above its baseline at a frame's head and below it at the foot.
    float m_HeadAbove = 0;
    float m_FootBelow = 0;
    float m_SpaceBefore = 0;
    float m_SpaceAfter = 0;
    float m_Left = 0;
    float m_Width = 0;
    PictureGlyph const * m_Picture = nullptr;
    /// The row of a table; of a missing picture, one cell with the text in its box.
    Row * m_Row = nullptr;
};

/// A table on its way into frames.
struct Table
{
    struct Column
    {
        float m_Left = 0;
        float m_Width = 0;
    };
    std::vector<Column> m_Columns;
    float m_Left = 0;
    float m_Right = 0;
    float m_PaddingX = 0;
    float m_PaddingY = 0;
    std::uint16_t m_RuleColour = 0;
    /// Header rows, in order; set again where the table goes on.
    std::vector<Row *> m_Header;
    float m_HeaderHeight = 0;
};

struct Row
{
    struct Cell
    {
        std::vector<Piece> m_Pieces;
        /// Pieces before this one are in earlier frames, and those before `m_End` in this frame.
        std::size_t m_Next = 0;
        std::size_t m_End = static_cast<std::size_t>(-1);
    };
    Table * m_Table = nullptr;
    std::vector<Cell> m_Cells;
    float m_Height = 0;
    bool m_IsHeader = false;
    bool m_IsLastOfHeader = false;
    bool m_IsLastOfTable = false;
};

/// Where a piece stands in a frame.
struct Placement
{
    float m_Top = 0;
    float m_Baseline = 0;
    float m_Bottom = 0;
    /// What may not lie below the frame's edge.
    float m_InkBottom = 0;
    /// Goes on in the background or border of the piece above.
    bool m_IsJoined = false;
};

/// The running position in a frame, a cell, or whatever pieces are stacked in.
struct Stack
{
    float m_Y = 0;
    float m_SpaceAfter = 0;
    float m_GridStep = 0;
    float m_GridOffset = 0;
    bool m_IsEmpty = true;
    Decoration const * m_Decoration = nullptr;

    /// Where `piece` comes to stand.
    [[nodiscard]] Placement Place(Piece const & piece, Decoration const * decoration) const;
    /// The piece goes on in the background or border of the piece before it.
    [[nodiscard]] bool IsJoined(Piece const & piece, Decoration const * decoration) const;
    [[nodiscard]] float GapBefore(Piece const & piece) const;
    /// Goes on behind it.
    void Advance(Piece const & piece, Decoration const * decoration, Placement const & placement);
};

using FlowSegments = std::deque<Segment>;

/// Height of what of the row is not yet in a frame, with padding.
[[nodiscard]] float RowHeight(Row const & row, FlowSegments const & segments);

}
