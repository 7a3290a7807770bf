#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/FlowPieces.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/TableGlyph.h"
#include "framework/typeset/ParagraphBuilder.h"

#include <deque>
#include <unordered_map>

namespace Story::Flow
{

/// Makes pieces from a story, paragraph by paragraph, and after it from its notes. Internal to the composer.
class PieceMaker
{
public:
    PieceMaker(Story const & story, StyleSheet const & styles, ComposeOptions const & options,
               Typeset::LineArena & arena, LayoutBuilder & layout);

    /// Measure and height of the frames that pieces are made for from now on.
    void SetFrame(float width, float height);
    /// Appends the pieces of the next paragraph. False at the end of everything.
    bool MakeMore(std::vector<Piece> & pieces);
    /// Goes back to the paragraph that `piece` begins: it and what follows will be made anew.
    void RewindTo(Piece const & piece);
    /// The piece begins a paragraph of the flow.
    [[nodiscard]] bool IsParagraphBegin(Piece const & piece) const
    {
        return piece.m_IsFirst && m_Segments[piece.m_Segment].m_BeginsParagraph;
    }

    [[nodiscard]] FlowSegments const & GetSegments() const { return m_Segments; }
    [[nodiscard]] Segment & GetSegment(Piece const & piece) { return m_Segments[piece.m_Segment]; }
    [[nodiscard]] RunStyle const & GetRunStyle(Segment const & segment, std::uint32_t style) const
    {
        return *m_StyleRefs[segment.m_FirstStyle + style];
    }
    [[nodiscard]] LineObject const & GetObject(Segment const & segment, std::uint32_t object) const
    {
        return m_Objects[segment.m_FirstObject + object];
    }
    /// Marks that no text came behind.
    [[nodiscard]] std::vector<Mark> const & GetPendingMarks() const { return m_PendingMarks; }

private:
    /// Circumstances of a paragraph: in the main text, a note, a cell.
    struct Context
    {
        float m_Width = 0;
        float m_Height = 0;
        bool m_IsMain = false;
        bool m_IsCell = false;
        /// Main offset of everything in a nested story.
        std::uint32_t m_MainOffset = 0;
        char const * m_FallbackStyle = "";
        LayoutItem::Role m_Role = LayoutItem::Role::Text;
        std::optional<ParagraphAtt::AlignmentKind> m_Alignment;
        /// Note that begins with this paragraph, and the room for its number.
        std::uint32_t m_Note = None;
        float m_NoteIndent = 0;
    };
    /// Edges of a paragraph's text within the measure.
    struct Edges
    {
        float m_Left = 0;
        float m_Right = 0;
        float m_First = 0;
        float m_MarkerRoom = 0;
    };

    void CountNotesAndAnchors(Story const & story, std::uint32_t mainOffset, bool isMain);
    /// Numbers of a story's list items, by paragraph.
    [[nodiscard]] std::vector<int> const & GetListNumbers(Story const & story);
    void NumberNotes();
    bool MakeNext(std::vector<Piece> & pieces);
    void MakeNotesHeading(std::vector<Piece> & pieces);
    void MakeParagraph(Story const & story, std::size_t index, Context const & context, std::vector<Piece> & pieces);
    void MakeText(Segment segment, std::size_t paragraph, ParagraphStyle const & style, Context const & context,
                  std::vector<Piece> & pieces);
    void MakePicture(Segment segment, PictureGlyph const & picture, ParagraphStyle const & style,
                     Context const & context, std::vector<Piece> & pieces);
    void MakeRule(Segment segment, ParagraphStyle const & style, Context const & context, std::vector<Piece> & pieces);
    void MakeTable(Segment segment, TableGlyph const & table, ParagraphStyle const & style, Context const & context,
                   std::vector<Piece> & pieces);
    /// Divides `available` among the columns; sets the scale of the text where it cannot fit otherwise.
    void FitColumns(Table & table, TableGlyph const & source, Context const & cell, float available);
    /// Widths of the columns with padding, each the widest of its cells set with `width`.
    [[nodiscard]] std::vector<float> MeasureColumns(Table const & table, TableGlyph const & source,
                                                    Context const & cell, double width);

    /// Breaks a stretch into lines with `settings`, filling the segment's styles, objects and lines.
    void BreakLines(Segment & segment, ParagraphStyle const & style, Typeset::ParagraphSettings const & settings,
                    Context const & context, Typeset::LineArena & arena);
    /// Width of the widest line of a story set with `width`.
    [[nodiscard]] float MeasureStory(Story const & story, Context const & context, double width);
    [[nodiscard]] Edges GetEdges(Story const & story, std::size_t paragraph, ParagraphStyle const & style,
                                 Context const & context) const;
    /// Sets the marker of a list item or the number of a note beside the segment's first line.
    void SetMarker(Segment & segment, Edges & edges, std::size_t paragraph, ParagraphStyle const & style);
    [[nodiscard]] Typeset::ParagraphSettings MakeSettings(ParagraphStyle const & style, Edges const & edges,
                                                          Context const & context) const;
    [[nodiscard]] Kernel::SizeT<double> FitPicture(PictureGlyph const & picture, double width, double height) const;
    std::uint32_t KeepSegment(Segment segment);

    Story const & m_Story;
    StyleSheet const & m_Sheet;
    ComposeOptions const & m_Options;
    Typeset::ParagraphBuilder m_Builder;
    Typeset::LineArena & m_Arena;
    Typeset::LineArena m_Scratch;
    LayoutBuilder & m_Layout;
    FlowStyles m_Styles;
    float m_Width = 0;
    float m_Height = 0;

    Cursor m_Cursor;
    /// The cursor before the paragraph whose marks are pending, or before the one that is being made.
    Cursor m_BeginCursor;
    std::vector<Mark> m_PendingMarks;

    FlowSegments m_Segments;
    std::vector<RunStyle const *> m_StyleRefs;
    std::deque<LineObject> m_Objects;
    std::deque<Table> m_Tables;
    std::deque<Row> m_Rows;

    struct NoteEntry
    {
        NoteReferenceGlyph const * m_Glyph = nullptr;
        std::uint32_t m_MainOffset = 0;
        std::u16string m_Number;
    };
    std::vector<NoteEntry> m_Notes;
    std::unordered_map<Glyph const *, std::uint32_t> m_NoteNumbers;
    std::unordered_map<Glyph const *, std::uint32_t> m_AnchorNumbers;
    std::unordered_map<Story const *, std::vector<int>> m_ListNumbers;
    float m_NoteIndent = 0;
    Kernel::Counted<Story> m_NotesHeading;
    std::vector<Kernel::Counted<Story const>> m_Generated;

    // Input of the paragraph builder, kept for its memory.
    std::vector<Typeset::StyleRun> m_InputRuns;
    std::vector<Kernel::Counted<Typeset::TextStyle const>> m_InputStyles;
    std::vector<Typeset::InlineObject> m_InputObjects;
};

}
