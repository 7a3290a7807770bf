#pragma once

#include "core/BookChapter.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/raster/AffineTransform.h"
#include "framework/render/PrintTypes.h"

#include <vector>

namespace Book
{

/// One page that can be printed. Lengths in points.
struct PaginatorSource
{
    /// Null in a blank, which only takes up a place.
    Kernel::Counted<BookChapter const> m_Chapter;
    /// Spread in the chapter; -1 until it is set.
    int m_Spread = -1;
    /// The page, in coordinates of its spread.
    Kernel::RectT<double> m_PageRect;
    /// Zero; every target has a copy.
    Kernel::RectT<double> m_SpareRect;
    /// Bleed margins left, top, right, bottom: distances, not a place.
    Kernel::RectT<double> m_PageBox;
    /// Running number among all pages of the chapters, from 0; -1 until it is set, and in a blank.
    int m_Index = -1;
};

/// One page, or one piece of a page, placed on a sheet.
struct PaginatorTarget
{
    PaginatorTarget() = default;
    /// The whole page where it lies, without bleed.
    explicit PaginatorTarget(PaginatorSource const & source)
        : m_Chapter(source.m_Chapter), m_Spread(source.m_Spread), m_PageRect(source.m_PageRect),
          m_SpareRect(source.m_SpareRect), m_PageBox(source.m_PageBox), m_Index(source.m_Index)
    {
    }

    Kernel::Counted<BookChapter const> m_Chapter;
    int m_Spread = -1;
    /// The page, or the piece of it that is shown here, in coordinates of its spread.
    Kernel::RectT<double> m_PageRect;
    Kernel::RectT<double> m_SpareRect;
    /// The page's bleed margins.
    Kernel::RectT<double> m_PageBox;
    int m_Index = -1;
    /// From coordinates of the spread to those of the sheet.
    Raster::AffineTransform::Params m_Transform;
    /// Where `m_PageRect` comes to lie on the sheet; for folded layouts and single pages `m_PageRect` itself.
    Kernel::RectT<double> m_DestRect;
    /// What is rendered if bleed is wanted, in coordinates of the spread. Cut where the page meets another piece.
    Kernel::RectT<double> m_BleedRect;
};

/// One side of a sheet. Its coordinates are points, y down.
struct PaginatorPage
{
    /// In order of placing.
    std::vector<PaginatorTarget> m_Targets;
    /// Extent of the content.
    Kernel::RectT<double> m_Rect;
    /// The largest bleed margins of the targets, side by side.
    Kernel::RectT<double> m_Bleed;
    /// Times which the printing enlarges the sheet; what is on it is in the size that it has without. 1 until it is set.
    double m_Scale = 1;
    /// `OrientationAuto` until it is set, as on a sheet without targets: the printing then goes by the shape.
    Renderer::OrientationEnum m_Orientation = Renderer::OrientationAuto;
    Geometry::FitRect::Type m_Placement = Geometry::FitRect::Centre;
    std::vector<CropMarkPos> m_CropMarks;
};

}
