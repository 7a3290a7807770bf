#include "framework/document/MasterSpreadNode.h"

int MasterSpreadNode::GetPageForSide(PageSide side) const
{
    return PageSide::Left == side || GetPageCount() < 2 ? 0 : 1;
}

Kernel::RectT<double> MasterSpreadNode::GetTextRect(PageSide side) const
{
    std::size_t const page = static_cast<std::size_t>(GetPageForSide(side));
    return page < m_TextRects.size() ? m_TextRects[page] : Kernel::Rect::Empty();
}
