#include "output/ExportToPDFCommand.h"

#include "core/BookChapter.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/HyperlinkVisitor.h"
#include "framework/document/Selection.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/TextFrameNode.h"
#include "framework/kernel/CommandCoverage.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/SequenceProgressReporter.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/PdfExport.h"
#include "output/ExportBookCommand.h"
#include "output/FileLink.h"

namespace Book
{

Kernel::ClassProperties const ExportToPDFCommand::ms_ClassProperties(Kernel::ClassUID("EPDF"), nullptr, 1, {},
                                                                     &DocumentCommand::GetTypeClassProperties());
static Kernel::ClassPropertiesBase::Init const s_ExportToPDFCommandInit(ExportToPDFCommand::GetTypeClassProperties());

namespace
{

bool const s_Covered =
    (CommandCoverage::Instance().Register(typeid(ExportToPDFCommand), "Book::ExportToPDFCommand"), true);

/// The boxes of what a link covers, in spread coordinates; none if it covers nothing that can be clicked.
std::vector<Kernel::Rect> BoxesOf(HyperlinkData const & link, Kernel::JailCounted<SpreadNode> const & spread)
{
    if (!link.m_Rects.empty()) {
        return link.m_Rects;
    }
    if (!link.m_Selection) {
        return {};
    }
    Kernel::Counted<Selection const> const selection = link.m_Selection->ClonePromotingRestrictedItems();
    std::vector<Kernel::Rect> boxes;
    for (Kernel::JailCounted<Node> const & node : *selection) {
        if (selection->IsText()) {
            if (Kernel::Counted<TextNode const> const text = Kernel::CountedCast<TextNode const>(node)) {
                Raster::AffineTransform::Params const transform = text->GetStoryToDomainTransform();
                for (Kernel::Rect const & box : selection->GetTextSelectionBaseBoxes(spread)) {
                    boxes.push_back(transform.MapBounds(box));
                }
                break;
            }
        } else if (node->GetSpreadNode()) {
            boxes.push_back(node->GetSpreadBaseBox(true));
            break;
        }
    }
    return boxes;
}

}

Kernel::ClassProperties const & ExportToPDFCommand::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & ExportToPDFCommand::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

ExportToPDFCommand::ExportToPDFCommand(Renderer::RenderTree::PdfExport * pdf,
                                       std::vector<Kernel::JailCounted<ExportableInterface>> exportables,
                                       Kernel::Counted<Renderer::FileExportOptionsPDF const> options,
                                       VisibilityInterface::VisibilityTestOptions const & visibility,
                                       std::vector<Renderer::RenderTree::Warning> * warnings, bool hasReporter,
                                       bool notTemp, ExportBookCommand * exportCommand,
                                       Kernel::Counted<DocumentController const> previousDocument,
                                       Kernel::Counted<BookChapter const> chapter)
    : ExportItemCommandBase(hasReporter, notTemp, nullptr, false), m_PdfExport(pdf), m_Options(std::move(options)),
      m_Exportables(std::move(exportables)), m_VisibilityOptions(visibility), m_Warnings(warnings),
      m_ExportCommand(exportCommand), m_PreviousDocument(std::move(previousDocument)), m_Chapter(std::move(chapter))
{
}

Kernel::LocalisedString ExportToPDFCommand::GetDescription() const
{
    return Kernel::LocalisedString("Export to PDF", "Book Commands");
}

void ExportToPDFCommand::Do()
{
    Kernel::Counted<DocumentController> const document(GetDocument().Get());
    DomainWriterUnlockSession const unlocked(document);

    std::vector<ExportableInterface::ExportParams> pages;
    {
        DocumentControllerSession const session(document);
        for (Kernel::JailCounted<ExportableInterface> const & exportable : m_Exportables) {
            if (IsAborted()) {
                return;
            }
            exportable->GetMultiPageExportParams(*document, pages, false);
        }
    }
    if (IsAborted()) {
        return;
    }
    Kernel::Counted<Kernel::SequenceProgressReporter> reporter;
    if (GetProgress()) {
        reporter = Kernel::MakeCounted<Kernel::SequenceProgressReporter>(static_cast<unsigned long long>(pages.size()));
        GetProgress()->SetReporter(reporter);
    }
    for (std::size_t index = 0; index < pages.size() && !IsAborted(); ++index) {
        Kernel::Counted<Kernel::Progress> const progress = reporter ? reporter->BeginItemAtIndex(index) : nullptr;
        ExportResult const result = ExportPDFPage(*m_PdfExport, pages, index, 0, m_Options, m_VisibilityOptions,
                                                  progress, m_Warnings);
        if (reporter) {
            reporter->ItemComplete();
        }
        if (result != ExportResultOk) {
            break; // The stream remembers why.
        }
    }
}

void ExportToPDFCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) {}

