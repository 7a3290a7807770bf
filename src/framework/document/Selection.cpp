#include "framework/document/Selection.h"

#include "framework/document/SpreadNode.h"

#include <algorithm>

Selection::Selection(Nodes nodes) : m_Nodes(std::move(nodes)) {}

Selection::Selection(Kernel::Counted<TextFlow> flow, std::size_t anchor, std::size_t caret)
    : m_Flow(std::move(flow)),
      m_TextAnchor(anchor),
      m_TextCaret(caret)
{
    Kernel::JailCounted<TextFrameNode> const first = m_Flow->FindFrame(std::min(anchor, caret));
    if (first) {
        std::size_t const end = std::max(anchor, caret);
        Kernel::Counted<Story::Layout const> const layout = m_Flow->GetLayout();
        for (int i = first->GetFrameIndex(); i < static_cast<int>(m_Flow->GetFrames().size()); ++i) {
            if (i != first->GetFrameIndex() && end <= layout->GetFrames()[static_cast<std::size_t>(i)].m_TextBegin) {
                break;
            }
            m_Nodes.push_back(m_Flow->GetFrames()[static_cast<std::size_t>(i)]);
        }
    }
}

Selection::Selection(Kernel::Counted<TextFlow> flow, std::size_t place, Kernel::JailCounted<TextFrameNode> frame,
                     Kernel::RectT<double> box)
    : m_Flow(std::move(flow)),
      m_TextAnchor(place),
      m_TextCaret(place),
      m_KnownBox(box)
{
    m_Nodes.push_back(std::move(frame));
}

Selection::~Selection() = default;

Kernel::JailCounted<SpreadNode> Selection::GetSingleSpreadNode() const
{
    return m_Nodes.empty() ? nullptr : m_Nodes.front()->GetSpreadNode();
}

std::vector<Kernel::RectT<double>> Selection::GetTextSelectionBaseBoxes(Kernel::JailCounted<Node> const & frame) const
{
    std::vector<Kernel::Rect> boxes;
    Kernel::JailCounted<TextFrameNode> const textFrame = Kernel::CountedCast<TextFrameNode>(frame);
    if (!m_Flow || !textFrame || textFrame->GetTextFlow() != m_Flow) {
        return boxes;
    }
    if (!m_KnownBox.IsEmpty()) {
        boxes.push_back(m_KnownBox);
        return boxes;
    }
    Kernel::Counted<Story::Layout const> const layout = m_Flow->GetLayout();
    std::size_t const number = static_cast<std::size_t>(textFrame->GetFrameIndex());
    if (!m_Flow->EnsureGlyphData() || layout->GetFrames().size() <= number) {
        return boxes;
    }
    std::size_t const begin = std::min(m_TextAnchor, m_TextCaret);
    std::size_t const end = std::max({m_TextAnchor, m_TextCaret, begin + 1});
    Story::LayoutItem::Frame const & laidOut = layout->GetFrames()[number];
    auto const lines = layout->GetLines(laidOut);
    for (std::size_t i = 0; i < lines.size(); ++i) {
        std::size_t const next = i + 1 < lines.size() ? lines[i + 1].m_StoryOffset : laidOut.m_TextEnd;
        // Lines of notes and cells name the element that holds them, so that several lines have one offset.
        if (lines[i].m_StoryOffset < end && begin < std::max<std::size_t>(next, lines[i].m_StoryOffset + 1)) {
            boxes.push_back({lines[i].m_Left, lines[i].m_Baseline - lines[i].m_Ascent, lines[i].m_Right,
                             lines[i].m_Baseline + lines[i].m_Descent});
        }
    }
    return boxes;
}

Kernel::RectT<double> Selection::GetTextSelectionBaseBox() const
{
    if (m_Nodes.empty()) {
        return Kernel::Rect::Empty();
    }
    std::vector<Kernel::Rect> const boxes = GetTextSelectionBaseBoxes(m_Nodes.front());
    return boxes.empty() ? Kernel::Rect::Empty() : boxes.front();
}

Kernel::Counted<Selection> Selection::ClonePromotingRestrictedItems() const
{
    return Kernel::MakeCounted<Selection>(*this);
}
