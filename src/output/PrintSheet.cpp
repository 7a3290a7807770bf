#include "output/PrintSheet.h"

#include <algorithm>
#include <limits>

namespace Book
{

namespace
{

namespace RenderTree = Renderer::RenderTree;

constexpr double MarkLength = 14;
/// From the bleed to an inner mark, which has a gap to fit in.
constexpr double InnerDistance = 2;
/// Shorter ones say nothing.
constexpr double ShortestLine = 2;
constexpr double Hair = 0.01;

}

PrintSheet::PrintSheet(PaginatorPage const & sheet, PrintSettings const & settings)
{
    Renderer::PrintContent content;
    content.m_Rect = sheet.m_Rect;
    if (settings.m_IncludeBleed) {
        content.m_Bleed = std::max({sheet.m_Bleed.left, sheet.m_Bleed.top, sheet.m_Bleed.right, sheet.m_Bleed.bottom});
    }
    content.m_Marks = settings.m_Marks ? MarksRoom : 0;
    content.m_Orientation = sheet.m_Orientation;
    content.m_Placement = sheet.m_Placement;
    content.m_Scale = sheet.m_Scale;
    m_Placement = Renderer::PlaceOnPaper(content, settings.m_Paper);
    m_Trim = m_Placement.m_ToPaper.MapBounds(sheet.m_Rect);
    m_Bleed = content.m_Bleed * m_Placement.m_Scale;
    for (PaginatorTarget const & target : sheet.m_Targets) {
        Piece piece;
        piece.m_Index = target.m_Index;
        piece.m_ToPaper = target.m_Transform.Then(m_Placement.m_ToPaper);
        piece.m_Trim = piece.m_ToPaper.MapBounds(target.m_PageRect);
        piece.m_Shown = piece.m_ToPaper.MapBounds(ShownPart(target, settings));
        m_Pieces.push_back(piece);
    }
    if (settings.m_Marks) {
        for (CropMarkPos mark : sheet.m_CropMarks) {
            Kernel::Point const place = m_Placement.m_ToPaper.Map({mark.m_X, mark.m_Y});
            mark.m_X = place.x;
            mark.m_Y = place.y;
            m_Marks.push_back(mark);
        }
    }
}

/// How far one can go from a corner before the next page begins.
double PrintSheet::FreeWay(Kernel::Point const & from, double dx, double dy) const
{
    double free = std::numeric_limits<double>::max();
    for (Piece const & piece : m_Pieces) {
        Kernel::Rect const & page = piece.m_Trim;
        bool const isBeside = dx == 0 ? page.left - Hair < from.x && from.x < page.right + Hair
                                      : page.top - Hair < from.y && from.y < page.bottom + Hair;
        double const near = dx > 0   ? page.left - from.x
                            : dx < 0 ? from.x - page.right
                            : dy > 0 ? page.top - from.y
                                     : from.y - page.bottom;
        if (isBeside && near > -Hair) {
            free = std::min(free, near);
        }
    }
    return free;
}

void PrintSheet::AddLine(Renderer::Path & path, Kernel::Point const & from, double dx, double dy, bool isInner) const
{
    double const begin = m_Bleed + (isInner ? InnerDistance : MarksRoom - MarkLength);
    double end = begin + MarkLength;
    if (isInner) {
        end = std::min(end, FreeWay(from, dx, dy) / 2);
    }
    if (end - begin >= ShortestLine) {
        path.MoveTo(from.x + dx * begin, from.y + dy * begin);
        path.LineTo(from.x + dx * end, from.y + dy * end);
    }
}

void PrintSheet::DrawMarks(RenderTree::DisplayList & list, double lineWidth) const
{
    using Edge = CropMarkPos;
    Renderer::Path path;
    for (CropMarkPos const & mark : m_Marks) {
        Kernel::Point const corner{mark.m_X, mark.m_Y};
        struct Line
        {
            std::uint32_t m_Outer;
            std::uint32_t m_Inner;
            double m_X;
            double m_Y;
        };
        for (Line const & line : {Line{Edge::Top, Edge::InnerTop, 0, -1}, Line{Edge::Bottom, Edge::InnerBottom, 0, 1},
                                  Line{Edge::Left, Edge::InnerLeft, -1, 0}, Line{Edge::Right, Edge::InnerRight, 1, 0}}) {
            if (mark.m_Edges & (line.m_Outer | line.m_Inner)) {
                AddLine(path, corner, line.m_X, line.m_Y, (mark.m_Edges & line.m_Inner) != 0);
            }
        }
    }
    if (path.IsEmpty()) {
        return;
    }
    RenderTree::Mark artifact;
    artifact.m_Role = RenderTree::Role::Artifact;
    list.BeginMark(artifact);
    list.StrokePath(std::move(path), Raster::Colour::Cmyk(1, 1, 1, 1), Renderer::Stroke{lineWidth, {}, {}, 10, {}, 0});
    list.EndMark();
}

}
