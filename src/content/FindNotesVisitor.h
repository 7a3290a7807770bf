#pragma once

#include "framework/document/DOMVisitor.h"
#include "framework/document/Node.h"
#include "framework/story/StoryPos.h"

#include <vector>

namespace Book
{

/// Finds the note references of a document: each story once, in the order of the tree, and in text order within it. The
/// caller holds the document's reader lock for as long as it looks at what was found.
class FindNotesVisitor : public DOMVisitorT<FindNotesVisitor>
{
public:
    /// A note reference and the node through which its story was met.
    struct Item
    {
        Story::StoryPos m_Position;
        Kernel::JailCounted<Node> m_Node;
    };

    FindNotesVisitor();

    [[nodiscard]] std::vector<Item> const & GetItems() const { return m_Items; }

private:
    void VisitNode(Node & node);

    std::vector<Item> m_Items;
    VisitedStories m_Visited;
};

}
