#include "app/StatusNames.h"

#include "framework/document/DocumentController.h"
#include "import/Text.h"

#include <filesystem>

namespace App
{

using Import::Text;

char const * NameOf(Book::BookChapter::Status status)
{
    switch (status) {
    case Book::BookChapter::Status::Ok:
        return "ok";
    case Book::BookChapter::Status::OpenForEdit:
        return "open-for-edit";
    case Book::BookChapter::Status::Locked:
        return "locked";
    case Book::BookChapter::Status::NotFound:
        return "not-found";
    case Book::BookChapter::Status::OutOfDate:
        return "out-of-date";
    case Book::BookChapter::Status::Restricted:
        break;
    }
    return "restricted";
}

TableCell Describe(Book::BookChapter const & chapter)
{
    std::error_code error;
    switch (chapter.GetStatus()) {
    case Book::BookChapter::Status::Ok:
        return {Text("ok", "Chapter state"), CellLook::Good};
    case Book::BookChapter::Status::OpenForEdit:
        return {Text("open", "Chapter state"), CellLook::Good};
    case Book::BookChapter::Status::Locked:
        return {Text("locked", "Chapter state"), CellLook::Warning};
    case Book::BookChapter::Status::NotFound:
        return {std::filesystem::exists(chapter.GetPath().ToStd(), error) ? Text("unusable", "Chapter state")
                                                                          : Text("missing", "Chapter state"),
                CellLook::Bad};
    case Book::BookChapter::Status::OutOfDate:
        return {Text("changed", "Chapter state"), CellLook::Warning};
    case Book::BookChapter::Status::Restricted:
        break;
    }
    return {Text("restricted", "Chapter state"), CellLook::Warning};
}

std::string Explain(Book::BookChapter const & chapter)
{
    Book::BookChapter::Status const status = chapter.GetStatus();
    if (Book::BookChapter::Status::NotFound != status && Book::BookChapter::Status::Locked != status) {
        return {};
    }
    std::error_code error;
    if (!std::filesystem::exists(chapter.GetPath().ToStd(), error)) {
        return Text("The chapter's file is not there; \"korvane locate\" takes it from where it is now, \"korvane "
                    "replace\" puts another one in its place.",
                    "Program");
    }
    auto const document = Kernel::MakeCounted<DocumentController>();
    OpenDocumentFailedNotification failure(chapter.GetPath(), false);
    if (!document->LoadDocument(chapter.GetPath(), false, false, LoadWhole, nullptr, failure, false)) {
        return failure.GetReason().ToStd();
    }
    document->ShutDownArchive();
    return Text("It could not be opened a moment ago, and can be now; try again.", "Program");
}

}
