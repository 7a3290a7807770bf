#include "framework/document/SpreadNode.h"

#include "framework/document/DocumentNode.h"

#include <cmath>

namespace
{

bool IsPage(int page, std::vector<SpreadPage> const & pages)
{
    return 0 <= page && page < static_cast<int>(pages.size());
}

}

Kernel::RectT<double> SpreadNode::GetSpreadBaseBox(bool) const
{
    return GetSpreadBounds();
}

Kernel::RectT<double> SpreadNode::GetPageRect(int page) const
{
    return IsPage(page, m_Pages) ? m_Pages[static_cast<std::size_t>(page)].m_Rect : Kernel::Rect::Empty();
}

Kernel::RectT<double> SpreadNode::GetPageBleed(int page) const
{
    return IsPage(page, m_Pages) ? m_Pages[static_cast<std::size_t>(page)].m_Bleed : Kernel::Rect::Empty();
}

Kernel::RectT<double> SpreadNode::GetPageExtents(int page, bool includeBleed) const
{
    if (!IsPage(page, m_Pages)) {
        return Kernel::Rect::Empty();
    }
    SpreadPage const & spreadPage = m_Pages[static_cast<std::size_t>(page)];
    Kernel::Rect rect = spreadPage.m_Rect;
    if (includeBleed) {
        rect = {rect.left - spreadPage.m_Bleed.left, rect.top - spreadPage.m_Bleed.top,
                rect.right + spreadPage.m_Bleed.right, rect.bottom + spreadPage.m_Bleed.bottom};
    }
    return rect;
}

int SpreadNode::GetFirstPageIndex() const
{
    Node const * const parent = GetParent();
    if (!parent || Kind::Spread != GetKind()) {
        return -1;
    }
    int index = 0;
    for (int i = 0; i < GetNodeIndex(); ++i) {
        index += static_cast<SpreadNode *>(parent->GetChildAtIndex(NodeChildListSpreads, i).Get())->GetPageCount();
    }
    return index;
}

int SpreadNode::FindPage(Kernel::PointT<double> point) const
{
    int best = -1;
    double bestDistance = 0;
    for (std::size_t i = 0; i < m_Pages.size(); ++i) {
        Kernel::Rect const & rect = m_Pages[i].m_Rect;
        double const dx = std::max({rect.left - point.x, 0.0, point.x - rect.right});
        double const dy = std::max({rect.top - point.y, 0.0, point.y - rect.bottom});
        double const distance = std::hypot(dx, dy);
        if (best < 0 || distance < bestDistance) {
            best = static_cast<int>(i);
            bestDistance = distance;
        }
    }
    return best;
}

Kernel::RectT<double> SpreadNode::GetSpreadBounds() const
{
    return GetSpreadExtents(true, false, false);
}

Kernel::RectT<double> SpreadNode::GetSpreadExtents(bool includePages, bool includeBleed, bool includeItems) const
{
    Kernel::Rect extents = Kernel::Rect::Empty();
    if (includePages) {
        for (int i = 0; i < GetPageCount(); ++i) {
            extents = extents.United(GetPageExtents(i, includeBleed));
        }
    }
    if (includeItems) {
        for (NodeChildListType const list : {NodeChildListUnder, NodeChildListItems, NodeChildListOver}) {
            for (Kernel::JailCounted<Node> const & item : GetChildren(list)) {
                extents = extents.United(item->GetSpreadBaseBox(true));
            }
        }
    }
    return extents;
}
