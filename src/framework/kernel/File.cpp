#include "framework/kernel/File.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <string_view>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace Kernel
{

namespace
{

/// Flags of the system for a mode of the C library; -1 for none that is known.
int FlagsOf(std::string_view mode)
{
    bool const both = mode.find('+') != std::string_view::npos;
    bool const isNew = mode.find('x') != std::string_view::npos;
    int const access = both ? O_RDWR : O_WRONLY;
    switch (mode.empty() ? 0 : mode[0]) {
    case 'r':
        return both ? O_RDWR : O_RDONLY;
    case 'w':
        return access | O_CREAT | (isNew ? O_EXCL : O_TRUNC);
    case 'a':
        return access | O_CREAT | O_APPEND;
    default:
        return -1;
    }
}

/// Opening a pipe that has nobody at its other end would wait for somebody for ever: this fails instead, or finds it empty.
int OpenAtOnce(char const * path, int flags)
{
    int const descriptor = ::open(path, flags | O_NONBLOCK | O_CLOEXEC, 0666);
    if (descriptor >= 0) {
        ::fcntl(descriptor, F_SETFL, ::fcntl(descriptor, F_GETFL) & ~O_NONBLOCK);
    }
    return descriptor;
}

bool IsLockedByOthers(int descriptor)
{
    struct flock probe = {};
    probe.l_type = F_WRLCK;
    probe.l_whence = SEEK_SET;
    return ::fcntl(descriptor, F_OFD_GETLK, &probe) == 0 && probe.l_type != F_UNLCK;
}

}

File::File() = default;

File::~File()
{
    Close();
}

bool File::Close()
{
    int const descriptor = std::exchange(m_Descriptor, -1);
    return descriptor < 0 || ::close(descriptor) == 0;
}

File::OpenUnmanagedResult File::OpenEx(char const * path, char const * mode, ShareMode share, VisibilityMode)
{
    Close();
    m_Path = path;
    m_Position = 0;
    int const flags = FlagsOf(mode);
    if (flags < 0) {
        return OpenUnmanagedResult::InvalidMode;
    }
    if (DiskFault::Ask(DiskOperation::Open, path) != 0) {
        return ResultFromErrno(errno);
    }
    OpenUnmanagedResult result = OpenUnmanagedResult::Success;
    // Truncation waits until the locks have been looked at.
    m_Descriptor = OpenAtOnce(path, flags & ~O_TRUNC);
    if (m_Descriptor < 0 && (flags & O_ACCMODE) == O_RDWR && (flags & O_CREAT) == 0 &&
        (errno == EACCES || errno == EROFS || errno == EPERM || errno == ETXTBSY)) {
        m_Descriptor = OpenAtOnce(path, O_RDONLY);
        result = OpenUnmanagedResult::SuccessReadOnly;
    }
    if (m_Descriptor < 0) {
        // Making a file in a folder that is missing is another matter than reading a file that is missing.
        bool const making = (flags & O_CREAT) != 0;
        return making && errno == ENOENT ? OpenUnmanagedResult::FolderMissing : ResultFromErrno(errno);
    }
    struct stat facts;
    if (::fstat(m_Descriptor, &facts) == 0 && S_ISDIR(facts.st_mode)) {
        Close();
        return OpenUnmanagedResult::IsFolder;
    }
    if (share == ShareMode::RespectLocks && (flags & O_ACCMODE) != O_RDONLY && IsLockedByOthers(m_Descriptor)) {
        Close();
        return OpenUnmanagedResult::LockViolation;
    }
    if ((flags & O_TRUNC) != 0 && S_ISREG(facts.st_mode) && ::ftruncate(m_Descriptor, 0) != 0) {
        int const error = errno;
        Close();
        return ResultFromErrno(error);
    }
    return result;
}

std::size_t File::Read(void * buffer, std::size_t size)
{
    std::size_t done = 0;
    while (done < size) {
        ssize_t const got = DiskFault::Ask(DiskOperation::Read, m_Path.c_str()) != 0
                                ? -1
                                : ::read(m_Descriptor, static_cast<char *>(buffer) + done, size - done);
        if (got < 0) {
            if (errno == EINTR) {
                continue;
            }
            throw FileIOException::FromErrno(errno, m_Path, false);
        }
        if (got == 0) {
            break;
        }
        done += static_cast<std::size_t>(got);
    }
    m_Position += done;
    return done;
}

std::size_t File::ReadAt(std::uint64_t offset, void * buffer, std::size_t size) const
{
    std::size_t done = 0;
    while (done < size) {
        ssize_t const got = DiskFault::Ask(DiskOperation::Read, m_Path.c_str()) != 0
                                ? -1
                                : ::pread(m_Descriptor, static_cast<char *>(buffer) + done, size - done,
                                          static_cast<off_t>(offset + done));
        if (got < 0) {
            if (errno == EINTR) {
                continue;
            }
            throw FileIOException::FromErrno(errno, m_Path, false);
        }
        if (got == 0) {
            break;
        }
        done += static_cast<std::size_t>(got);
    }
    return done;
}

void File::Write(void const * data, std::size_t size)
{
    std::size_t done = 0;
    while (done < size) {
        ssize_t const put = DiskFault::Ask(DiskOperation::Write, m_Path.c_str()) != 0
                                ? -1
                                : ::write(m_Descriptor, static_cast<char const *>(data) + done, size - done);
        if (put < 0) {
            if (errno == EINTR) {
                continue;
            }
            throw FileIOException::FromErrno(errno, m_Path, true);
        }
        done += static_cast<std::size_t>(put);
    }
    m_Position += done;
}

void File::WriteAt(std::uint64_t offset, void const * data, std::size_t size)
{
    std::size_t done = 0;
    while (done < size) {
        ssize_t const put = DiskFault::Ask(DiskOperation::Write, m_Path.c_str()) != 0
                                ? -1
                                : ::pwrite(m_Descriptor, static_cast<char const *>(data) + done, size - done,
                                           static_cast<off_t>(offset + done));
        if (put < 0) {
            if (errno == EINTR) {
                continue;
            }
            throw FileIOException::FromErrno(errno, m_Path, true);
        }
        done += static_cast<std::size_t>(put);
    }
}

void File::Flush()
{
    // A pipe has no disk behind it.
    if ((DiskFault::Ask(DiskOperation::Flush, m_Path.c_str()) != 0 || ::fdatasync(m_Descriptor) != 0) &&
        errno != EINVAL) {
        throw FileIOException::FromErrno(errno, m_Path, true);
    }
}

void File::Seek(std::uint64_t offset)
{
    if (::lseek(m_Descriptor, static_cast<off_t>(offset), SEEK_SET) < 0) {
        throw FileIOException::FromErrno(errno, m_Path, false);
    }
    m_Position = offset;
}

std::uint64_t File::GetSize() const
{
    struct stat facts;
    if (::fstat(m_Descriptor, &facts) != 0) {
        throw FileIOException::FromErrno(errno, m_Path, false);
    }
    return static_cast<std::uint64_t>(facts.st_size);
}

File::OpenUnmanagedResult File::ResultFromErrno(int errorNumber)
{
    switch (errorNumber) {
    case ENOENT:
    case ENOTDIR:
    case ELOOP:
        return OpenUnmanagedResult::NotFound;
    case EPERM:
        return OpenUnmanagedResult::AccessDenied;
    case EACCES:
        return OpenUnmanagedResult::PermissionDenied;
    case EAGAIN:
        return OpenUnmanagedResult::LockViolation;
    case ETXTBSY:
    case EBUSY:
        return OpenUnmanagedResult::Busy;
    case EROFS:
        return OpenUnmanagedResult::ReadOnlyVolume;
    case EISDIR:
        return OpenUnmanagedResult::IsFolder;
    case EMFILE:
    case ENFILE:
        return OpenUnmanagedResult::TooManyOpenFiles;
    case ENOMEM:
        return OpenUnmanagedResult::OutOfMemory;
    case EIO:
    case ENXIO:
    case ENODEV:
        return OpenUnmanagedResult::DeviceError;
    case ENOSPC:
        return OpenUnmanagedResult::DiskFull;
    case EDQUOT:
        return OpenUnmanagedResult::QuotaExceeded;
    case ENAMETOOLONG:
        return OpenUnmanagedResult::NameTooLong;
    default:
        return OpenUnmanagedResult::Unknown;
    }
}

String File::GetResultText(OpenUnmanagedResult result, String const & path)
{
    LocalisedString const texts[] = {
        LocalisedString("%1 is open.", "File"),
        LocalisedString("%1 can be read and not written.", "File"),
        LocalisedString("%1 does not exist.", "File"),
        LocalisedString("%1 was to be opened in an unknown way.", "File"),
        LocalisedString("The folder of %1 does not exist. Make it first.", "File"),
        LocalisedString("Access to %1 was denied by the system.", "File"),
        LocalisedString("You have no permission for %1. Change its permissions, or choose another place.", "File"),
        LocalisedString("%1 is in use by another program. Close it there.", "File"),
        LocalisedString("%1 is locked by another program. Close it there.", "File"),
        LocalisedString("%1 is in use by the system. Try again later.", "File"),
        LocalisedString("%1 lies on a disk that cannot be written to. Choose another place.", "File"),
        LocalisedString("%1 is a folder, not a file.", "File"),
        LocalisedString("%1 cannot be opened because too many files are open.", "File"),
        LocalisedString("%1 cannot be opened because memory is short.", "File"),
        LocalisedString("%1 cannot be opened because the device reports an error.", "File"),
        LocalisedString("The disk of %1 is full. Make room on it, or choose another place.", "File"),
        LocalisedString("Your quota on the disk of %1 is used up.", "File"),
        LocalisedString("The name of %1 is too long for its file system.", "File"),
        LocalisedString("%1 cannot be opened.", "File"),
    };
    return Format(texts[static_cast<int>(result)], path);
}

}
