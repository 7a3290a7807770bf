#include "framework/document/DocumentController.h"
#include "framework/document/DocumentSettings.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/ShapeNode.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/TableGlyph.h"

#include <map>
#include <set>

namespace
{

void FillMasterPage(MasterSpreadNode & master, MasterPageSettings const & settings, Kernel::Rect const & page)
{
    for (ShapeSettings const & shape : settings.m_Shapes) {
        master.AppendChild(shape.m_Under ? NodeChildListUnder : NodeChildListOver,
                           Kernel::MakeCounted<ShapeNode>(shape.m_Rect.Moved(page.left, page.top), shape.m_Fill,
                                                          shape.m_Stroke, shape.m_StrokeWidth));
    }
    for (RunningTextSettings const & text : settings.m_RunningTexts) {
        master.AppendChild(NodeChildListItems,
                           Kernel::MakeCounted<RunningTextNode>(text.m_Rect.Moved(page.left, page.top), text.m_Parts,
                                                                text.m_Alignment, text.m_Style));
    }
}

Kernel::Counted<MasterSpreadNode> MakeMaster(MasterSettings const & settings, PageSetup const & setup)
{
    double const width = setup.m_PageSize.width;
    double const height = setup.m_PageSize.height;
    std::vector<SpreadPage> pages;
    std::vector<Kernel::Rect> textRects;
    std::vector<MasterPageSettings const *> sources;
    if (setup.m_FacingPages) {
        sources.push_back(&settings.m_Left);
    }
    sources.push_back(&settings.m_Right);
    for (std::size_t i = 0; i < sources.size(); ++i) {
        double const x = setup.m_VerticalStack ? 0 : static_cast<double>(i) * width;
        double const y = setup.m_VerticalStack ? static_cast<double>(i) * height : 0;
        SpreadPage page;
        page.m_Rect = {x, y, x + width, y + height};
        page.m_Bleed = setup.m_Bleed;
        page.m_Side = !setup.m_FacingPages ? PageSide::Single : 0 == i ? PageSide::Left : PageSide::Right;
        pages.push_back(page);
        textRects.push_back(sources[i]->m_TextRect);
    }
    Kernel::Counted<MasterSpreadNode> master = Kernel::MakeCounted<MasterSpreadNode>(settings.m_Name, pages, textRects);
    for (std::size_t i = 0; i < sources.size(); ++i) {
        FillMasterPage(*master, *sources[i], pages[i].m_Rect);
    }
    return master;
}

/// The pictures that a story names, those of its notes and cells too.
void CollectPictures(Story::Story const & story, std::set<String> & ids)
{
    for (Story::Story::Object const & object : story.GetObjects()) {
        if (auto const * const picture = dynamic_cast<Story::PictureGlyph const *>(object.m_Glyph.Get())) {
            ids.insert(PictureReference::Parse(picture->GetFields().m_DataId).m_Id);
        }
        for (std::size_t i = 0; i < object.m_Glyph->GetStoryCount(); ++i) {
            if (Kernel::Counted<Story::Story const> const inner = object.m_Glyph->GetStory(i)) {
                CollectPictures(*inner, ids);
            }
        }
    }
}

/// Gives new anchors the uids that anchors of the same name had. Of several of one name, the first with the first.
void KeepUids(Story::Story const & oldStory, Story::Story const & newStory)
{
    std::multimap<String, String> uids;
    for (Story::CollectedAnchor const & anchor : Story::CollectAnchors(oldStory)) {
        if (!anchor.m_Data->GetUid().Empty()) {
            uids.emplace(anchor.m_Data->GetName(), anchor.m_Data->GetUid());
        }
    }
    for (Story::CollectedAnchor const & anchor : Story::CollectAnchors(newStory)) {
        auto const known = uids.find(anchor.m_Data->GetName());
        if (anchor.m_Data->GetUid().Empty() && known != uids.end()) {
            anchor.m_Data->SetUid(known->second);
            uids.erase(known);
        }
    }
}

}

Kernel::Counted<DocumentController> DocumentController::CreateDocument(DocumentSettings const & settings,
                                                                       Kernel::Counted<Story::Story> story)
{
    Kernel::Counted<DocumentController> document = Kernel::MakeCounted<DocumentController>();
    document->ReplaceContent(settings, std::move(story));
    document->m_Loaded = true;
    return document;
}

