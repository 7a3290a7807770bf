#include "framework/document/DOMVisitor.h"

#include "framework/document/NodeInterfaces.h"

DOMVisitor::~DOMVisitor() = default;

void DOMVisitor::Visit(Kernel::JailNonCounted<Node> node)
{
    if (!node || IsAborted()) {
        return;
    }
    for (Translator const & translator : m_Translators) {
        if (translator(*node)) {
            break;
        }
    }
    for (NodeChildListType const list :
         {NodeChildListSpreads, NodeChildListUnder, NodeChildListItems, NodeChildListOver, NodeChildListMasters}) {
        for (Kernel::JailCounted<Node> const & child : node->GetChildren(list)) {
            Visit(child.Get());
        }
    }
}

bool VisitedStories::HasVisitedStory(Kernel::NonCounted<StoryInterface const> story)
{
    return !m_Stories.insert(story->GetStory().Get()).second;
}
