#pragma once

#include "framework/commands/ExportItemCommandBase.h"
#include "framework/document/NodeInterfaces.h"

#include <vector>

class HyperlinkData;

namespace Book
{

class BookChapter;
class ExportBookCommand;

/// Writes one batch of a chapter's pages into the book's PDF. It runs on the chapter document's queue while the export
/// command waits, gives up the document's writer lock for as long as it renders, and resolves every link on its pages
/// to the output pages of the whole book.
class ExportToPDFCommand : public ExportItemCommandBase
{
public:
    /// Everything is borrowed from the export command and outlives this one. `previousDocument` may be null;
    /// nodes that are not in the command's own document, as on a page that two chapters share, are its nodes.
    ExportToPDFCommand(Renderer::RenderTree::PdfExport * pdf,
                       std::vector<Kernel::JailCounted<ExportableInterface>> exportables,
                       Kernel::Counted<Renderer::FileExportOptionsPDF const> options,
                       VisibilityInterface::VisibilityTestOptions const & visibility,
                       std::vector<Renderer::RenderTree::Warning> * warnings, bool hasReporter, bool notTemp,
                       ExportBookCommand * exportCommand, Kernel::Counted<DocumentController const> previousDocument,
                       Kernel::Counted<BookChapter const> chapter);

    Kernel::LocalisedString GetDescription() const override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    /// Streams can name the class, and yet make none: an export command gives it all that it works on.
    static Kernel::ClassProperties const & GetTypeClassProperties();
    void Do() override;
    /// Says nothing: the export command reports.
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    void CollatePageHyperlinks(ExportableInterface::ExportParams const & page,
                               std::vector<Renderer::PdfHyperlink> & links) override;

private:
    void CollateLink(std::vector<Renderer::PdfHyperlink> & links, HyperlinkData const & link,
                     Kernel::JailCounted<SpreadNode> const & spread,
                     Kernel::Counted<DocumentController const> const & document,
                     ExportableInterface::ExportParams const & page, std::size_t node);
    /// Fills in where the link leads. False if it leads nowhere.
    bool Resolve(Renderer::PdfHyperlink & target, HyperlinkData const & link,
                 Kernel::Counted<DocumentController const> const & document);
    bool ResolveFile(Renderer::PdfHyperlink & target, HyperlinkData const & link);

    static Kernel::ClassProperties const ms_ClassProperties;

    Renderer::RenderTree::PdfExport * m_PdfExport;
    Kernel::Counted<Renderer::FileExportOptionsPDF const> m_Options;
    std::vector<Kernel::JailCounted<ExportableInterface>> m_Exportables;
    VisibilityInterface::VisibilityTestOptions m_VisibilityOptions;
    std::vector<Renderer::RenderTree::Warning> * m_Warnings;
    ExportBookCommand * m_ExportCommand;
    Kernel::Counted<DocumentController const> m_PreviousDocument;
    Kernel::Counted<BookChapter const> m_Chapter;
};

}
