#include "framework/kernel/FileLock.h"

#include "framework/kernel/File.h"

#include <cerrno>
#include <fcntl.h>

namespace Kernel
{

namespace
{

/// 0, or the `errno` value.
int SetLock(int descriptor, short type)
{
    struct flock lock = {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    return ::fcntl(descriptor, F_OFD_SETLK, &lock) == 0 ? 0 : errno;
}

bool IsConflict(int error)
{
    return error == EAGAIN || error == EACCES;
}

/// Locks; changes `kind` to shared where the file is open for reading only. A file system without locks grants all.
bool LockFile(File const & file, FileLock::Kind & kind)
{
    bool const readOnly = (::fcntl(file.GetDescriptor(), F_GETFL) & O_ACCMODE) == O_RDONLY;
    if (readOnly) {
        kind = FileLock::Kind::Shared;
    }
    return !IsConflict(SetLock(file.GetDescriptor(), kind == FileLock::Kind::Shared ? F_RDLCK : F_WRLCK));
}

}

FileLock::FileLock(std::shared_ptr<File> file, Kind kind) : m_File(std::move(file)), m_Kind(kind) {}

Counted<FileLock> FileLock::Acquire(String const & path, Kind kind, Result & result)
{
    for (;;) {
        auto file = std::make_shared<File>();
        // Opened for writing as well, so that a shared lock can be made exclusive later on.
        auto const opened = file->OpenEx(path.c_str(), "r+b", File::ShareMode::Shared, File::VisibilityMode::Normal);
        if (opened != File::OpenUnmanagedResult::Success && opened != File::OpenUnmanagedResult::SuccessReadOnly) {
            if (opened == File::OpenUnmanagedResult::IsFolder) {
                errno = EISDIR;
            }
            result = Result::CannotOpen;
            return nullptr;
        }
        Kind granted = kind;
        if (!LockFile(*file, granted)) {
            result = Result::Locked;
            return nullptr;
        }
        Counted<FileLock> lock(new FileLock(std::move(file), granted));
        FileSystem::Identity now;
        if (!FileSystem::GetIdentity(path, now) || lock->IsFor(path)) {
            // A file that was taken away altogether stays open for us as it was.
            result = Result::Success;
            return lock;
        }
    }
}

Counted<FileLock> FileLock::AcquireOn(std::shared_ptr<File> file, Kind kind)
{
    if (!LockFile(*file, kind)) {
        return nullptr;
    }
    return Counted<FileLock>(new FileLock(std::move(file), kind));
}

bool FileLock::ChangeKind(Kind kind)
{
    if (kind == m_Kind) {
        return true;
    }
    Kind granted = kind;
    if (!LockFile(*m_File, granted) || granted != kind) {
        return false;
    }
    m_Kind = kind;
    return true;
}

bool FileLock::IsFor(String const & path) const
{
    FileSystem::Identity mine;
    FileSystem::Identity named;
    return FileSystem::GetIdentity(m_File->GetDescriptor(), mine) && FileSystem::GetIdentity(path, named) &&
           mine == named;
}

}
