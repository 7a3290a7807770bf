#pragma once

#include "framework/document/TextFlow.h"
#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/story/AnchorData.h"

#include <vector>

class DocumentController;
class Selection;
class SpreadNode;

/// One anchor at its place: the anchor's data, and where in the document it stands. A blind anchor has no place: it
/// stands for an anchor of another chapter.
///
/// Made by a visitor as a picture of the moment: it does not follow later edits of the text, but sees a newer layout.
class AnchorInstance : public virtual Kernel::Countable
{
public:
    /// `index` is the anchor's number among the anchors of the flow's story, `offset` its offset there.
    AnchorInstance(Kernel::Counted<Story::AnchorData> anchor, Kernel::Counted<TextFlow> flow, std::size_t index,
                   std::size_t offset);
    /// A blind anchor of the chapter at that position of the book.
    AnchorInstance(Kernel::Counted<Story::AnchorData> anchor, int chapterIndex);
    ~AnchorInstance() override;

    [[nodiscard]] Kernel::Counted<Story::AnchorData> const & GetAnchor() const { return m_Anchor; }
    [[nodiscard]] String GetUid() const { return m_Anchor->GetUid(); }
    [[nodiscard]] String GetName() const { return m_Anchor->GetName(); }
    [[nodiscard]] bool IsPDFBookmark() const { return m_Anchor->IsPDFBookmark(); }
    /// Depth in the outline from 1; 0 for an anchor that is no heading's.
    [[nodiscard]] int GetOutlineLevel() const { return m_Anchor->GetLevel(); }
    [[nodiscard]] bool IsBlind() const { return !m_Flow; }
    /// Position of the chapter in its book; -1 for an anchor with a place.
    [[nodiscard]] int GetChapterIndex() const { return m_ChapterIndex; }

    /// The spread that shows the anchor, with the top left of its line there. Null, with `point` left alone, for a
    /// blind anchor and for text that found no place.
    Kernel::JailCounted<SpreadNode> GetSpreadAndTargetPoint(Kernel::PointT<double> & point) const;
    /// A selection of the anchor's place; null for a blind anchor.
    [[nodiscard]] Kernel::Counted<Selection> CreateSelection() const;

    [[nodiscard]] Kernel::Counted<TextFlow> const & GetTextFlow() const { return m_Flow; }
    /// Offset in the flow's story: of the anchor, or of the element that holds it.
    [[nodiscard]] std::size_t GetOffset() const { return m_Offset; }

private:
    [[nodiscard]] Kernel::JailCounted<TextFrameNode> FindPlace(Kernel::PointT<double> & inFrame) const;

    Kernel::Counted<Story::AnchorData> m_Anchor;
    Kernel::Counted<TextFlow> m_Flow;
    std::size_t m_Index = 0;
    std::size_t m_Offset = 0;
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
