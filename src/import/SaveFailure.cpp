#include "import/SaveFailure.h"

#include "framework/document/DocumentSaveResult.h"

namespace Import
{

namespace
{

char const * ReasonOf(int result)
{
    switch (result) {
    case DocumentSaveResult::AccessDenied:
        return "access is denied";
    case DocumentSaveResult::CannotReplace:
        return "the old file cannot be replaced";
    case DocumentSaveResult::LockedByOther:
        return "another program has it open";
    case DocumentSaveResult::FolderMissing:
        return "its folder does not exist";
    case DocumentSaveResult::CannotCreate:
        return "it cannot be created";
    case DocumentSaveResult::DiskFull:
        return "the disk is full";
    case DocumentSaveResult::QuotaExceeded:
        return "your share of the disk is used up";
    case DocumentSaveResult::ReadOnlyDevice:
        return "the disk is read-only";
    case DocumentSaveResult::NoDevice:
        return "the disk is gone";
    case DocumentSaveResult::NameTooLong:
        return "its name is too long";
    case DocumentSaveResult::Interrupted:
        return "the work was interrupted";
    case DocumentSaveResult::WriteFailed:
    case DocumentSaveResult::CannotFlush:
        return "writing failed";
    default:
        return "the reason is not known";
    }
}

}

std::string DescribeSaveFailure(DocumentSaveResult const & result, std::string const & file)
{
    std::string text = "The file " + file + " could not be written: ";
    if (!result.GetText().Empty()) {
        text += result.GetText().ToStd();
        return text.ends_with('.') ? text : text + ".";
    }
    text += ReasonOf(result.GetResult());
    if (DocumentSaveResult::Unknown == result.GetResult() || DocumentSaveResult::OtherReason == result.GetResult()) {
        text += " (code " + std::to_string(result.GetResult()) + ")";
    }
    return text + ".";
}

}
