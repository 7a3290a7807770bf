#include "framework/document/ShapeNode.h"

Kernel::RectT<double> ShapeNode::GetSpreadBaseBox(bool includeStroke) const
{
    double const reach = includeStroke && m_Stroke ? m_StrokeWidth / 2 : 0;
    return {m_Rect.left - reach, m_Rect.top - reach, m_Rect.right + reach, m_Rect.bottom + reach};
}
