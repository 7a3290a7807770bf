#pragma once

#include "framework/document/Node.h"
#include "framework/document/TextFlow.h"

#include <vector>

/// What is selected: nodes, or a stretch of a text flow. A picture of the moment, immutable.
///
/// The boxes of selected text are in the coordinates of the text, frame by frame: `TextNode::GetStoryToDomainTransform`
/// of the frame carries them to the spread.
class Selection : public virtual Kernel::Countable
{
public:
    using Nodes = std::vector<Kernel::JailCounted<Node>>;

    explicit Selection(Nodes nodes);
    /// A stretch of text from `anchor` to `caret`, either of which may be the greater.
    Selection(Kernel::Counted<TextFlow> flow, std::size_t anchor, std::size_t caret);
    /// One place in the text, with its box in the frame, as a layout's facts have it.
    Selection(Kernel::Counted<TextFlow> flow, std::size_t place, Kernel::JailCounted<TextFrameNode> frame,
              Kernel::RectT<double> box);
    ~Selection() override;

    /// The nodes: of a text selection, the frames that show the text, in order.
    [[nodiscard]] Nodes::const_iterator begin() const { return m_Nodes.begin(); }
    [[nodiscard]] Nodes::const_iterator end() const { return m_Nodes.end(); }

    [[nodiscard]] bool IsText() const { return static_cast<bool>(m_Flow); }
    [[nodiscard]] Kernel::Counted<TextFlow> const & GetTextFlow() const { return m_Flow; }
    [[nodiscard]] std::size_t GetTextAnchor() const { return m_TextAnchor; }
    [[nodiscard]] std::size_t GetTextCaret() const { return m_TextCaret; }

    /// The spread of the first node; null if there is none.
    [[nodiscard]] Kernel::JailCounted<SpreadNode> GetSingleSpreadNode() const;
    /// The boxes of the selected text in one of the frames, a rectangle a line. Empty for other nodes.
    [[nodiscard]] std::vector<Kernel::RectT<double>>
    GetTextSelectionBaseBoxes(Kernel::JailCounted<Node> const & frame) const;
    /// The box of the first line of the selected text, in the first frame; the empty rectangle without text or place.
    [[nodiscard]] Kernel::RectT<double> GetTextSelectionBaseBox() const;
    /// The same selection with items that can't be selected by themselves replaced by what holds them. Every node of
    /// this document model can be selected by itself, so it is the selection as it stands.
    [[nodiscard]] Kernel::Counted<Selection> ClonePromotingRestrictedItems() const;

private:
    Nodes m_Nodes;
    Kernel::Counted<TextFlow> m_Flow;
    std::size_t m_TextAnchor = 0;
    std::size_t m_TextCaret = 0;
    Kernel::RectT<double> m_KnownBox = Kernel::Rect::Empty();
};
