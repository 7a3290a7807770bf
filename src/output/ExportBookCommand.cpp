#include "output/ExportBookCommand.h"

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/document/BookEndnoteVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/commands/ExportItemCommandBase.h"
#include "framework/document/Selection.h"
#include "framework/document/SpreadNode.h"
#include "framework/kernel/DomainCommandProgress.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/FileInStream.h"
#include "framework/kernel/FileOutStream.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/SequenceProgressReporter.h"
#include "framework/kernel/TempFile.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/PdfBookmark.h"
#include "framework/render/PdfExport.h"
#include "framework/render/PrintersMarks.h"
#include "framework/render/Schema.h"
#include "output/BookLockSession.h"
#include "output/ExportBookCompleteNotification.h"
#include "output/ExportErrorHandler.h"
#include "output/ExportPdfWalk.h"

namespace Book
{

namespace
{

/// What it means for the user that the target could not be opened.
ExportResult ResultOf(Kernel::File::OpenUnmanagedResult result)
{
    using Opened = Kernel::File::OpenUnmanagedResult;
    switch (result) {
    case Opened::FolderMissing:
    case Opened::IsFolder:
    case Opened::NameTooLong:
        return ExportResultFileNotCreated;
    case Opened::AccessDenied:
        return ExportResultAccessDenied;
    case Opened::PermissionDenied:
    case Opened::ReadOnlyVolume:
        return ExportResultPermissionDenied;
    case Opened::DiskFull:
    case Opened::QuotaExceeded:
        return ExportResultOutOfSpace;
    default:
        return ExportResultFailed;
    }
}

/// Removes a temporary file in the end, whatever became of it.
class TemporaryFileSession
{
public:
    explicit TemporaryFileSession(String path) : m_Path(std::move(path)) {}
    ~TemporaryFileSession() { Kernel::FileSystem::Delete(m_Path, 0); }
    TemporaryFileSession(TemporaryFileSession const &) = delete;
    TemporaryFileSession & operator=(TemporaryFileSession const &) = delete;

private:
    String m_Path;
};

}

KORVANE_DEFINE_BOOK_COMMAND(ExportBookCommand, "ExBC");

ExportBookCommand::ExportBookCommand() = default;

ExportBookCommand::ExportBookCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, String filename,
                                     Kernel::Consolidated<Renderer::FileExportOptions> options, Kernel::Size, bool isTemp,
                                     bool, bool, bool singlePages, Kernel::Counted<Kernel::Progress> progress)
    : m_Chapters(std::move(chapters)), m_Options(std::move(options)), m_Filename(std::move(filename)),
      m_IsTemp(isTemp), m_Progress(std::move(progress)), m_SinglePages(singlePages)
{
}

ExportBookCommand::~ExportBookCommand() = default;

Kernel::LocalisedString ExportBookCommand::GetDescription() const
{
    return Kernel::LocalisedString("Export Book", "Book Commands");
}

DomainCommand::ProgressType ExportBookCommand::GetProgressType()
{
    return m_IsTemp ? NoProgress : ShowProgress;
}

bool * ExportBookCommand::GetProgressAbortPointer() const
{
    return GetAbortPointer();
}

void ExportBookCommand::SetStrayHandling(bool pad, bool merge)
{
    m_PadStrays = pad;
    m_MergeStrays = merge;
}

void ExportBookCommand::Do()
{
    Kernel::Counted<BookController> const book = GetBookController();
    BookLockSession const lock(book);
    SetStrayHandling(book->IsPadStrays(), book->IsMergeStrays());
    BuildExportMap();
    BuildPageMaps();
    book->UpdateAnchorsForForegroundChapters();
    if (IsAborted()) {
        return;
    }
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        if (IsAborted()) {
            return;
        }
        CollateAnchors(chapter);
    }
    std::vector<float> weights;
    GetPagesPerStage(weights);

    Kernel::Counted<Kernel::Progress> const progress =
        m_IsTemp ? m_Progress
                 : Kernel::MakeCounted<DomainCommandProgress>(GetDescription().ToString(), book, this);
    auto const reporter = Kernel::MakeCounted<Kernel::SequenceProgressReporter>(weights);
    if (progress) {
        progress->SetReporter(reporter);
    }
    m_Results.push_back(ExportPDF(reporter));
    m_OutputPaths.push_back(m_Filename);
    book->SetIsDirty(true);
}

void ExportBookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    auto const complete = Kernel::MakeCounted<ExportBookCompleteNotification>(GetBookController(), m_Filename, m_IsTemp,
                                                                              m_PreviewBitmap, m_PreviewProfile);
    for (std::size_t index = 0; index < m_OutputPaths.size(); ++index) {
        if (m_IsTemp && !IsSuccess(m_Results[index])) {
            continue;
        }
        complete->AddResult(false, m_OutputPaths[index], m_Options.GetCounted(), m_Results[index], nullptr, nullptr);
    }
    if (!complete->GetRecs().empty()) {
        notifications.push_back(complete);
    }
}

