#pragma once

#include <optional>
#include <span>
#include <string_view>
#include <vector>

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/AffineTransform.h"
#include "framework/raster/Colour.h"
#include "framework/raster/Picture.h"
#include "framework/render/Path.h"
#include "framework/render/PlacedDrawing.h"
#include "framework/typeset/LineArena.h"

namespace Renderer::RenderTree
{

/// What a stretch of the list is to a reader; for tagged output.
enum class Role : std::uint8_t
{
    None,
    /// Not part of the text: running heads, folios, rules, marks. Left out when text is read aloud.
    Artifact,
    Paragraph,
    Heading1,
    Heading2,
    Heading3,
    Heading4,
    Heading5,
    Heading6,
    ListItem,
    Quotation,
    Code,
    Caption,
    Note,
    TableCell,
    TableHeaderCell,
    Figure,
    Link,
};

/// Opens a stretch with a role.
struct Mark
{
    Role m_Role = Role::None;
    /// BCP 47, empty for the surrounding language.
    String m_Language;
    /// Stands for the content of a figure.
    String m_AlternativeText;
};

/// A group: what is drawn in it passes through its transform, then its clip, then its opacity as one picture.
struct Group
{
    Raster::AffineTransform::Params m_Transform;
    /// In the coordinates outside of the group. Null: no clip.
    std::optional<Path> m_Clip;
    FillRule m_ClipRule = FillRule::NonZero;
    double m_Opacity = 1;
};

/// Glyphs of one face and size on one baseline, from left to right.
struct GlyphRun
{
    Kernel::Counted<Typeset::FontFace const> m_Face;
    /// Points to the em.
    double m_Size = 0;
    Raster::Colour m_Colour;
    /// Pen at the first glyph, on the baseline.
    Kernel::Point m_Origin;
    /// Odd: right to left, and clusters descend.
    int m_Level = 0;
    /// Slope of a synthetic italic: x grows by this for each point upwards. 0 for a real face.
    double m_Slant = 0;
    /// Index of the first glyph and their count, filled in by the list.
    std::size_t m_FirstGlyph = 0;
    std::size_t m_GlyphCount = 0;
    /// The text, filled in by the list: UTF-16 in the list's text, and the cluster number of its first unit.
    std::size_t m_FirstText = 0;
    std::size_t m_TextLength = 0;
    std::uint32_t m_FirstCluster = 0;
};

/// A picture or bitmap and where it goes: the placement maps the unit square, (0,0) its top left, to the page.
struct PlacedPicture
{
    /// One of the two. A file's picture is drawn upright.
    Kernel::Counted<Raster::Picture const> m_Picture;
    Kernel::Counted<Raster::DynamicBitmap const> m_Bitmap;
    Kernel::Consolidated<Raster::ICCProfile> m_BitmapProfile;
    Raster::AffineTransform::Params m_Placement;
};

/// A drawing that stays vectors where the sink can keep them. The placement is as a picture's.
struct PlacedVectors
{
    Kernel::Counted<PlacedDrawing const> m_Drawing;
    Raster::AffineTransform::Params m_Placement;
};

/// Everything that is drawn on one page, in order, once for all sinks: the PDF and the screen are made from the same
/// list. Coordinates are points, y down, in the spread's coordinates; which part of the plane is the page is said to
/// the sink. Colours stand in their own space and are converted by the sink. Flat vectors: a page of text costs a few
/// allocations, and none once the list is used again after `Clear`. Not locked; a finished list may be read anywhere.
class DisplayList
{
public:
    enum class Kind : std::uint8_t
    {
        Fill,
        Stroke,
        Glyphs,
        Picture,
        Drawing,
        BeginGroup,
        EndGroup,
        BeginMark,
        EndMark,
    };

    /// One step; the index goes into the vector of its kind.
    struct Operation
    {
        Kind m_Kind;
        std::uint32_t m_Index = 0;
    };

    struct FilledPath
    {
        Path m_Path;
        Raster::Colour m_Colour;
        FillRule m_Rule = FillRule::NonZero;
    };

    struct StrokedPath
    {
        Path m_Path;
        Raster::Colour m_Colour;
        Stroke m_Stroke;
    };

    /// Empties the list and keeps its memory.
    void Clear();
    [[nodiscard]] bool IsEmpty() const { return m_Operations.empty(); }

    void FillPath(Path path, Raster::Colour const & colour, FillRule rule);
    void FillRect(Kernel::Rect const & rect, Raster::Colour const & colour);
    void StrokePath(Path path, Raster::Colour const & colour, Stroke stroke);

    /// Adds a run. `glyphs` are copied; advances move the pen as the composer set them. `text` is the stretch that the
    /// run shows, and `firstCluster` the cluster number of its first unit; glyphs whose cluster lies outside of it, and
    /// synthetic ones, stand for no text.
    void DrawGlyphs(GlyphRun const & run, std::span<Typeset::PlacedGlyph const> glyphs, std::u16string_view text,
                    std::uint32_t firstCluster);

    void DrawPicture(Kernel::Counted<Raster::Picture const> const & picture,
                     Raster::AffineTransform::Params const & placement);
    /// A null profile means the document's for the bitmap's space.
    void DrawBitmap(Kernel::Counted<Raster::DynamicBitmap const> const & bitmap,
                    Kernel::Consolidated<Raster::ICCProfile> const & profile,
                    Raster::AffineTransform::Params const & placement);

    void DrawDrawing(Kernel::Counted<PlacedDrawing const> const & drawing,
                     Raster::AffineTransform::Params const & placement);

    void BeginGroup(Group group);
    void EndGroup();
    void BeginMark(Mark mark);
    void EndMark();

    /// Groups and marks that are open.
    [[nodiscard]] std::size_t GetDepth() const { return m_Depth; }

    [[nodiscard]] std::vector<Operation> const & GetOperations() const { return m_Operations; }
    [[nodiscard]] FilledPath const & GetFill(std::uint32_t index) const { return m_Fills[index]; }
    [[nodiscard]] StrokedPath const & GetStroke(std::uint32_t index) const { return m_Strokes[index]; }
    [[nodiscard]] GlyphRun const & GetRun(std::uint32_t index) const { return m_Runs[index]; }
    [[nodiscard]] PlacedPicture const & GetPicture(std::uint32_t index) const { return m_Pictures[index]; }
    [[nodiscard]] PlacedVectors const & GetDrawing(std::uint32_t index) const { return m_Drawings[index]; }
    [[nodiscard]] Group const & GetGroup(std::uint32_t index) const { return m_Groups[index]; }
    [[nodiscard]] Mark const & GetMark(std::uint32_t index) const { return m_Marks[index]; }

    [[nodiscard]] std::span<Typeset::PlacedGlyph const> GlyphsOf(GlyphRun const & run) const
    {
        return std::span(m_Glyphs).subspan(run.m_FirstGlyph, run.m_GlyphCount);
    }
    [[nodiscard]] std::u16string_view TextOf(GlyphRun const & run) const
    {
        return std::u16string_view(m_Text).substr(run.m_FirstText, run.m_TextLength);
    }

private:
    std::vector<Operation> m_Operations;
    std::vector<FilledPath> m_Fills;
    std::vector<StrokedPath> m_Strokes;
    std::vector<GlyphRun> m_Runs;
    std::vector<PlacedPicture> m_Pictures;
    std::vector<PlacedVectors> m_Drawings;
    std::vector<Group> m_Groups;
    std::vector<Mark> m_Marks;
    std::vector<Typeset::PlacedGlyph> m_Glyphs;
    std::u16string m_Text;
    std::size_t m_Depth = 0;
};

}