void ExportToPDFCommand::CollatePageHyperlinks(ExportableInterface::ExportParams const & page,
                                               std::vector<Renderer::PdfHyperlink> & links)
{
    Kernel::Counted<DocumentController const> const own(GetDocument().Get());
    for (std::size_t index = 0; index < page.m_Nodes.size(); ++index) {
        Kernel::JailCounted<SpreadNode> const spread = page.m_Nodes[index]->GetSpreadNode();
        if (!spread) {
            continue;
        }
        // On a merged page one of the nodes comes from the other chapter.
        Kernel::Counted<DocumentController const> const document =
            own->GetDocument()->FindSpread(spread) == -1 && m_PreviousDocument ? m_PreviousDocument : own;
        std::vector<Kernel::Counted<HyperlinkData>> found;
        HyperlinkVisitor::CollateForExport(document, spread, found);
        for (Kernel::Counted<HyperlinkData> const & link : found) {
            if (link->m_IsActive) {
                CollateLink(links, *link, spread, document, page, index);
            }
        }
    }
}

void ExportToPDFCommand::CollateLink(std::vector<Renderer::PdfHyperlink> & links, HyperlinkData const & link,
                                     Kernel::JailCounted<SpreadNode> const & spread,
                                     Kernel::Counted<DocumentController const> const & document,
                                     ExportableInterface::ExportParams const & page, std::size_t node)
{
    Raster::AffineTransform::Params const transform = page.TransformOf(node);
    std::vector<Kernel::Rect> areas;
    for (Kernel::Rect const & box : BoxesOf(link, spread)) {
        // What of the spread is not shown, such as a page that stays out beside one that shares this output page, has no
        // links either.
        Kernel::Rect const shown = node < page.m_Clips.size() ? box.Intersected(page.m_Clips[node]) : box;
        Kernel::Rect const area = transform.MapBounds(shown).Intersected(page.m_Rect);
        if (!area.IsEmpty() && area.Width() > 0 && area.Height() > 0) {
            areas.push_back(area);
        }
    }
    Renderer::PdfHyperlink target;
    if (areas.empty() || !Resolve(target, link, document)) {
        return;
    }
    for (Kernel::Rect const & area : areas) {
        target.m_Rect = area;
        links.push_back(target);
    }
}

bool ExportToPDFCommand::Resolve(Renderer::PdfHyperlink & target, HyperlinkData const & link,
                                 Kernel::Counted<DocumentController const> const & document)
{
    using Type = Story::HyperlinkData::Type;
    auto const toPage = [&](int page) {
        target.m_Kind = Renderer::PdfHyperlink::Page;
        target.m_Page = page;
        return page != -1;
    };
    switch (link.m_Type) {
    case Type::Page:
        return toPage(m_ExportCommand->OutputPageFromPageIndex(document, link.m_PageIndex));
    case Type::Anchor: {
        if (link.m_IsEndnotes) {
            return toPage(m_ExportCommand->PageForEndnotes());
        }
        auto const * const anchor =
            link.m_Anchor ? m_ExportCommand->GetAnchorTarget(link.m_Anchor->GetUid()) : nullptr;
        if (!anchor) {
            return false;
        }
        target.m_Kind = Renderer::PdfHyperlink::Position;
        target.m_Page = anchor->m_Page;
        target.m_Position = anchor->m_Position;
        target.m_PrintersMarks = m_ExportCommand->GetPrintersMarksForTarget(anchor->m_Page);
        return true;
    }
    case Type::Web:
        target.m_Kind = Renderer::PdfHyperlink::Resource;
        target.m_Target = WebAddress(link.GetPath());
        return true;
    case Type::File:
        return ResolveFile(target, link);
    case Type::Mail:
        target.m_Kind = Renderer::PdfHyperlink::Resource;
        target.m_Target = String("mailto:") + link.GetPath();
        return true;
    case Type::Section:
        return toPage(m_ExportCommand->OutputPageFromSectionIndex(document, link.m_SectionIndex));
    case Type::ChapterPage:
        return toPage(m_ExportCommand->OutputPageFromChapterPage(link.m_ChapterIndex, link.m_PageIndex));
    }
    return false;
}

bool ExportToPDFCommand::ResolveFile(Renderer::PdfHyperlink & target, HyperlinkData const & link)
{
    String const path = link.GetPath();
    target.m_Kind = IsPdfPath(path) ? Renderer::PdfHyperlink::OtherPdf : Renderer::PdfHyperlink::Resource;
    if (!link.IncludeFileOnExport()) {
        target.m_Target = path;
        return true;
    }
    return CopyBeside(path, m_PdfExport->GetFilename(), target.m_Target);
}

}