void ExportBookCommand::FindEndnotesPage(ExportPdfWalk & walk)
{
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        if (!chapter->HasEndnotesMarker()) {
            continue;
        }
        Kernel::Counted<DocumentController const> const document = walk.Document(chapter);
        Kernel::Counted<Selection const> const marked =
            document ? BookEndnoteVisitor::FindCollatedBookEndnotes(document) : nullptr;
        if (!marked) {
            continue;
        }
        Kernel::Counted<Selection const> const selection = marked->ClonePromotingRestrictedItems();
        if (selection->begin() == selection->end()) {
            continue;
        }
        Kernel::JailCounted<Node> const & node = *selection->begin();
        if (Kernel::JailCounted<SpreadNode> const spread = node->GetSpreadNode()) {
            Kernel::Rect box = node->GetSpreadBaseBox(true);
            m_EndnotesPage = OutputPageFromSpreadRect(document, spread, box);
            return;
        }
    }
}

ExportResult ExportBookCommand::ExportPDF(Kernel::Counted<Kernel::SequenceProgressReporter> reporter)
{
    auto const options = Kernel::CountedCast<Renderer::FileExportOptionsPDF const>(m_Options.GetCounted());
    Kernel::Counted<BookChapter> const key = GetBookController()->GetKeyChapter(true);
    if (!key) {
        m_Error = Kernel::LocalisedString("None of the book's chapters can be opened.", "Output");
    }
    if (!options || !key) {
        return ExportResultFailed;
    }
    ExportPdfWalk walk(*this, std::move(reporter));
    if (options->GetHyperlinks()) {
        FindEndnotesPage(walk);
    }

    // The colour of the whole file is the key chapter's; the pages of others are converted to it.
    Kernel::Counted<Kernel::UnitValueConverter const> const converter = key->GetUnitConverter();
    auto const schema = Kernel::MakeCounted<Renderer::RenderTree::PdfSchema>(options, GetAbortPointer());
    schema->SetColourFormatAndProfiles(key->GetColourFormat(), key->GetProfiles());
    if (converter) {
        schema->SetDocumentDpi(converter->GetDpi());
    }
    Renderer::RenderTree::PdfExport pdf(schema, converter);

    String temporaryPath;
    Kernel::Counted<Kernel::FileOutStream> stream = Kernel::TempFile::GenerateTempOutFile(temporaryPath, "", false);
    if (!stream) {
        m_Error = Kernel::Format(Kernel::LocalisedString("No temporary file can be made in the folder %1.", "File"),
                                 Kernel::FileSystem::GetTemporaryFolder());
        return ExportResultFailed;
    }
    TemporaryFileSession const temporary(temporaryPath);
    ExportErrorHandler handler(GetAbortPointer());
    stream->SetErrorHandler(&handler);

    Kernel::Counted<DocumentMetadata const> const known = key->GetMetadata();
    Kernel::Counted<DocumentMetadata const> const metadata = known ? known : Kernel::MakeCounted<DocumentMetadata const>();
    if (!pdf.Create(m_Filename.c_str(), stream, metadata->GetSubject(), metadata->GetTitle(), metadata->GetAuthor(),
                    metadata->GetTags())) {
        m_Error = pdf.GetError();
        return ExportResultFileNotCreated;
    }
    walk.WriteTo(pdf);
    if (!m_Bookmarks.empty()) {
        pdf.AddBookmarks(m_Bookmarks);
    }
    bool const written = pdf.Close();
    bool const closed = stream->Close();
    stream->SetErrorHandler(nullptr);
    if (stream->GetError()) {
        m_Error = stream->GetError()->what();
    }
    if (IsAborted()) {
        return ExportResultAborted;
    }
    if (!written || !closed) {
        m_Error = pdf.GetError();
        return ExportResultFailed;
    }
    stream.Reset();
    ExportResult const embedded = EmbedMetadata(m_Options, temporaryPath);
    return IsSuccess(embedded) ? DeliverToTarget(temporaryPath) : embedded;
}

ExportResult ExportBookCommand::DeliverToTarget(String const & temporaryPath)
{
    Kernel::Counted<Kernel::FileInStream> const finished = Kernel::FileInStream::Open(temporaryPath.c_str(), false);
    if (!finished) {
        return ExportResultFailed;
    }
    try {
        Kernel::File::OpenUnmanagedResult openResult{};
        Kernel::Counted<Kernel::FileOutStream> const target = Kernel::FileOutStream::Create(
            m_Filename.c_str(), Kernel::File::ShareMode::RespectLocks, openResult, &m_Error);
        if (!target) {
            return ResultOf(openResult);
        }
        target->CopyFromStream(*finished, nullptr);
        if (!target->Close()) {
            return ExportResultWriteFailed;
        }
    } catch (Kernel::File::OpenUnmanagedException const & exception) {
        m_Error = exception.what();
        return ResultOf(exception.GetResult());
    } catch (Kernel::FileIOException const & exception) {
        m_Error = exception.what();
        return ExportItemCommandBase::ReasonToError(exception.GetReason());
    } catch (std::exception const & exception) {
        m_Error = exception.what();
        return ExportResultFailed;
    }
    return ExportResultOk;
}

}
