#include "import/SaveFailure.h"

#include "framework/document/DocumentSaveResult.h"
#include "import/Text.h"

namespace Import
{

namespace
{

std::string ReasonOf(int result)
{
    switch (result) {
    case DocumentSaveResult::AccessDenied:
    case DocumentSaveResult::PermissionDenied:
        return Text("access is denied", "Save failure");
    case DocumentSaveResult::LockedByOther:
        return Text("another program has it open", "Save failure");
    case DocumentSaveResult::FolderMissing:
        return Text("its folder does not exist", "Save failure");
    case DocumentSaveResult::CannotCreate:
        return Text("it cannot be created", "Save failure");
    case DocumentSaveResult::DiskFull:
        return Text("the disk is full", "Save failure");
    case DocumentSaveResult::QuotaExceeded:
    case DocumentSaveResult::QuotaUsedUp:
        return Text("your share of the disk is used up", "Save failure");
    case DocumentSaveResult::TooLarge:
        return Text("it is too large for the disk", "Save failure");
    case DocumentSaveResult::ReadOnlyDevice:
        return Text("the disk is read-only", "Save failure");
    case DocumentSaveResult::NameTooLong:
        return Text("its name is too long", "Save failure");
    case DocumentSaveResult::BadName:
        return Text("its name is that of a folder", "Save failure");
    case DocumentSaveResult::TooManyOpenFiles:
        return Text("too many files are open", "Save failure");
    case DocumentSaveResult::OutOfMemory:
        return Text("there is not enough memory", "Save failure");
    case DocumentSaveResult::Busy:
        return Text("the disk is busy", "Save failure");
    case DocumentSaveResult::WriteFailed:
    case DocumentSaveResult::DeviceError:
        return Text("writing failed", "Save failure");
    default:
        return Text("the reason is not known", "Save failure");
    }
}

}

std::string DescribeSaveFailure(DocumentSaveResult const & result, std::string const & file)
{
    std::string reason = result.GetText().ToStd();
    if (reason.ends_with('.')) {
        reason.pop_back();
    }
    if (reason.empty()) {
        reason = ReasonOf(result.GetResult());
        if (DocumentSaveResult::Unknown == result.GetResult()) {
            reason += " " + Text("(code %1)", "Save failure", static_cast<int>(result.GetResult()));
        }
    }
    return Text("The file %1 could not be written: %2.", "Save failure", file, reason);
}

}
