#include "framework/render/DisplayList.h"

#include "framework/kernel/Assert.h"

namespace Renderer::RenderTree
{

namespace
{

template <typename T>
std::uint32_t Append(std::vector<T> & list, T item)
{
    list.push_back(std::move(item));
    return static_cast<std::uint32_t>(list.size() - 1);
}

}

void DisplayList::Clear()
{
    m_Operations.clear();
    m_Fills.clear();
    m_Strokes.clear();
    m_Runs.clear();
    m_Pictures.clear();
    m_Drawings.clear();
    m_Groups.clear();
    m_Marks.clear();
    m_Glyphs.clear();
    m_Text.clear();
    m_Depth = 0;
}

void DisplayList::FillPath(Path path, Raster::Colour const & colour, FillRule rule)
{
    m_Operations.push_back({Kind::Fill, Append(m_Fills, FilledPath{std::move(path), colour, rule})});
}

void DisplayList::FillRect(Kernel::Rect const & rect, Raster::Colour const & colour)
{
    FillPath(Path::Rectangle(rect), colour, FillRule::NonZero);
}

void DisplayList::StrokePath(Path path, Raster::Colour const & colour, Stroke stroke)
{
    m_Operations.push_back({Kind::Stroke, Append(m_Strokes, StrokedPath{std::move(path), colour, std::move(stroke)})});
}

void DisplayList::DrawGlyphs(GlyphRun const & run, std::span<Typeset::PlacedGlyph const> glyphs,
                             std::u16string_view text, std::uint32_t firstCluster)
{
    KORVANE_ASSERT(run.m_Face);
    if (glyphs.empty()) {
        return;
    }
    GlyphRun added = run;
    added.m_FirstGlyph = m_Glyphs.size();
    added.m_GlyphCount = glyphs.size();
    added.m_FirstText = m_Text.size();
    added.m_TextLength = text.size();
    added.m_FirstCluster = firstCluster;
    m_Glyphs.insert(m_Glyphs.end(), glyphs.begin(), glyphs.end());
    m_Text.append(text);
    m_Operations.push_back({Kind::Glyphs, Append(m_Runs, std::move(added))});
}

void DisplayList::DrawPicture(Kernel::Counted<Raster::Picture const> const & picture,
                              Raster::AffineTransform::Params const & placement)
{
    KORVANE_ASSERT(picture);
    PlacedPicture placed;
    placed.m_Picture = picture;
    placed.m_Placement = placement;
    m_Operations.push_back({Kind::Picture, Append(m_Pictures, std::move(placed))});
}

void DisplayList::DrawBitmap(Kernel::Counted<Raster::DynamicBitmap const> const & bitmap,
                             Kernel::Consolidated<Raster::ICCProfile> const & profile,
                             Raster::AffineTransform::Params const & placement)
{
    KORVANE_ASSERT(bitmap);
    PlacedPicture placed;
    placed.m_Bitmap = bitmap;
    placed.m_BitmapProfile = profile;
    placed.m_Placement = placement;
    m_Operations.push_back({Kind::Picture, Append(m_Pictures, std::move(placed))});
}

void DisplayList::DrawDrawing(Kernel::Counted<PlacedDrawing const> const & drawing,
                              Raster::AffineTransform::Params const & placement)
{
    KORVANE_ASSERT(drawing);
    m_Operations.push_back({Kind::Drawing, Append(m_Drawings, PlacedVectors{drawing, placement})});
}

void DisplayList::BeginGroup(Group group)
{
    ++m_Depth;
    m_Operations.push_back({Kind::BeginGroup, Append(m_Groups, std::move(group))});
}

void DisplayList::EndGroup()
{
    KORVANE_ASSERT(m_Depth > 0);
    --m_Depth;
    m_Operations.push_back({Kind::EndGroup, 0});
}

void DisplayList::BeginMark(Mark mark)
{
    ++m_Depth;
    m_Operations.push_back({Kind::BeginMark, Append(m_Marks, std::move(mark))});
}

void DisplayList::EndMark()
{
    KORVANE_ASSERT(m_Depth > 0);
    --m_Depth;
    m_Operations.push_back({Kind::EndMark, 0});
}

}
