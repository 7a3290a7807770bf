#include "app/PreviewFile.h"

#include "framework/document/SpreadPreview.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveThumbnails.h"
#include "framework/kernel/FileOutStream.h"
#include "import/Text.h"

namespace App
{

using Import::Text;

namespace
{

void WritePng(Kernel::RawData const & png, std::filesystem::path const & target, Import::MessageList & messages)
{
    auto made = Kernel::File::OpenUnmanagedResult::Success;
    String problem;
    auto const out =
        Kernel::FileOutStream::Create(target.c_str(), Kernel::File::ShareMode::Shared, made, &problem);
    if (!out) {
        messages.Error("preview-unwritten", {target.string()}, problem.ToStd());
        return;
    }
    out->Write(png.GetData(), png.GetSize());
    if (!out->Close()) {
        messages.Error("preview-unwritten", {target.string()},
                       out->GetError() ? out->GetError()->GetMessage().ToStd() : std::string());
    }
}

}

void WriteBookPreview(std::string const & file, std::filesystem::path const & book, std::filesystem::path const & target,
                      Import::MessageList & messages)
{
    auto const item = Kernel::ArchiveThumbnails::GetItemName(Kernel::ArchiveThumbnails::FileType::Png);
    auto opened = Kernel::Archive::OpenResult::Success;
    auto const archive =
        Kernel::Archive::Open(String(book.string()), Kernel::Archive::OpenMode::ReadUnlocked, "KvBk", opened);
    if (!archive) {
        messages.Error("book-unreadable", {file},
                       Kernel::Archive::GetResultText(opened, String(book.string())).ToStd());
        return;
    }
    if (!archive->HasItem(item)) {
        messages.Error("preview-missing", {file},
                       Text("The book carries no preview picture; korvane build gives it one.", "Program"));
        return;
    }
    try {
        WritePng(*archive->ReadItem(item), target, messages);
    } catch (Kernel::Exception const & exception) {
        messages.Error("book-unreadable", {file}, exception.GetMessage().ToStd());
    }
}

void WriteDocumentPreview(std::string const & file, Kernel::Counted<DocumentController const> const & document,
                          std::filesystem::path const & target, Import::MessageList & messages)
{
    Kernel::Counted<Raster::DynamicBitmap const> const bitmap = SpreadPreview::Render(document, 0);
    Kernel::Counted<Kernel::RawData> const png = bitmap ? SpreadPreview::EncodeFirst(*bitmap, document) : nullptr;
    if (!png) {
        messages.Error("preview-missing", {file},
                       Text("The document has no first page that a picture could show.", "Program"));
        return;
    }
    WritePng(*png, target, messages);
}

}
