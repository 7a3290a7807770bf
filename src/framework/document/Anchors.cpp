#include "framework/document/Anchors.h"

#include "framework/document/Selection.h"
#include "framework/document/SpreadNode.h"

AnchorInstance::AnchorInstance(Kernel::Counted<Story::AnchorData> anchor, Kernel::Counted<TextFlow> flow,
                               std::size_t index, std::size_t offset)
    : m_Anchor(std::move(anchor)),
      m_Flow(std::move(flow)),
      m_Index(index),
      m_Offset(offset)
{
    KORVANE_ASSERT(m_Anchor);
}

AnchorInstance::AnchorInstance(Kernel::Counted<Story::AnchorData> anchor, int chapterIndex)
    : m_Anchor(std::move(anchor)),
      m_ChapterIndex(chapterIndex)
{
    KORVANE_ASSERT(m_Anchor);
}

AnchorInstance::~AnchorInstance() = default;

Kernel::JailCounted<TextFrameNode> AnchorInstance::FindPlace(Kernel::PointT<double> & inFrame) const
{
    Kernel::Counted<Story::Layout const> const layout = m_Flow ? m_Flow->GetLayout() : nullptr;
    if (!layout || layout->GetAnchors().size() <= m_Index || !layout->GetAnchors()[m_Index].IsPlaced()) {
        return nullptr;
    }
    Story::LayoutItem::Place const & place = layout->GetAnchors()[m_Index];
    inFrame = {place.m_X, place.m_Y};
    return m_Flow->GetFrame(place.m_Frame);
}

Kernel::JailCounted<SpreadNode> AnchorInstance::GetSpreadAndTargetPoint(Kernel::PointT<double> & point) const
{
    Kernel::Point inFrame;
    Kernel::JailCounted<TextFrameNode> const frame = FindPlace(inFrame);
    Kernel::JailCounted<SpreadNode> const spread = frame ? frame->GetSpreadNode() : nullptr;
    if (spread) {
        point = frame->GetStoryToDomainTransform().Map(inFrame);
    }
    return spread;
}

Kernel::Counted<Selection> AnchorInstance::CreateSelection() const
{
    if (IsBlind()) {
        return nullptr;
    }
    Kernel::Point inFrame;
    Kernel::JailCounted<TextFrameNode> const frame = FindPlace(inFrame);
    if (!frame) {
        return Kernel::MakeCounted<Selection>(Selection::Nodes());
    }
    return Kernel::MakeCounted<Selection>(m_Flow, m_Offset, frame,
                                          Kernel::Rect{inFrame.x, inFrame.y, inFrame.x, inFrame.y});
}

Anchors::Anchors() = default;
Anchors::~Anchors() = default;

void Anchors::Add(Kernel::Counted<Story::AnchorData> anchor, int chapterIndex)
{
    m_Anchors.push_back(Kernel::MakeCounted<AnchorInstance>(std::move(anchor), chapterIndex));
}
