#include "output/ExportPdfWalk.h"

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/ExportConfig.h"
#include "framework/document/Exportables.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/SequenceProgressReporter.h"
#include "framework/render/FileExportOptions.h"
#include "output/ExportBookCommand.h"
#include "output/ExportToPDFCommand.h"

namespace Book
{

namespace
{

using Transform = Raster::AffineTransform::Params;

/// The translation by a page's width, or by its height where facing pages stack.
Transform Beside(Kernel::Rect const & page, bool vertical)
{
    return vertical ? Transform::Translation(0, page.Height()) : Transform::Translation(page.Width(), 0);
}

}

ExportPdfWalk::ExportPdfWalk(ExportBookCommand & command, Kernel::Counted<Kernel::SequenceProgressReporter> reporter)
    : m_Command(command), m_Reporter(std::move(reporter)),
      m_Options(Kernel::CountedCast<Renderer::FileExportOptionsPDF const>(command.m_Options.GetCounted())),
      m_Visibility{true, true, true, false, false, false}, m_Marshall(command.GetBookController())
{
}

ExportPdfWalk::~ExportPdfWalk() = default;

Kernel::Counted<DocumentController const> ExportPdfWalk::Document(Kernel::Counted<BookChapter const> const & chapter)
{
    return m_Marshall.GetChapter(chapter, true);
}

void ExportPdfWalk::WriteTo(Renderer::RenderTree::PdfExport & pdf)
{
    m_Pdf = &pdf;
    for (ExportPageEntry const & entry : m_Command.m_ExportMap) {
        if (m_Command.IsAborted()) {
            break;
        }
        AddEntry(entry);
    }
    if (!m_Command.IsAborted()) {
        RunBatch();
    }
}

bool ExportPdfWalk::EnterChapter(Kernel::Counted<BookChapter const> const & chapter)
{
    if (chapter == m_Current) {
        return true;
    }
    // Loaded before the old chapter's pages go out, so that a merged page finds both.
    Kernel::Counted<DocumentController const> const document = Document(chapter);
    if (!document) {
        return false;
    }
    if (m_Options->GetBookmarks()) {
        m_Command.CollatePDFBookmarksForChapter(chapter, document);
    }
    RunBatch();
    m_PreviousDocument = m_CurrentDocument;
    m_Current = chapter;
    m_CurrentDocument = document;
    m_PreviousVertical = m_Vertical;
    m_Vertical = document->GetDocument()->IsVerticalStack();
    return true;
}

void ExportPdfWalk::AddEntry(ExportPageEntry const & entry)
{
    ExportPageRef const * const real = FirstReal(entry);
    if (!real || !EnterChapter(m_Command.m_Chapters[static_cast<std::size_t>(real->m_Chapter)])) {
        return;
    }
    Kernel::JailCounted<SpreadNode> const spread = m_CurrentDocument->GetDocument()->GetSpreadAtIndex(real->m_Spread);
    if (!spread) {
        return; // The document has fewer spreads than its record: somebody changed it since the plan was made.
    }
    switch (FormOf(entry, spread->GetPageCount())) {
    case ExportPageForm::WholeSpread:
        AddWholeSpread(spread);
        break;
    case ExportPageForm::PageOfSpread:
        AddPageOfSpread(spread, real->m_Page);
        break;
    case ExportPageForm::Merged:
        AddMerged(spread, entry);
        break;
    case ExportPageForm::PageThenPad:
        AddPageThenPad(spread, real->m_Page);
        break;
    case ExportPageForm::PadThenPage:
        AddPadThenPage(spread, real->m_Page);
        RunBatch();
        break;
    case ExportPageForm::Nothing:
        break;
    }
}

void ExportPdfWalk::Add(Kernel::JailCounted<ExportableInterface> exportable)
{
    exportable->SetIsIncludeBackground(true);
    exportable->SetIsForBook();
    m_Batch.push_back(std::move(exportable));
}

void ExportPdfWalk::AddWholeSpread(Kernel::JailCounted<SpreadNode> const & spread)
{
    auto const nodes = Kernel::MakeCounted<ExportableNodes>();
    nodes->SetFromNode(spread);
    nodes->SetExportConfig(ExportConfig::CreateDefault(m_Command.m_Options, m_Command.m_Filename, nullptr));
    Add(nodes);
}

void ExportPdfWalk::AddPageOfSpread(Kernel::JailCounted<SpreadNode> const & spread, int page)
{
    auto const pages = Kernel::MakeCounted<ExportablePages>();
    pages->AddPage(spread, page, Transform());
    Add(pages);
}

void ExportPdfWalk::AddMerged(Kernel::JailCounted<SpreadNode> const & spread, ExportPageEntry const & entry)
{
    auto const pages = Kernel::MakeCounted<ExportablePages>();
    pages->AddPage(spread, entry.front().m_Page, Transform());

    ExportPageRef const & last = entry.back();
    Kernel::Counted<BookChapter const> const & chapter = m_Command.m_Chapters[static_cast<std::size_t>(last.m_Chapter)];
    Kernel::Counted<DocumentController const> const document = Document(chapter);
    Kernel::JailCounted<SpreadNode> const second =
        document ? document->GetDocument()->GetSpreadAtIndex(last.m_Spread) : nullptr;
    if (second) {
        Kernel::Rect const extents = second->GetPageExtents(last.m_Page, false);
        // The flag of the chapter before the current one decides here; imposed files rely on it. A page of a spread of
        // two keeps its place on the spread.
        pages->AddPage(second, last.m_Page,
                       second->GetPageCount() == 1 ? Beside(extents, m_PreviousVertical)
                                                   : Transform::Translation(extents.left, extents.top));
    }
    Add(pages);
    if (document) {
        // The second page's links are looked up in its own document.
        m_PreviousDocument = document;
    }
    RunBatch();
    if (document) {
        if (m_Options->GetBookmarks() && chapter != m_Current) {
            m_Command.CollatePDFBookmarksForChapter(chapter, document);
        }
        m_PreviousDocument = m_CurrentDocument;
        m_Current = chapter;
        m_CurrentDocument = document;
        m_PreviousVertical = m_Vertical;
    }
}

void ExportPdfWalk::AddPageThenPad(Kernel::JailCounted<SpreadNode> const & spread, int page)
{
    if (spread->GetPageCount() < 2) {
        Kernel::Rect const extents = spread->GetSpreadExtents(true, false, false);
        auto const spreads = Kernel::MakeCounted<ExportableSpreads>();
        spreads->AddSpread(spread, Transform());
        spreads->AddPaddingRect(extents, spread->GetSpreadExtents(true, true, false), Beside(extents, m_Vertical));
        Add(spreads);
        return;
    }
    Kernel::Rect const extents = spread->GetPageExtents(page, false);
    auto const pages = Kernel::MakeCounted<ExportablePages>();
    pages->AddPage(spread, page, Transform());
    pages->AddPaddingRect(extents, spread->GetPageExtents(page, true), Beside(extents, m_Vertical));
    Add(pages);
}

void ExportPdfWalk::AddPadThenPage(Kernel::JailCounted<SpreadNode> const & spread, int page)
{
    if (spread->GetPageCount() < 2) {
        Kernel::Rect const extents = spread->GetSpreadExtents(true, false, false);
        auto const spreads = Kernel::MakeCounted<ExportableSpreads>();
        spreads->AddPaddingRect(extents, spread->GetSpreadExtents(true, true, false), Transform());
        spreads->AddSpread(spread, Beside(extents, m_Vertical));
        Add(spreads);
        return;
    }
    Kernel::Rect const extents = spread->GetPageExtents(page, false);
    auto const pages = Kernel::MakeCounted<ExportablePages>();
    pages->AddPaddingRect(extents, spread->GetPageExtents(page, true), Transform());
    pages->AddPage(spread, page, Beside(extents, m_Vertical));
    Add(pages);
}

void ExportPdfWalk::RunBatch()
{
    if (m_Batch.empty()) {
        return;
    }
    auto const command = Kernel::MakeCounted<ExportToPDFCommand>(
        m_Pdf, m_Batch, m_Options, m_Visibility, &m_Command.m_Warnings, m_Reporter != nullptr, !m_Command.m_IsTemp,
        &m_Command, m_PreviousDocument, m_Current);
    command->SetAbortPointer(m_Command.GetAbortPointer());
    if (m_Reporter) {
        command->SetCustomProgress(m_Reporter->BeginItemAtIndex(static_cast<unsigned long long>(m_Stage)));
        ++m_Stage;
    }
    VantraController::GetInstance().EnqueueCommandAndWait(command, m_CurrentDocument, false);
    if (command->GetPreviewBitmap()) {
        m_Command.m_PreviewBitmap = command->GetPreviewBitmap();
        m_Command.m_PreviewProfile = command->GetPreviewProfile();
    }
    if (m_Reporter) {
        m_Reporter->ItemComplete();
    }
    m_Batch.clear();
}

}
