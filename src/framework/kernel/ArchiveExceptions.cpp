#include "framework/kernel/ArchiveExceptions.h"

#include "framework/kernel/Archive.h"
#include "framework/kernel/Format.h"

#include <cerrno>

namespace Kernel
{

namespace
{

String UidText(ClassUID uid)
{
    char text[4];
    for (int i = 0; i < 4; ++i) {
        auto const c = static_cast<unsigned char>(uid.Value() >> (24 - 8 * i));
        text[i] = 0x20 <= c && c < 0x7F ? static_cast<char>(c) : '?';
    }
    return String(text, sizeof(text));
}

}

ArchiveCorruptionException::ArchiveCorruptionException(String path, String const & place, String const & fault)
    : Exception(Format(LocalisedString("The file %1 is damaged (%2: %3). Restore it from a backup.", "File"), path,
                       place, fault)),
      m_Path(std::move(path))
{
}

FutureVersionException::FutureVersionException(String path, ClassUID uid, unsigned short found, unsigned short known)
    : Exception(Format(
          LocalisedString("The file %1 was written by a later version of this program (%2 version %3, known up to %4). "
                          "Update the program to open it.",
                          "File"),
          path, UidText(uid), static_cast<int>(found), static_cast<int>(known))),
      m_Path(std::move(path)),
      m_ClassUID(uid),
      m_Found(found)
{
}

ArchiveFileException::ArchiveFileException(Counted<Archive const> archive, Reason reason, WhatFile whatFile,
                                           Counted<Archive const> other, String message)
    : Exception(std::move(message)),
      m_Archive(std::move(archive)),
      m_Other(std::move(other)),
      m_Reason(reason),
      m_WhatFile(whatFile)
{
}

ArchiveFileException::~ArchiveFileException() = default;
ArchiveFileException::ArchiveFileException(ArchiveFileException const &) = default;

ArchiveFileException::Reason ArchiveFileException::ReasonFromErrno(int errorNumber)
{
    switch (errorNumber) {
    case ENOSPC:
        return Reason::OutOfSpace;
    case EDQUOT:
        return Reason::QuotaExceeded;
    case EFBIG:
        return Reason::FileTooLarge;
    case EACCES:
        return Reason::PermissionDenied;
    case EPERM:
    case EROFS:
        return Reason::AccessDenied;
    case EAGAIN:
    case ETXTBSY:
        return Reason::Locked;
    case EIO:
    case ENXIO:
    case ENODEV:
        return Reason::DeviceError;
    default:
        return Reason::Unknown;
    }
}

}
