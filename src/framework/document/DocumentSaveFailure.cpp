#include "framework/document/DocumentSaveFailure.h"

#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/LocalisedString.h"

#include <new>

namespace
{

using Result = DocumentSaveResult::Result;

Result CodeOf(Kernel::Archive::CreateResult const & created)
{
    using Code = Kernel::Archive::CreateResult::Code;
    switch (created.m_Code) {
    case Code::Unknown:
        return Result::CannotCreate;
    case Code::FolderMissing:
        return Result::FolderMissing;
    case Code::Locked:
        return Result::LockedByOther;
    case Code::IsFolder:
        return Result::BadName;
    case Code::NameTooLong:
        return Result::NameTooLong;
    case Code::OutOfMemory:
        return Result::OutOfMemory;
    case Code::AccessDenied:
        return Result::AccessDenied;
    case Code::PermissionDenied:
        return Result::PermissionDenied;
    case Code::ReadOnlyVolume:
        return Result::ReadOnlyDevice;
    case Code::TooManyOpenFiles:
        return Result::TooManyOpenFiles;
    case Code::QuotaExceeded:
        return Result::QuotaUsedUp;
    case Code::Busy:
        return Result::Busy;
    case Code::OutOfSpace:
        return Result::DiskFull;
    case Code::DeviceError:
        return Result::DeviceError;
    case Code::Success:
        break;
    }
    return Result::Unknown;
}

Result CodeOf(Kernel::ArchiveFileException const & exception)
{
    using Reason = Kernel::ArchiveFileException::Reason;
    switch (exception.GetReason()) {
    case Reason::Unknown:
    case Reason::DeviceError:
        return exception.GetWhatFile() == Kernel::ArchiveFileException::WhatFile::Read ? Result::SourceDamaged
                                                                                       : Result::WriteFailed;
    case Reason::OutOfSpace:
        return Result::DiskFull;
    case Reason::QuotaExceeded:
        return Result::QuotaExceeded;
    case Reason::FileTooLarge:
        return Result::TooLarge;
    case Reason::PermissionDenied:
        return Result::PermissionDenied;
    case Reason::AccessDenied:
        return Result::AccessDenied;
    case Reason::Locked:
        return Result::LockedByOther;
    }
    return Result::Unknown;
}

Result CodeOf(Kernel::FileIOException const & exception)
{
    using Reason = Kernel::FileIOException::Reason;
    switch (exception.GetReason()) {
    case Reason::WriteFailed:
    case Reason::DeviceError:
        return Result::WriteFailed;
    case Reason::AccessDenied:
        return Result::AccessDenied;
    case Reason::PermissionDenied:
        return Result::PermissionDenied;
    case Reason::OutOfSpace:
        return Result::DiskFull;
    case Reason::Unknown:
    case Reason::ReadFailed:
        break;
    }
    return Result::Unknown;
}

}

void SetSaveFailure(DocumentSaveResult & result, Kernel::Archive::CreateResult const & created)
{
    result.SetConcernsFile(true);
    result.SetResult(CodeOf(created), created.m_Text);
}

bool StoreArchive(DocumentSaveResult & result, Kernel::Counted<Kernel::Archive> const & archive,
                  std::function<bool()> const & work)
{
    try {
        if (work()) {
            return true;
        }
        result.SetResult(DocumentSaveResult::SessionFailed,
                         Kernel::Format(Kernel::LocalisedString("The file \"%1\" can't be written.", "Save document"),
                                        archive->GetPath()));
    } catch (Kernel::ArchiveFileException const & exception) {
        bool const isOther = exception.GetArchive() != Kernel::Counted<Kernel::Archive const>(archive);
        Kernel::Counted<Kernel::Archive const> const other =
            isOther ? exception.GetArchive() : exception.GetArchiveOther();
        result.SetConcernsFile(true);
        result.SetResult(isOther ? Result::OtherArchive : CodeOf(exception), exception.GetMessage());
        if (other) {
            result.SetOtherArchivePath(other->GetPath());
        }
    } catch (Kernel::FileIOException const & exception) {
        result.SetConcernsFile(true);
        result.SetResult(CodeOf(exception), exception.GetMessage());
    } catch (std::bad_alloc const &) {
        result.SetResult(DocumentSaveResult::OutOfMemory,
                         Kernel::LocalisedString("There is not enough memory to save.", "Save document"));
    } catch (Kernel::Exception const & exception) {
        result.SetResult(DocumentSaveResult::ItemFailed, exception.GetMessage());
    } catch (std::exception const & exception) {
        result.SetResult(DocumentSaveResult::SessionFailed, exception.what());
    }
    return false;
}
