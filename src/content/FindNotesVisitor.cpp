#include "content/FindNotesVisitor.h"

#include "framework/document/NodeInterfaces.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/Story.h"

namespace Book
{

FindNotesVisitor::FindNotesVisitor()
{
    AddTerminatingTranslator<Node>(&FindNotesVisitor::VisitNode);
}

void FindNotesVisitor::VisitNode(Node & node)
{
    auto const * const holder = dynamic_cast<StoryInterface const *>(&node);
    if (!holder || m_Visited.HasVisitedStory(holder)) {
        return;
    }
    Kernel::Counted<Story::Story> const story = holder->GetStory();
    std::vector<Story::StoryPos> found;
    story->gbegin().BaseCollectIf(found, story->gend(false), Story::IsNoteReferenceGlyph());
    for (Story::StoryPos const & position : found) {
        m_Items.push_back({position, Kernel::JailCounted<Node>(&node)});
    }
}

}
