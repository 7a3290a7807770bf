#pragma once

#include "framework/document/Node.h"
#include "framework/document/NodeInterfaces.h"
#include "framework/raster/AffineTransform.h"

/// A node whose content is text.
class TextNode : public Node, public StoryInterface
{
public:
    /// Carries the text's own coordinates, whose origin is the top left of the frame, to the spread.
    [[nodiscard]] virtual Raster::AffineTransform::Params GetStoryToDomainTransform() const = 0;
};

/// A rectangle that shows its part of a text flow.
///
/// A loose frame, taken out of its flow by composing, keeps its rectangle and has no flow.
class TextFrameNode : public TextNode, public TextFrameInterface
{
public:
    explicit TextFrameNode(Kernel::RectT<double> rect) : m_Rect(rect) {}
    ~TextFrameNode() override;

    [[nodiscard]] Kind GetKind() const override { return Kind::TextFrame; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool includeStroke) const override;
    [[nodiscard]] Raster::AffineTransform::Params GetStoryToDomainTransform() const override;
    [[nodiscard]] Kernel::Counted<Story::Story> GetStory() const override;
    [[nodiscard]] Story::Selection GetStorySelection(bool wholeStory) const override;
    [[nodiscard]] Kernel::Counted<TextFlow> GetTextFlow() const override;
    [[nodiscard]] int GetFrameIndex() const override { return m_FrameIndex; }

    [[nodiscard]] Kernel::RectT<double> const & GetRect() const { return m_Rect; }
    /// Index in the document of the page that the frame lies on; -1 for a frame in no document.
    [[nodiscard]] int GetPageIndex() const;
    void SetRect(Kernel::RectT<double> const & rect) { m_Rect = rect; }

private:
    friend class TextFlow;

    Kernel::RectT<double> m_Rect;
    /// Back pointer of the flow that lists this frame.
    TextFlow * m_Flow = nullptr;
    int m_FrameIndex = -1;
};
