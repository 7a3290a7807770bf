#include "framework/kernel/FileIOException.h"

#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"

#include <cerrno>

namespace Kernel
{

namespace
{

FileIOException::Reason ToReason(int errorNumber, bool writing)
{
    switch (errorNumber) {
    case EACCES:
        return FileIOException::Reason::PermissionDenied;
    case EPERM:
    case EROFS:
        return FileIOException::Reason::AccessDenied;
    case ENOSPC:
    case EDQUOT:
        return FileIOException::Reason::OutOfSpace;
    case EIO:
    case ENXIO:
    case ENODEV:
        return FileIOException::Reason::DeviceError;
    default:
        return writing ? FileIOException::Reason::WriteFailed : FileIOException::Reason::ReadFailed;
    }
}

}

FileIOException FileIOException::FromErrno(int errorNumber, String const & path, bool writing)
{
    String const text = GetSystemErrorText(errorNumber);
    return FileIOException(ToReason(errorNumber, writing), path,
                           Format(writing ? LocalisedString("Cannot write to %1: %2.", "File")
                                          : LocalisedString("Cannot read %1: %2.", "File"),
                                  path, text),
                           errorNumber, writing);
}

}
