#pragma once

#include "documents/ChapterMarshall.h"
#include "framework/document/ExportableInterface.h"
#include "framework/document/NodeInterfaces.h"
#include "framework/kernel/Counted.h"
#include "output/ExportPageRef.h"

#include <vector>

class DocumentController;
class SpreadNode;

namespace Kernel
{
class SequenceProgressReporter;
}
namespace Renderer
{
class FileExportOptionsPDF;
}
namespace Renderer::RenderTree
{
class PdfExport;
}

namespace Book
{

class BookChapter;
class ExportBookCommand;

/// Walks the plan of an export and has each chapter's pages written into one PDF by commands on that chapter's queue.
///
/// Pages of one chapter gather in a batch that goes out as one command; a merged entry, or a blank with a page after it,
/// sends its batch out at once. At most three chapter documents are open at a time. It lives on the stack of the export
/// command, and its destructor lets all documents go.
class ExportPdfWalk
{
public:
    /// `reporter` may be null. All arguments outlive the walk.
    ExportPdfWalk(ExportBookCommand & command, Kernel::Counted<Kernel::SequenceProgressReporter> reporter);
    ~ExportPdfWalk();
    ExportPdfWalk(ExportPdfWalk const &) = delete;
    ExportPdfWalk & operator=(ExportPdfWalk const &) = delete;

    /// The chapter's document through the marshall, null if it can't be opened. Good until the third further chapter.
    Kernel::Counted<DocumentController const> Document(Kernel::Counted<BookChapter const> const & chapter);

    /// Writes all pages into `pdf`, until the abort flag is set. Chapters that can't be opened are left out.
    void WriteTo(Renderer::RenderTree::PdfExport & pdf);

private:
    void AddEntry(ExportPageEntry const & entry);
    /// Makes the entry's chapter current. False if it can't be opened.
    bool EnterChapter(Kernel::Counted<BookChapter const> const & chapter);
    void AddWholeSpread(Kernel::JailCounted<SpreadNode> const & spread);
    void AddPageOfSpread(Kernel::JailCounted<SpreadNode> const & spread, int page);
    void AddMerged(Kernel::JailCounted<SpreadNode> const & spread, ExportPageEntry const & entry);
    void AddPageThenPad(Kernel::JailCounted<SpreadNode> const & spread, int page);
    void AddPadThenPage(Kernel::JailCounted<SpreadNode> const & spread, int page);
    void Add(Kernel::JailCounted<ExportableInterface> exportable);
    void RunBatch();

    ExportBookCommand & m_Command;
    Kernel::Counted<Kernel::SequenceProgressReporter> m_Reporter;
    Kernel::Counted<Renderer::FileExportOptionsPDF const> m_Options;
    VisibilityInterface::VisibilityTestOptions m_Visibility;
    ChapterMarshall m_Marshall;
    Renderer::RenderTree::PdfExport * m_Pdf = nullptr;
    std::vector<Kernel::JailCounted<ExportableInterface>> m_Batch;
    Kernel::Counted<BookChapter const> m_Current;
    Kernel::Counted<DocumentController const> m_CurrentDocument;
    Kernel::Counted<DocumentController const> m_PreviousDocument;
    bool m_Vertical = false;
    bool m_PreviousVertical = false;
    int m_Stage = 0;
};

}
