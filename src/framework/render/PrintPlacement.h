#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/raster/AffineTransform.h"
#include "framework/render/PrintTypes.h"

namespace Renderer
{

/// What is to be put on paper. Lengths in points.
struct PrintContent
{
    /// Extent of the content in the sheet's own coordinates.
    Kernel::Rect m_Rect;
    /// Bleed round it, in the sheet's own size, and room for marks round that, in the size of the paper: both have to be
    /// on the paper where the content is fitted, or where the paper is made for it.
    double m_Bleed = 0;
    double m_Marks = 0;
    OrientationEnum m_Orientation = OrientationAuto;
    Geometry::FitRect::Type m_Placement = Geometry::FitRect::Centre;
    /// Where the placement does not fit the content.
    double m_Scale = 1;
};

/// A sheet on its paper.
struct PaperPlacement
{
    Kernel::Size m_Paper;
    double m_Scale = 1;
    /// From the sheet's coordinates to the paper's, with the origin at the paper's top left.
    Raster::AffineTransform::Params m_ToPaper;
};

/// Puts content on paper, as `Geometry::FitRect` tells.
///
/// `paper` is turned as the orientation asks: landscape has the longer side across. Without one it is turned as the
/// content is. Without width or height the paper is made to measure. Content that is placed at a side of the paper touches
/// it, whatever stands out round it; content in the middle has equal room on both sides. A size that is no number, or a
/// paper that has no room, leaves the content in its own size.
[[nodiscard]] PaperPlacement PlaceOnPaper(PrintContent const & content, Kernel::Size const & paper);

}
