#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Exception.h"
#include "framework/kernel/IDTag.h"

namespace Kernel
{

class Archive;

/// A file of the right kind whose content contradicts itself: it was damaged.
class ArchiveCorruptionException : public Exception
{
public:
    /// `path` is the file, `place` where in it ("doc.dat, byte 1234").
    ArchiveCorruptionException(String path, String const & place, String const & fault);
    [[nodiscard]] String const & GetPath() const { return m_Path; }

private:
    String m_Path;
};

/// A file that a later version of the program wrote: some class in it has a version above ours.
class FutureVersionException : public Exception
{
public:
    FutureVersionException(String path, ClassUID uid, unsigned short found, unsigned short known);
    [[nodiscard]] String const & GetPath() const { return m_Path; }
    [[nodiscard]] ClassUID GetClassUID() const { return m_ClassUID; }
    [[nodiscard]] unsigned short GetFoundVersion() const { return m_Found; }

private:
    String m_Path;
    ClassUID m_ClassUID;
    unsigned short m_Found;
};

/// Reading or writing the file of an archive failed.
class ArchiveFileException : public Exception
{
public:
    enum class Reason
    {
        Unknown = 0,
        OutOfSpace = 1,
        QuotaExceeded = 2,
        FileTooLarge = 3,
        PermissionDenied = 4,
        AccessDenied = 5,
        Locked = 6,
        DeviceError = 7,
    };
    /// What was being done with the file.
    enum class WhatFile
    {
        Written = 0,
        Read = 1,
    };

    /// `archive` is the one whose file failed; `other` another one that takes part, null if there is none.
    ArchiveFileException(Counted<Archive const> archive, Reason reason, WhatFile whatFile, Counted<Archive const> other,
                         String message);
    ~ArchiveFileException() override;
    ArchiveFileException(ArchiveFileException const &);

    [[nodiscard]] Counted<Archive const> const & GetArchive() const { return m_Archive; }
    [[nodiscard]] Counted<Archive const> const & GetArchiveOther() const { return m_Other; }
    [[nodiscard]] Reason GetReason() const { return m_Reason; }
    [[nodiscard]] WhatFile GetWhatFile() const { return m_WhatFile; }

    [[nodiscard]] static Reason ReasonFromErrno(int errorNumber);

private:
    Counted<Archive const> m_Archive;
    Counted<Archive const> m_Other;
    Reason m_Reason;
    WhatFile m_WhatFile;
};

}
