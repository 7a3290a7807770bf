#include "framework/document/DocumentNode.h"

#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/TextFlow.h"
#include "framework/story/Index.h"
#include "framework/story/StyleSheet.h"

#include <algorithm>

DocumentNode::DocumentNode(Kernel::Counted<DocumentPictures> pictures)
    : m_Index(Kernel::MakeCounted<Story::Index>()),
      m_StyleSheet(Kernel::MakeCounted<Story::StyleSheet>()),
      m_Swatches(Kernel::Counted<Swatches const>(Kernel::MakeCounted<Swatches>(std::vector<Swatch>()))),
      m_Pictures(std::move(pictures))
{
    KORVANE_ASSERT(m_Pictures);
    SetSections({});
}

DocumentNode::~DocumentNode() = default;

Kernel::RectT<double> DocumentNode::GetSpreadBaseBox(bool) const
{
    return Kernel::Rect::Empty();
}

int DocumentNode::GetPageCount() const
{
    int count = 0;
    for (Kernel::JailCounted<Node> const & spread : GetChildren(NodeChildListSpreads)) {
        count += static_cast<SpreadNode const &>(*spread).GetPageCount();
    }
    return count;
}

Kernel::JailCounted<SpreadNode> DocumentNode::GetSpreadAtIndex(int index) const
{
    return Kernel::JailCounted<SpreadNode>(
        static_cast<SpreadNode *>(GetChildAtIndex(NodeChildListSpreads, index).Get()));
}

int DocumentNode::FindSpread(Kernel::JailCounted<SpreadNode> const & spread) const
{
    return spread && this == spread->GetParent() && Kind::Spread == spread->GetKind() ? spread->GetNodeIndex() : -1;
}

int DocumentNode::GetSpreadIndexForPageIndex(int pageIndex) const
{
    int first = 0;
    for (int i = 0; 0 <= pageIndex && i < GetSpreadCount(); ++i) {
        first += GetSpreadAtIndex(i)->GetPageCount();
        if (pageIndex < first) {
            return i;
        }
    }
    return -1;
}

bool DocumentNode::HasBleed() const
{
    Kernel::Rect const & bleed = m_PageSetup.m_Bleed;
    return 0 < bleed.left || 0 < bleed.top || 0 < bleed.right || 0 < bleed.bottom;
}

std::vector<Kernel::Counted<DocumentSection const>> DocumentNode::GetSections() const
{
    unsigned int const pageCount = static_cast<unsigned int>(GetPageCount());
    std::vector<Kernel::Counted<DocumentSection const>> sections;
    for (Kernel::Counted<DocumentSection const> const & section : m_Sections) {
        if (0 == section->GetStartPageIndex() || section->GetStartPageIndex() < pageCount) {
            sections.push_back(section);
        }
    }
    return sections;
}

Kernel::Counted<DocumentSection const> DocumentNode::GetSection(int index) const
{
    auto const sections = GetSections();
    return 0 <= index && index < static_cast<int>(sections.size()) ? sections[static_cast<std::size_t>(index)]
                                                                   : nullptr;
}

Kernel::Counted<DocumentSection const> DocumentNode::GetSectionFromPageNumber(unsigned int pageIndex) const
{
    auto const after =
        std::upper_bound(m_Sections.begin(), m_Sections.end(), pageIndex,
                         [](unsigned int page, auto const & section) { return page < section->GetStartPageIndex(); });
    return *std::prev(after);
}

String DocumentNode::GetFormattedPageNumber(unsigned int pageIndex) const
{
    return GetSectionFromPageNumber(pageIndex)->FormatNumber(GetPageNumber(pageIndex));
}

unsigned int DocumentNode::GetPageNumber(unsigned int pageIndex) const
{
    Kernel::Counted<DocumentSection const> const section = GetSectionFromPageNumber(pageIndex);
    return section->GetStartNumberingAt() + (pageIndex - section->GetStartPageIndex());
}

void DocumentNode::SetSections(std::vector<DocumentSection::Values> sections)
{
    if (sections.empty()) {
        sections.emplace_back();
    }
    std::stable_sort(sections.begin(), sections.end(),
                     [](auto const & a, auto const & b) { return a.m_StartPageIndex < b.m_StartPageIndex; });
    sections.front().m_StartPageIndex = 0;
    sections.front().m_RestartPageNumbering = true;
    for (std::size_t i = 1; i < sections.size(); ++i) {
        if (!sections[i].m_RestartPageNumbering) {
            sections[i].m_StartNumberingAt =
                sections[i - 1].m_StartNumberingAt + (sections[i].m_StartPageIndex - sections[i - 1].m_StartPageIndex);
        }
    }
    m_Sections.clear();
    for (DocumentSection::Values & values : sections) {
        m_Sections.push_back(Kernel::MakeCounted<DocumentSection>(std::move(values)));
    }
}

Kernel::JailCounted<MasterSpreadNode> DocumentNode::GetMasterAtIndex(int index) const
{
    return Kernel::JailCounted<MasterSpreadNode>(
        static_cast<MasterSpreadNode *>(GetChildAtIndex(NodeChildListMasters, index).Get()));
}

Kernel::JailCounted<MasterSpreadNode> DocumentNode::FindMaster(String const & name) const
{
    for (int i = 0; i < GetMasterCount(); ++i) {
        Kernel::JailCounted<MasterSpreadNode> const master = GetMasterAtIndex(i);
        if (name == master->GetName()) {
            return master;
        }
    }
    return nullptr;
}

void DocumentNode::AdoptIndex(Kernel::Counted<Story::Index> index)
{
    KORVANE_ASSERT(index);
    m_Index = std::move(index);
}

Kernel::Counted<TextFlow> DocumentNode::GetMainFlow() const
{
    for (Kernel::Counted<TextFlow> const & flow : m_TextFlows) {
        if (flow->IsGrowing()) {
            return flow;
        }
    }
    return nullptr;
}

void DocumentNode::AddTextFlow(Kernel::Counted<TextFlow> flow)
{
    KORVANE_ASSERT(flow);
    m_TextFlows.push_back(std::move(flow));
}

void DocumentNode::RemoveTextFlow(Kernel::Counted<TextFlow> const & flow)
{
    std::erase(m_TextFlows, flow);
}

void DocumentNode::SetStyleSheet(Kernel::Counted<Story::StyleSheet const> styles)
{
    KORVANE_ASSERT(styles);
    m_StyleSheet = std::move(styles);
}

void DocumentNode::UpdateEmbeddedDocuments()
{
    RemoveChildren(NodeChildListItems);
    for (auto const & [id, entry] : m_Pictures->GetEntries()) {
        if (entry.m_IsProtected) {
            AppendChild(NodeChildListItems, Kernel::MakeCounted<EmbeddedDocumentNode>(Kernel::Rect::Empty(),
                                                                                      entry.m_SourcePath, id, true));
        }
    }
}

String DocumentNode::GetPicturePassword(String const & id) const
{
    for (Kernel::JailCounted<Node> const & child : GetChildren(NodeChildListItems)) {
        auto const & embedded = static_cast<EmbeddedDocumentNode const &>(*child);
        if (embedded.GetGUID() == id) {
            return embedded.GetPassword();
        }
    }
    return {};
}
