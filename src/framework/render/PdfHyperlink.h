#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/render/PrintersMarks.h"

namespace Renderer
{

/// One clickable area of a page. A plain value.
struct PdfHyperlink
{
    /// Values of `m_Kind`.
    enum Kind : int
    {
        /// A position in this file: page, position, marks.
        Position = 0,
        /// A page of this file.
        Page = 1,
        /// Another resource, by its address.
        Resource = 2,
        /// Another PDF file, by its path, relative to this one if it does not begin at a root.
        OtherPdf = 3,
    };

    int m_Kind = Position;
    /// Output page from 1. It need not have been written yet.
    int m_Page = 0;
    String m_Target;
    /// On the target page, in the coordinates of `m_PrintersMarks`, or in the target page's own without them.
    Kernel::Point m_Position;
    /// The clickable area in the coordinates of the page that it lies on.
    Kernel::Rect m_Rect;
    /// Frame of the target page.
    Kernel::Counted<PrintersMarksHelper> m_PrintersMarks;
};

}
