#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/render/PrintersMarks.h"

namespace Renderer
{

/// One entry of the outline.
struct PdfBookmark : public virtual Kernel::Countable
{
    /// Null at the root. A parent that is itself not among the entries counts as the root.
    Kernel::Counted<PdfBookmark const> m_Parent;
    String m_Title;
    /// Output page from 1. An entry whose page is not in the file stands in the outline without a destination.
    int m_Page = 0;
    /// On that page, in the coordinates of `m_PrintersMarks`, or in the page's own without them.
    Kernel::Point m_Position;
    Kernel::Counted<PrintersMarksHelper> m_PrintersMarks;
};

}
