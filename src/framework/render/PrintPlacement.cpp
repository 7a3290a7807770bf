#include "framework/render/PrintPlacement.h"

#include <algorithm>
#include <cmath>

namespace Renderer
{

namespace
{

using Fit = Geometry::FitRect;

bool IsUsable(double length)
{
    return std::isfinite(length) && length > 0;
}

/// What goes on the paper: with the margins that the sheet begins with, if they belong to it.
Kernel::Rect BoxOf(PrintContent const & content)
{
    Kernel::Rect const & rect = content.m_Rect;
    if (rect.IsEmpty()) {
        return {};
    }
    return content.m_Placement & Fit::FromOrigin ? Kernel::Rect{0, 0, rect.right + rect.left, rect.bottom + rect.top}
                                                 : rect;
}

/// Scale at which `length` with what stands out round it fills `room`. Where a sheet brings its own margins, these are
/// the room for what stands out.
double ScaleToFill(double room, double length, PrintContent const & content)
{
    if (content.m_Placement & Fit::FromOrigin) {
        return room / length;
    }
    return (room - 2 * content.m_Marks) / (length + 2 * content.m_Bleed);
}

}

PaperPlacement PlaceOnPaper(PrintContent const & content, Kernel::Size const & paper)
{
    Kernel::Rect const box = BoxOf(content);
    bool const toMeasure = !IsUsable(paper.width) || !IsUsable(paper.height);
    PaperPlacement placed;
    placed.m_Scale = IsUsable(content.m_Scale) ? content.m_Scale : 1;

    if (toMeasure) {
        double const outside = 2 * (content.m_Bleed * placed.m_Scale + content.m_Marks);
        placed.m_Paper = {box.Width() * placed.m_Scale + outside, box.Height() * placed.m_Scale + outside};
    } else {
        bool const across = content.m_Orientation == OrientationAuto ? box.Width() > box.Height()
                                                                     : content.m_Orientation == OrientationLandscape;
        double const shorter = std::min(paper.width, paper.height);
        double const longer = std::max(paper.width, paper.height);
        placed.m_Paper = across ? Kernel::Size{longer, shorter} : Kernel::Size{shorter, longer};
        if (content.m_Placement & Fit::FitMask) {
            double const fill = std::min(ScaleToFill(placed.m_Paper.width, box.Width(), content),
                                         ScaleToFill(placed.m_Paper.height, box.Height(), content));
            bool const shrinks = (content.m_Placement & Fit::FitMask) == Fit::Shrink;
            placed.m_Scale = !IsUsable(fill) ? 1 : shrinks ? std::min(1.0, fill) : fill;
        }
    }

    auto const isAt = [&](std::uint32_t places) { return (content.m_Placement & Fit::PlaceMask & places) != 0; };
    double const spareX = placed.m_Paper.width - box.Width() * placed.m_Scale;
    double const spareY = placed.m_Paper.height - box.Height() * placed.m_Scale;
    double const x = toMeasure                                                        ? spareX / 2
                     : isAt(Fit::TopLeft | Fit::MiddleLeft | Fit::BottomLeft)    ? 0
                     : isAt(Fit::TopRight | Fit::MiddleRight | Fit::BottomRight) ? spareX
                                                                                 : spareX / 2;
    double const y = toMeasure                                                          ? spareY / 2
                     : isAt(Fit::TopLeft | Fit::TopCentre | Fit::TopRight)         ? 0
                     : isAt(Fit::BottomLeft | Fit::BottomCentre | Fit::BottomRight) ? spareY
                                                                                   : spareY / 2;
    placed.m_ToPaper = Raster::AffineTransform::Params::Translation(-box.left, -box.top)
                           .Then(Raster::AffineTransform::Params::Scale(placed.m_Scale, placed.m_Scale))
                           .Then(Raster::AffineTransform::Params::Translation(x, y));
    return placed;
}

}
