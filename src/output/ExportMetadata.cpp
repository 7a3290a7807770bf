// The last step on a finished file: the key chapter's metadata goes into it.

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/document/XMPTree.h"
#include "framework/kernel/Trace.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/XmpFile.h"
#include "output/ExportBookCommand.h"

namespace Book
{

namespace
{

/// What is known of the finished file: its time, where the options fix it so that the same book gives the same bytes.
ExportableInterface::ExportResult ResultFor(Kernel::Consolidated<Renderer::FileExportOptions> const & options,
                                            String const & path)
{
    ExportableInterface::ExportResult result;
    result.m_Path = path;
    auto const pdf = Kernel::CountedCast<Renderer::FileExportOptionsPDF const>(options.GetCounted());
    if (pdf && pdf->GetSettings().m_FixedTime) {
        constexpr std::int64_t nanoseconds = 1'000'000'000;
        result.m_Time = DocumentController::GetTimeText(Kernel::TimeStamp(*pdf->GetSettings().m_FixedTime * nanoseconds));
    }
    return result;
}

}

ExportResult ExportBookCommand::EmbedMetadata(Kernel::Consolidated<Renderer::FileExportOptions> const & options,
                                              String const & path)
{
    if (IsAborted()) {
        return ExportResultAborted;
    }
    if (!options->GetEmbedMetadata()) {
        return ExportResultOk;
    }
    Kernel::Counted<BookController> const book = GetBookController();
    Kernel::Counted<BookChapter> const key = book->GetKeyChapter(true);
    Kernel::Counted<DocumentController> document = key ? book->LoadChapterDocument(key, true, false) : nullptr;
    if (!document) {
        return ExportResultOk;
    }
    ExportResult result = ExportResultOk;
    try {
        Renderer::XmpFile file;
        if (file.Open(path)) {
            Kernel::Counted<DocumentMetadata const> const metadata = document->GetMetadata();
            ExportableInterface::ExportResult const made = ResultFor(options, path);
            String const packet = metadata->GetCurrentXMPTreeForExport(document, &made, nullptr)->ToXML();
            if (file.CanPut(packet)) {
                file.Put(packet);
            }
            file.Close();
        }
    } catch (std::exception const &) {
        Kernel::Trace("XMP metadata write failure (probably sandbox things)\r\n");
        result = ExportResultMetadataFailed;
    }
    document = nullptr;
    book->ReleaseChapterDocument(key, true);
    return result;
}

}
