#pragma once

#include "framework/document/Node.h"

#include <vector>

class TextFlow;

/// What is selected: nodes, or a stretch of a text flow. A picture of the moment, immutable.
class Selection : public virtual Kernel::Countable
{
public:
    using Nodes = std::vector<Kernel::JailCounted<Node>>;

    explicit Selection(Nodes nodes);
    /// A stretch of text, from `anchor` to `caret`, either of which may be the greater.
    Selection(Kernel::Counted<TextFlow> flow, std::uint32_t anchor, std::uint32_t caret);
    ~Selection() override;

    /// The nodes: of a text selection, the frames that show the text.
    [[nodiscard]] Nodes::const_iterator begin() const { return m_Nodes.begin(); }
    [[nodiscard]] Nodes::const_iterator end() const { return m_Nodes.end(); }

    [[nodiscard]] bool IsText() const;
    [[nodiscard]] Kernel::Counted<TextFlow> const & GetTextFlow() const { return m_Flow; }
    [[nodiscard]] std::uint32_t GetTextAnchor() const { return m_TextAnchor; }
    [[nodiscard]] std::uint32_t GetTextCaret() const { return m_TextCaret; }

    /// The one spread that everything selected lies on; where text goes over several, the spread of its beginning. Null
    /// if there is none.
    [[nodiscard]] Kernel::JailCounted<SpreadNode> GetSingleSpreadNode() const;
    /// The selected text's boxes, a rectangle a line, in the coordinates of the text, which
    /// `TextNode::GetStoryToDomainTransform` carries to the spread. With `spread`, only of lines that lie on it.
    [[nodiscard]] std::vector<Kernel::RectT<double>> GetTextSelectionBaseBoxes(Kernel::JailNonCounted<SpreadNode const> spread) const;
    /// The box of the first line of the selected text; empty without text or place.
    [[nodiscard]] Kernel::RectT<double> GetTextSelectionBaseBox() const;
    /// The same selection with items that can't be selected by themselves replaced by what holds them. Text is never such
    /// an item.
    [[nodiscard]] Kernel::Counted<Selection> ClonePromotingRestrictedItems() const;

private:
    Nodes m_Nodes;
    Kernel::Counted<TextFlow> m_Flow;
    std::uint32_t m_TextAnchor = 0;
    std::uint32_t m_TextCaret = 0;
};