void DocumentController::ReplaceContent(DocumentSettings const & settings, Kernel::Counted<Story::Story> story)
{
    KORVANE_ASSERT(story);
    m_History.Clear();
    // A section that is still there keeps the number that its book gave it.
    std::map<unsigned int, unsigned int> numbers;
    bool const isNew = !m_Document->GetMainFlow();
    for (Kernel::Counted<DocumentSection const> const & section : m_Document->GetAllSections()) {
        if (isNew) {
            break;
        }
        numbers.emplace(section->GetStartPageIndex(), section->GetStartNumberingAt());
    }
    std::vector<DocumentSection::Values> sections = settings.m_Sections;
    if (sections.empty()) {
        sections.emplace_back();
    }
    for (DocumentSection::Values & section : sections) {
        if (auto const known = numbers.find(section.m_StartPageIndex); known != numbers.end()) {
            section.m_StartNumberingAt = known->second;
        }
    }
    if (Kernel::Counted<TextFlow> const old = m_Document->GetMainFlow()) {
        KeepUids(*old->GetStory(), *story);
    }

    while (!m_Document->GetTextFlows().empty()) {
        m_Document->RemoveTextFlow(m_Document->GetTextFlows().back());
    }
    m_Document->RemoveChildren(NodeChildListSpreads);
    m_Document->RemoveChildren(NodeChildListMasters);
    m_Document->SetPageSetup(settings.m_PageSetup);
    m_Document->SetPublicationTitle(settings.m_PublicationTitle);
    m_Document->SetSwatches(Kernel::Counted<Swatches const>(Kernel::MakeCounted<Swatches>(settings.m_Swatches)));
    if (settings.m_Styles) {
        m_Document->SetStyleSheet(settings.m_Styles);
    }
    for (MasterSettings const & master : settings.m_Masters) {
        m_Document->AppendChild(NodeChildListMasters, MakeMaster(master, settings.m_PageSetup));
    }
    m_Document->SetSections(std::move(sections));

    for (PictureSettings const & picture : settings.m_Pictures) {
        GetPictures().Add(picture.m_Bytes, picture.m_Entry);
    }
    std::set<String> pictures;
    CollectPictures(*story, pictures);
    GetPictures().RemoveUnless([&pictures](String const & id) { return pictures.contains(id); });
    m_Document->UpdateEmbeddedDocuments();

    ReplaceIndexTopics(*story);
    Kernel::Counted<TextFlow> const flow = Kernel::MakeCounted<TextFlow>(std::move(story));
    flow->SetGrowing(true);
    m_Document->AddTextFlow(flow);

    DocumentMetadata::Values metadata = settings.m_Metadata;
    DocumentMetadata::Values const & old = GetMetadata()->GetValues();
    if (metadata.m_Created.Empty()) {
        metadata.m_Created = old.m_Created;
        metadata.m_Modified = old.m_Modified;
    }
    SetMetadata(std::move(metadata));
    SetFormatAndProfiles(settings.m_Format, settings.m_Profiles);
    MarkChanged();
    SetTextDirty();
    ComposeText(false, nullptr);
    UpdateRunningHeads();
}

namespace
{

void CollectTopics(Story::Story const & story, std::vector<String> & topics)
{
    for (Story::Story::Object const & object : story.GetObjects()) {
        if (auto const * const mark = dynamic_cast<Story::IndexMarkGlyph const *>(object.m_Glyph.Get())) {
            topics.push_back(mark->GetTopicNameWithParents());
        }
        for (std::size_t i = 0; i < object.m_Glyph->GetStoryCount(); ++i) {
            if (Kernel::Counted<Story::Story const> const inner = object.m_Glyph->GetStory(i)) {
                CollectTopics(*inner, topics);
            }
        }
    }
}

}

void DocumentController::ReplaceIndexTopics(Story::Story const & story)
{
    // Topics that came from the book stay, with their GUIDs: their removal is the book's affair.
    std::vector<String> topics;
    CollectTopics(story, topics);
    Kernel::Counted<Story::Index> const index = m_Document->GetIndex();
    for (String const & topic : topics) {
        index->EnsureTopic(topic);
    }
}
