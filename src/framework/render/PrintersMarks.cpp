#include "framework/render/PrintersMarks.h"

#include <algorithm>

namespace Renderer
{

namespace
{

Kernel::Rect Grown(Kernel::Rect const & rect, BleedMargins const & margins)
{
    return {rect.left - margins.m_Left, rect.top - margins.m_Top, rect.right + margins.m_Right,
            rect.bottom + margins.m_Bottom};
}

}

PrintersMarksHelper::PrintersMarksHelper(Kernel::Rect const & rect,
                                         Kernel::Counted<Kernel::UnitValueConverter const> converter)
    : m_Rect(rect), m_Converter(std::move(converter))
{
}

double PrintersMarksHelper::GetMarksWidth() const
{
    return m_Options.HasAny() ? m_Options.m_Offset + m_Options.m_Length : 0;
}

PageBoxes PrintersMarksHelper::GetBoxes(BleedMargins const & bleed) const
{
    PageBoxes boxes;
    boxes.m_Trim = m_Rect;
    boxes.m_Bleed = m_IncludeBleed ? Grown(m_Rect, bleed) : m_Rect;
    double const marks = GetMarksWidth();
    Kernel::Rect const room = Grown(m_Rect, {marks, marks, marks, marks});
    boxes.m_Media = boxes.m_Bleed.United(room);
    return boxes;
}

}
