#pragma once

#include "framework/document/TextFrameNode.h"

#include <memory>
#include <vector>

namespace Story
{
class Layout;
class Story;
class Selection;
}
class Selection;

/// A story in its chain of frames, with its composed layout.
///
/// Frame `i` of the chain shows lines of frame `i` of the layout. The layout is a snapshot: composing puts another in its
/// place. It is had without its glyphs where only facts are asked (`GetLayout`), and with them for drawing
/// (`GetLayoutWithGlyphs`), which reads them from the file the first time.
class TextFlow : public virtual Kernel::Countable
{
public:
    TextFlow();
    ~TextFlow() override;

    [[nodiscard]] Kernel::Counted<Story::Story> const & GetStory() const { return m_Story; }
    void SetStory(Kernel::Counted<Story::Story> story);

    [[nodiscard]] std::vector<Kernel::JailCounted<TextFrameNode>> const & GetFrames() const { return m_Frames; }
    void SetFrames(std::vector<Kernel::JailCounted<TextFrameNode>> frames);

    /// Null before the first composition.
    [[nodiscard]] Kernel::Counted<Story::Layout const> const & GetLayout() const { return m_Layout; }
    void SetLayout(Kernel::Counted<Story::Layout const> layout);

    /// The text, styles or frames have changed since the layout was made.
    [[nodiscard]] bool IsDirty() const { return m_Dirty; }
    void SetDirty(bool dirty) { m_Dirty = dirty; }

    /// The chain grows and shrinks with the text, by whole pages made from the document's masters.
    [[nodiscard]] bool IsGrowing() const { return m_Growing; }
    void SetGrowing(bool growing) { m_Growing = growing; }

    [[nodiscard]] Kernel::Counted<Selection> MakeSelection(Story::Selection const & selection);

    /// The frame that shows the position, and the box of its line from the position on, in the frame's spread
    /// coordinates. Null if the text there found no place.
    [[nodiscard]] Kernel::JailCounted<TextFrameNode> FindPosition(std::uint32_t position, Kernel::RectT<double> & box) const;

private:
    Kernel::Counted<Story::Story> m_Story;
    std::vector<Kernel::JailCounted<TextFrameNode>> m_Frames;
    Kernel::Counted<Story::Layout const> m_Layout;
    bool m_Dirty = true;
    bool m_Growing = false;
};
