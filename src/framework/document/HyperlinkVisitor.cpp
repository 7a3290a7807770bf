#include "framework/document/HyperlinkVisitor.h"

#include "framework/document/SpreadNode.h"

namespace
{

/// Index of the page of a place of the flow's layout; -1 if it has none.
int PageOfPlace(TextFlow const & flow, Story::LayoutItem::Place const & place)
{
    Kernel::JailCounted<TextFrameNode> const frame = place.IsPlaced() ? flow.GetFrame(place.m_Frame) : nullptr;
    return frame ? frame->GetPageIndex() : -1;
}

/// Null for a link that leads nowhere.
Kernel::Counted<HyperlinkData> MakeLink(TextFlow const & flow, Story::Layout const & layout,
                                        Story::LayoutItem::Link const & link)
{
    Kernel::Counted<HyperlinkData> data = Kernel::MakeCounted<HyperlinkData>();
    if (Story::LayoutItem::None != link.m_Note) {
        Story::LayoutItem::Note const & note = layout.GetNotes()[link.m_Note];
        data->m_Type = Story::HyperlinkData::Type::Page;
        data->m_PageIndex = PageOfPlace(flow, link.m_LeadsBack ? note.m_Reference : note.m_Text);
        return data->m_PageIndex < 0 ? nullptr : data;
    }
    if (Story::LayoutItem::None == link.m_Hyperlink) {
        return nullptr;
    }
    data->m_Story = layout.GetHyperlink(link.m_Hyperlink);
    data->m_Type = data->m_Story->GetType();
    data->m_PageIndex = data->m_Story->GetPageIndex();
    data->m_SectionIndex = data->m_Story->GetSectionIndex();
    data->m_ChapterIndex = data->m_Story->GetChapterIndex();
    data->m_IsEndnotes = data->m_Story->IsEndnotes();
    data->m_IsActive = data->m_Story->IsActive();
    if (Story::HyperlinkData::Type::Anchor == data->m_Type && !data->m_IsEndnotes) {
        String const & uid = data->m_Story->GetAnchorUid();
        if (uid.Empty()) {
            return nullptr;
        }
        data->m_Anchor = Kernel::MakeCounted<AnchorInstance>(
            Kernel::MakeCounted<Story::AnchorData>(String(), false, false, uid), -1);
    }
    return data;
}

void CollateFrame(TextFrameNode const & frame, std::vector<Kernel::Counted<HyperlinkData>> & links)
{
    Kernel::Counted<TextFlow> const flow = frame.GetTextFlow();
    Kernel::Counted<Story::Layout const> const layout = flow ? flow->GetLayout() : nullptr;
    std::size_t const number = static_cast<std::size_t>(frame.GetFrameIndex());
    if (!layout || layout->GetFrames().size() <= number) {
        return;
    }
    Raster::AffineTransform::Params const toSpread = frame.GetStoryToDomainTransform();
    Kernel::Counted<HyperlinkData> current;
    Story::LayoutItem::Link const * previous = nullptr;
    for (Story::LayoutItem::Link const & link : layout->GetLinks(layout->GetFrames()[number])) {
        // Rectangles of a link that breaks over lines follow each other.
        bool const goesOn = previous && previous->m_Hyperlink == link.m_Hyperlink && previous->m_Note == link.m_Note &&
                            previous->m_LeadsBack == link.m_LeadsBack;
        if (!goesOn) {
            current = MakeLink(*flow, *layout, link);
            if (current) {
                links.push_back(current);
            }
        }
        if (current) {
            current->m_Rects.push_back(toSpread.MapBounds({link.m_Left, link.m_Top, link.m_Right, link.m_Bottom}));
        }
        previous = &link;
    }
}

}

void HyperlinkVisitor::CollateForExport(Kernel::Counted<DocumentController const>,
                                        Kernel::JailNonCounted<SpreadNode> spread,
                                        std::vector<Kernel::Counted<HyperlinkData>> & links)
{
    if (!spread) {
        return;
    }
    for (NodeChildListType const list : {NodeChildListUnder, NodeChildListItems, NodeChildListOver}) {
        for (Kernel::JailCounted<Node> const & item : spread->GetChildren(list)) {
            if (Node::Kind::TextFrame == item->GetKind()) {
                CollateFrame(static_cast<TextFrameNode const &>(*item), links);
            }
        }
    }
}
