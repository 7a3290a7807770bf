#include "framework/document/TextFrameNode.h"

#include "framework/document/SpreadNode.h"
#include "framework/document/TextFlow.h"

TextFrameNode::~TextFrameNode() = default;

Kernel::RectT<double> TextFrameNode::GetSpreadBaseBox(bool) const
{
    return m_Rect;
}

Raster::AffineTransform::Params TextFrameNode::GetStoryToDomainTransform() const
{
    return Raster::AffineTransform::Params::Translation(m_Rect.left, m_Rect.top);
}

Kernel::Counted<Story::Story> TextFrameNode::GetStory() const
{
    return m_Flow ? m_Flow->GetStory() : Kernel::MakeCounted<Story::Story>();
}

Story::Selection TextFrameNode::GetStorySelection(bool wholeStory) const
{
    if (!m_Flow) {
        return {};
    }
    Story::Story const & story = *m_Flow->GetStory();
    if (wholeStory) {
        return {story.gbegin(), story.gend(false)};
    }
    Kernel::Counted<Story::Layout const> const layout = m_Flow->GetLayout();
    if (!layout || layout->GetFrames().size() <= static_cast<std::size_t>(m_FrameIndex)) {
        return {};
    }
    Story::LayoutItem::Frame const & frame = layout->GetFrames()[static_cast<std::size_t>(m_FrameIndex)];
    std::size_t const length = story.GetLength();
    return {{story, std::min<std::size_t>(frame.m_TextBegin, length)},
            {story, std::min<std::size_t>(frame.m_TextEnd, length)}};
}

Kernel::Counted<TextFlow> TextFrameNode::GetTextFlow() const
{
    return m_Flow;
}

int TextFrameNode::GetPageIndex() const
{
    Kernel::JailCounted<SpreadNode> const spread = GetSpreadNode();
    int const first = spread ? spread->GetFirstPageIndex() : -1;
    return first < 0 ? -1
                     : first + spread->FindPage({(m_Rect.left + m_Rect.right) / 2, (m_Rect.top + m_Rect.bottom) / 2});
}
