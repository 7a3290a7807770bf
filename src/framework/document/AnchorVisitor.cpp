#include "framework/document/AnchorVisitor.h"

#include "framework/document/DOMVisitor.h"
#include "framework/story/FlowComposer.h"

#include <algorithm>

namespace
{

/// Meets each flow once, at its first frame.
class FlowFinder : public DOMVisitorT<FlowFinder>
{
public:
    FlowFinder() { AddTerminatingTranslator<TextFrameNode>(&FlowFinder::OnTextFrame); }
    [[nodiscard]] std::vector<Kernel::Counted<TextFlow>> const & GetFlows() const { return m_Flows; }

private:
    void OnTextFrame(TextFrameNode & frame)
    {
        Kernel::Counted<TextFlow> const flow = frame.GetTextFlow();
        if (flow && std::find(m_Flows.begin(), m_Flows.end(), flow) == m_Flows.end()) {
            m_Flows.push_back(flow);
        }
    }

    std::vector<Kernel::Counted<TextFlow>> m_Flows;
};

}

AnchorVisitor::AnchorVisitor(bool bookmarksOnly)
    : m_Anchors(Kernel::MakeCounted<Anchors>()),
      m_BookmarksOnly(bookmarksOnly)
{
}

AnchorVisitor::~AnchorVisitor() = default;

void AnchorVisitor::Visit(Kernel::JailNonCounted<Node> node)
{
    FlowFinder finder;
    finder.Visit(node);
    for (Kernel::Counted<TextFlow> const & flow : finder.GetFlows()) {
        std::vector<Story::CollectedAnchor> const anchors = Story::CollectAnchors(*flow->GetStory());
        for (std::size_t i = 0; i < anchors.size(); ++i) {
            if (!m_BookmarksOnly || anchors[i].m_Data->IsPDFBookmark()) {
                m_Anchors->Add(
                    Kernel::MakeCounted<AnchorInstance>(anchors[i].m_Data, flow, i, anchors[i].m_StoryOffset));
            }
        }
    }
}

void AnchorVisitor::GetSortedAndFiltered(Kernel::Counted<DocumentController const>,
                                         std::vector<Kernel::Counted<AnchorInstance const>> & anchors) const
{
    // Text order is the order of the tree: a parent is a heading further up.
    for (Kernel::Counted<AnchorInstance const> const & anchor : *m_Anchors) {
        if (!anchor->IsBlind()) {
            anchors.push_back(anchor);
        }
    }
}

Kernel::Counted<AnchorInstance const>
AnchorVisitor::GetParentInstance(Kernel::Counted<DocumentController const>,
                                 Kernel::Counted<AnchorInstance const> anchor) const
{
    Kernel::Counted<AnchorInstance const> parent;
    for (Kernel::Counted<AnchorInstance const> const & candidate : *m_Anchors) {
        if (candidate == anchor) {
            return parent;
        }
        if (!candidate->IsPDFBookmark() || candidate->IsBlind() || candidate->GetTextFlow() != anchor->GetTextFlow()) {
            continue;
        }
        // An anchor without a level hangs under whatever heading stands before it.
        bool const stands =
            0 < candidate->GetOutlineLevel() &&
            (0 == anchor->GetOutlineLevel() || candidate->GetOutlineLevel() < anchor->GetOutlineLevel());
        if (stands) {
            parent = candidate;
        }
    }
    return nullptr;
}
