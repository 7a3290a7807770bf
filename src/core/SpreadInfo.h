#pragma once

#include "framework/kernel/Geometry.h"

#include <vector>

namespace Book
{

/// What a book remembers of one spread of a chapter's document, so that it can number and plan pages while the document
/// is closed. A plain value; the three lists of pages have the same length.
struct SpreadInfo
{
    /// Each page's rectangle as the spread's artboard reports it, in points, in spread coordinates. The length of this
    /// list is the number of pages of the spread.
    std::vector<Kernel::RectT<double>> m_PageRects;
    /// Each page's bleed margins in the order left, top, right, bottom: distances, not a place on the spread.
    std::vector<Kernel::RectT<double>> m_PageBoxes;
    /// Whether the page's section is left out of output.
    std::vector<bool> m_NonExporting;
    Kernel::RectT<double> m_SpreadBounds;
    /// Everything that belongs to the spread, bleed included.
    Kernel::RectT<double> m_SpreadExtents;
    /// The spread's preview keeps a transparent background.
    bool m_SpreadFlag = false;
};

}
