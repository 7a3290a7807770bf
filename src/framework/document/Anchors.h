#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"

#include <vector>

namespace Story
{
class AnchorData;
}
class DocumentController;
class Selection;
class SpreadNode;
class TextFlow;

/// One anchor at its place: the anchor's data, and where in the document it stands. A blind anchor has no place: it
/// stands for an anchor of another chapter.
///
/// Made by a visitor as a picture of the moment: it does not follow later edits.
class AnchorInstance : public virtual Kernel::Countable
{
public:
    AnchorInstance(Kernel::Counted<Story::AnchorData const> anchor, Kernel::Counted<TextFlow> flow, std::uint32_t position,
                   int outlineLevel);
    /// A blind anchor of the chapter at that position of the book.
    AnchorInstance(Kernel::Counted<Story::AnchorData const> anchor, int chapterIndex);
    ~AnchorInstance() override;

    [[nodiscard]] Kernel::Counted<Story::AnchorData const> GetAnchor() const { return m_Anchor; }
    [[nodiscard]] String GetUid() const;
    [[nodiscard]] String GetName() const;
    [[nodiscard]] bool IsPDFBookmark() const;
    [[nodiscard]] bool IsBlind() const { return !m_Flow; }
    /// Position of the chapter in its book; -1 for an anchor with a place.
    [[nodiscard]] int GetChapterIndex() const { return m_ChapterIndex; }

    /// The spread that shows the anchor, with the top left of its line there, as saved layout or last composition had it.
    /// Null, with `point` left alone, for a blind anchor and for text that found no place.
    [[nodiscard]] Kernel::JailCounted<SpreadNode> GetSpreadAndTargetPoint(Kernel::PointT<double> & point) const;
    /// A selection of the anchor's place; null for a blind anchor.
    [[nodiscard]] Kernel::Counted<Selection> CreateSelection() const;

    [[nodiscard]] Kernel::Counted<TextFlow> const & GetTextFlow() const { return m_Flow; }
    /// Position in the flow's story.
    [[nodiscard]] std::uint32_t GetPosition() const { return m_Position; }
    /// Depth in the outline from 1; 0 for an anchor whose paragraph is no heading.
    [[nodiscard]] int GetOutlineLevel() const { return m_OutlineLevel; }

private:
    Kernel::Counted<Story::AnchorData const> m_Anchor;
    Kernel::Counted<TextFlow> m_Flow;
    std::uint32_t m_Position = 0;
    int m_OutlineLevel = 0;
    int m_ChapterIndex = -1;
};

/// A list of anchors, in the order in which they were added.
class Anchors : public virtual Kernel::Countable
{
public:
    using List = std::vector<Kernel::Counted<AnchorInstance const>>;

    Anchors();
    ~Anchors() override;

    [[nodiscard]] List::const_iterator begin() const { return m_Anchors.begin(); }
    [[nodiscard]] List::const_iterator end() const { return m_Anchors.end(); }
    [[nodiscard]] int size() const { return static_cast<int>(m_Anchors.size()); }

    void Add(Kernel::Counted<AnchorInstance const> anchor) { m_Anchors.push_back(std::move(anchor)); }
    /// Adds a blind anchor.
    void Add(Kernel::Counted<Story::AnchorData> anchor, int chapterIndex);

private:
    List m_Anchors;
};
