#pragma once

#include "framework/document/DocumentPictures.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/Node.h"
#include "framework/document/PageSetup.h"
#include "framework/document/Swatches.h"
#include "framework/document/TextFlow.h"
#include "framework/story/Index.h"
#include "framework/story/StyleSheet.h"

#include <vector>

/// Root of a document's tree: its spreads, masters, sections, styles and text flows.
///
/// Reading needs the document's reader lock, changing its writer lock. Page indices count through the whole document
/// from 0 and are not page numbers: those come from the sections.
class DocumentNode : public Node
{
public:
    explicit DocumentNode(Kernel::Counted<DocumentPictures> pictures);
    ~DocumentNode() override;

    [[nodiscard]] Kind GetKind() const override { return Kind::Document; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool includeStroke) const override;

    // Pages and spreads.

    [[nodiscard]] int GetPageCount() const;
    [[nodiscard]] int GetSpreadCount() const { return GetChildCount(NodeChildListSpreads); }
    /// Null if the index is out of range.
    [[nodiscard]] Kernel::JailCounted<SpreadNode> GetSpreadAtIndex(int index) const;
    /// Index of the spread in this document, -1 if it is not one of its spreads. A master spread is none.
    [[nodiscard]] int FindSpread(Kernel::JailCounted<SpreadNode> const & spread) const;
    /// The spread that holds the page; -1 if there is no such page.
    [[nodiscard]] int GetSpreadIndexForPageIndex(int pageIndex) const;
    [[nodiscard]] bool HasBleed() const;
    [[nodiscard]] bool IsFacingPages() const { return m_PageSetup.m_FacingPages; }
    [[nodiscard]] bool IsVerticalStack() const { return m_PageSetup.m_VerticalStack; }
    [[nodiscard]] PageSetup const & GetPageSetup() const { return m_PageSetup; }
    void SetPageSetup(PageSetup setup) { m_PageSetup = std::move(setup); }

    // Sections.

    /// In page order. Sections that begin beyond the last page are left out.
    [[nodiscard]] std::vector<Kernel::Counted<DocumentSection const>> GetSections() const;
    /// Null if the index is out of range.
    [[nodiscard]] Kernel::Counted<DocumentSection const> GetSection(int index) const;
    /// The section of the page with that index (not number); null only if there is no section at all.
    [[nodiscard]] Kernel::Counted<DocumentSection const> GetSectionFromPageNumber(unsigned int pageIndex) const;
    /// What the page shows as its number, with the prefix; empty for a section without numbers.
    [[nodiscard]] String GetFormattedPageNumber(unsigned int pageIndex) const;
    [[nodiscard]] unsigned int GetPageNumber(unsigned int pageIndex) const;
    /// All sections, also those beyond the last page.
    [[nodiscard]] std::vector<Kernel::Counted<DocumentSection const>> const & GetAllSections() const
    {
        return m_Sections;
    }
    /// Puts the sections in page order, makes the first start at page 0 with a number of its own, and brings the
    /// numbers of those that run on in step. A list without sections gets a default one.
    void SetSections(std::vector<DocumentSection::Values> sections);

    // Masters.

    [[nodiscard]] int GetMasterCount() const { return GetChildCount(NodeChildListMasters); }
    [[nodiscard]] Kernel::JailCounted<MasterSpreadNode> GetMasterAtIndex(int index) const;
    /// Null if no master has the name.
    [[nodiscard]] Kernel::JailCounted<MasterSpreadNode> FindMaster(String const & name) const;

    // Text, styles and colours.

    /// The topic index; never null. One object for the life of the document, whatever its content.
    [[nodiscard]] Kernel::Counted<Story::Index> GetIndex() const { return m_Index; }
    /// For loading: the index from the file becomes this document's.
    void AdoptIndex(Kernel::Counted<Story::Index> index);
    [[nodiscard]] std::vector<Kernel::Counted<TextFlow>> const & GetTextFlows() const { return m_TextFlows; }
    /// The flow that grows and shrinks the document; null if it has none.
    [[nodiscard]] Kernel::Counted<TextFlow> GetMainFlow() const;
    void AddTextFlow(Kernel::Counted<TextFlow> flow);
    void RemoveTextFlow(Kernel::Counted<TextFlow> const & flow);
    [[nodiscard]] Kernel::Counted<Story::StyleSheet const> const & GetStyleSheet() const { return m_StyleSheet; }
    void SetStyleSheet(Kernel::Counted<Story::StyleSheet const> styles);
    [[nodiscard]] Kernel::Consolidated<Swatches> const & GetSwatches() const { return m_Swatches; }
    void SetSwatches(Kernel::Consolidated<Swatches> swatches) { m_Swatches = std::move(swatches); }

    /// The picture files that the document holds; never null.
    [[nodiscard]] Kernel::Counted<DocumentPictures> const & GetPictures() const { return m_Pictures; }

    /// Makes the nodes of the protected files that pictures of the text show, after the pictures have changed.
    void UpdateEmbeddedDocuments();
    /// The password of a picture of the text; empty if it needs none or none is known.
    [[nodiscard]] String GetPicturePassword(String const & id) const;

    /// What running heads show as the document's title. Worked out from title and text; never saved.
    [[nodiscard]] String const & GetRunningTitle() const { return m_RunningTitle; }
    void SetRunningTitle(String const & title) { m_RunningTitle = title; }
    /// Title of the whole publication, for running heads; empty if the document is not part of one.
    [[nodiscard]] String const & GetPublicationTitle() const { return m_PublicationTitle; }
    void SetPublicationTitle(String const & title) { m_PublicationTitle = title; }

private:
    std::vector<Kernel::Counted<DocumentSection const>> m_Sections;
    Kernel::Counted<Story::Index> m_Index;
    std::vector<Kernel::Counted<TextFlow>> m_TextFlows;
    Kernel::Counted<Story::StyleSheet const> m_StyleSheet;
    Kernel::Consolidated<Swatches> m_Swatches;
    Kernel::Counted<DocumentPictures> const m_Pictures;
    String m_RunningTitle;
    String m_PublicationTitle;
    PageSetup m_PageSetup;
};
