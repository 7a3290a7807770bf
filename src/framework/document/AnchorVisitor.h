#pragma once

#include "framework/document/Anchors.h"

class Node;
class PDFBookmarkManager;

/// Finds the anchors of a tree: headings' anchors and those that a writer set, in text order, story by story.
class AnchorVisitor
{
public:
    /// `bookmarksOnly` leaves out anchors that make no PDF bookmark.
    explicit AnchorVisitor(bool bookmarksOnly);
    ~AnchorVisitor();

    /// Adds the anchors of the node and everything below it to the list. The document is read under its reader lock,
    /// which the caller holds.
    void Visit(Kernel::JailNonCounted<Node> node);
    [[nodiscard]] Kernel::Counted<Anchors> GetAnchors() const { return m_Anchors; }

    /// The anchors in the order of the document's bookmark tree, each after its parent. Blind anchors are left out.
    void GetSortedAndFiltered(Kernel::Counted<DocumentController const> document,
                              std::vector<Kernel::Counted<AnchorInstance const>> & anchors) const;
    /// The nearest anchor before it, among the bookmarks, whose heading stands higher in the outline; null at the top.
    /// The same objects as in the sorted list are returned.
    [[nodiscard]] Kernel::Counted<AnchorInstance const>
    GetParentInstance(Kernel::Counted<DocumentController const> document,
                      Kernel::Counted<AnchorInstance const> anchor) const;

private:
    Kernel::Counted<Anchors> m_Anchors;
    bool m_BookmarksOnly;
};
