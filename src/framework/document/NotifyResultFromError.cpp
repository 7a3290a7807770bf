#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/DomainController.h"

#include <utility>

void DomainController::SetNotifyResultFromError(OpenDocumentFailedNotification & notification,
                                                enum Kernel::Archive::OpenResult & result)
{
    using Opened = Kernel::Archive::OpenResult;
    using Failure = OpenDocumentFailedNotification;
    static constexpr std::pair<Opened, Failure::Result> table[] = {
        {Opened::Missing, Failure::FileNotFound},          {Opened::IsFolder, Failure::NotADocument},
        {Opened::PermissionDenied, Failure::AccessDenied}, {Opened::AccessDenied, Failure::AccessDenied},
        {Opened::Locked, Failure::LockedByOther},          {Opened::TooManyOpenFiles, Failure::OutOfResources},
        {Opened::ReadError, Failure::CannotReadFile},      {Opened::NotAnArchive, Failure::NotADocument},
        {Opened::OtherType, Failure::OtherFileType},       {Opened::NewerVersion, Failure::FutureVersion},
        {Opened::Truncated, Failure::Truncated},           {Opened::Corrupt, Failure::Corrupt}};
    for (auto const & [opened, failure] : table) {
        if (opened == result) {
            notification.SetResult(failure, Kernel::Archive::GetResultText(opened, notification.GetPath()), String());
        }
    }
}
