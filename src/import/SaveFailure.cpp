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
    case DocumentSaveResult::PermissionDenied:
        return "access is denied";
    case DocumentSaveResult::LockedByOther:
        return "another program has it open";
    case DocumentSaveResult::FolderMissing:
        return "its folder does not exist";
    case DocumentSaveResult::CannotCreate:
        return "it cannot be created";
    case DocumentSaveResult::DiskFull:
        return "the disk is full";
    case DocumentSaveResult::QuotaExceeded:
    case DocumentSaveResult::QuotaUsedUp:
        return "your share of the disk is used up";
    case DocumentSaveResult::TooLarge:
        return "it is too large for the disk";
    case DocumentSaveResult::ReadOnlyDevice:
        return "the disk is read-only";
    case DocumentSaveResult::NameTooLong:
        return "its name is too long";
    case DocumentSaveResult::BadName:
        return "its name is that of a folder";
    case DocumentSaveResult::TooManyOpenFiles:
        return "too many files are open";
    case DocumentSaveResult::OutOfMemory:
        return "there is not enough memory";
    case DocumentSaveResult::Busy:
        return "the disk is busy";
    case DocumentSaveResult::WriteFailed:
    case DocumentSaveResult::DeviceError:
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
    if (DocumentSaveResult::Unknown == result.GetResult()) {
        text += " (code " + std::to_string(result.GetResult()) + ")";
    }
    return text + ".";
}

}
