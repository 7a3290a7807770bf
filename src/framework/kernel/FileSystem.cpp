#include "framework/kernel/FileSystem.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/Path.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <sys/sendfile.h>
#include <sys/stat.h>
#include <system_error>
#include <unistd.h>

namespace fs = std::filesystem;

namespace Kernel
{

namespace
{

fs::path ToPath(String const & path)
{
    return fs::path(path.ToStd());
}

String FromPath(fs::path const & path)
{
    return String(path.native());
}

/// Closes the descriptor and keeps `errno`, which tells what went wrong before.
void CloseQuietly(int descriptor)
{
    int const error = errno;
    ::close(descriptor);
    errno = error;
}

bool CopyContent(int source, int target, char const * targetPath, off_t size)
{
    off_t offset = 0;
    while (offset < size) {
        if (DiskFault::Ask(DiskOperation::Write, targetPath) != 0) {
            return false;
        }
        ssize_t const copied = ::sendfile(target, source, &offset, static_cast<std::size_t>(size - offset));
        if (copied < 0 && errno != EINTR) {
            return false;
        }
        if (copied == 0) {
            break;
        }
    }
    return DiskFault::Ask(DiskOperation::Flush, targetPath) == 0 && ::fsync(target) == 0;
}

}

bool FileSystem::Exists(String const & path)
{
    struct stat facts;
    return ::stat(path.c_str(), &facts) == 0;
}

bool FileSystem::IsFolder(String const & path)
{
    struct stat facts;
    return ::stat(path.c_str(), &facts) == 0 && S_ISDIR(facts.st_mode);
}

bool FileSystem::GetModifiedTime(String const & path, TimeStamp & time)
{
    struct stat facts;
    if (::stat(path.c_str(), &facts) != 0) {
        return false;
    }
    time = TimeStamp(static_cast<std::int64_t>(facts.st_mtim.tv_sec) * 1'000'000'000 + facts.st_mtim.tv_nsec);
    return true;
}

bool FileSystem::SetModifiedTime(String const & path, TimeStamp time)
{
    timespec times[2];
    times[0].tv_sec = 0;
    times[0].tv_nsec = UTIME_OMIT;
    std::int64_t nanoseconds = time.Nanoseconds() % 1'000'000'000;
    std::int64_t seconds = time.Nanoseconds() / 1'000'000'000;
    if (nanoseconds < 0) {
        nanoseconds += 1'000'000'000;
        --seconds;
    }
    times[1].tv_sec = seconds;
    times[1].tv_nsec = nanoseconds;
    return ::utimensat(AT_FDCWD, path.c_str(), times, 0) == 0;
}

bool FileSystem::GetSize(String const & path, std::uint64_t & size)
{
    struct stat facts;
    if (::stat(path.c_str(), &facts) != 0) {
        return false;
    }
    size = static_cast<std::uint64_t>(facts.st_size);
    return true;
}

bool FileSystem::GetIdentity(String const & path, Identity & identity)
{
    struct stat facts;
    if (::stat(path.c_str(), &facts) != 0) {
        return false;
    }
    identity = {static_cast<std::uint64_t>(facts.st_dev), static_cast<std::uint64_t>(facts.st_ino)};
    return true;
}

bool FileSystem::GetIdentity(int fileDescriptor, Identity & identity)
{
    struct stat facts;
    if (::fstat(fileDescriptor, &facts) != 0) {
        return false;
    }
    identity = {static_cast<std::uint64_t>(facts.st_dev), static_cast<std::uint64_t>(facts.st_ino)};
    return true;
}

bool FileSystem::Delete(String const & path, unsigned int flags)
{
    if (DiskFault::Ask(DiskOperation::Delete, path.c_str()) != 0) {
        return false;
    }
    // The system looks at the folder's permission alone; the file's own mark counts here as well.
    bool const marked = ::access(path.c_str(), W_OK) != 0 && (errno == EACCES || errno == EROFS);
    if (marked && (flags & DeleteReadOnly) == 0) {
        return false;
    }
    return ::remove(path.c_str()) == 0;
}

bool FileSystem::DeleteFolder(String const & path)
{
    if (DiskFault::Ask(DiskOperation::Delete, path.c_str()) != 0) {
        return false;
    }
    std::error_code error;
    fs::remove_all(ToPath(path), error);
    errno = error.value();
    return !error;
}

bool FileSystem::CopyFile(String const & from, String const & to)
{
    return CopyFile(from, to, IfExists::Fail);
}

bool FileSystem::CopyFile(String const & from, String const & to, IfExists ifExists)
{
    if (DiskFault::Ask(DiskOperation::Open, from.c_str()) != 0) {
        return false;
    }
    int const source = ::open(from.c_str(), O_RDONLY | O_CLOEXEC);
    if (source < 0) {
        return false;
    }
    struct stat facts;
    if (::fstat(source, &facts) != 0) {
        CloseQuietly(source);
        return false;
    }
    if (!S_ISREG(facts.st_mode)) {
        ::close(source);
        errno = S_ISDIR(facts.st_mode) ? EISDIR : EINVAL;
        return false;
    }
    // A copy that replaces is made beside its target, so that the target is never seen in part.
    bool const aside = ifExists == IfExists::Replace;
    String const written = aside ? to + ".copy" : to;
    int target = -1;
    if (DiskFault::Ask(DiskOperation::Open, written.c_str()) == 0) {
        target =
            ::open(written.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC | (aside ? O_TRUNC : O_EXCL), facts.st_mode & 07777);
    }
    if (target < 0) {
        CloseQuietly(source);
        return false;
    }
    bool done = CopyContent(source, target, written.c_str(), facts.st_size);
    CloseQuietly(source);
    CloseQuietly(target);
    done = done && (!aside || Rename(written, to, IfExists::Replace));
    if (!done) {
        int const error = errno;
        ::unlink(written.c_str());
        errno = error;
    }
    return done;
}

bool FileSystem::Rename(String const & from, String const & to, IfExists ifExists)
{
    if (DiskFault::Ask(DiskOperation::Rename, to.c_str()) != 0) {
        return false;
    }
    unsigned int const flags = ifExists == IfExists::Fail ? RENAME_NOREPLACE : 0;
    if (::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), flags) != 0) {
        return false;
    }
    FlushFolder(Path::GetFolder(to));
    return true;
}

bool FileSystem::CreateFolders(String const & path)
{
    if (DiskFault::Ask(DiskOperation::CreateFolder, path.c_str()) != 0) {
        return false;
    }
    std::error_code error;
    fs::create_directories(ToPath(path), error);
    if (!error && !IsFolder(path)) {
        error = std::make_error_code(std::errc::not_a_directory);
    }
    errno = error.value();
    return !error;
}

bool FileSystem::ListFolder(String const & path, std::vector<String> & names)
{
    std::error_code error;
    fs::directory_iterator at(path.Empty() ? fs::path(".") : ToPath(path), error);
    std::vector<String> found;
    while (!error && at != fs::directory_iterator()) {
        found.push_back(FromPath(at->path().filename()));
        at.increment(error);
    }
    if (error) {
        errno = error.value();
        return false;
    }
    std::sort(found.begin(), found.end());
    names = std::move(found);
    return true;
}

bool FileSystem::FlushFolder(String const & path)
{
    if (DiskFault::Ask(DiskOperation::Flush, path.c_str()) != 0) {
        return false;
    }
    int const folder = ::open(path.Empty() ? "." : path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (folder < 0) {
        return false;
    }
    bool const done = ::fsync(folder) == 0;
    CloseQuietly(folder);
    return done;
}

String FileSystem::GetCanonicalPath(String const & path)
{
    std::error_code error;
    fs::path const absolute = fs::absolute(path.Empty() ? fs::path(".") : ToPath(path), error);
    if (error) {
        return path;
    }
    fs::path const canonical = fs::weakly_canonical(absolute, error);
    return error ? GetAbsolutePath(path) : FromPath(canonical.has_filename() ? canonical : canonical.parent_path());
}

String FileSystem::GetAbsolutePath(String const & path)
{
    std::error_code error;
    fs::path const absolute = fs::absolute(path.Empty() ? fs::path(".") : ToPath(path), error).lexically_normal();
    if (error) {
        return path;
    }
    return FromPath(absolute.has_filename() || !absolute.has_relative_path() ? absolute : absolute.parent_path());
}

String FileSystem::GetRelativePath(String const & path, String const & folder)
{
    return FromPath(ToPath(GetAbsolutePath(path)).lexically_relative(ToPath(GetAbsolutePath(folder))));
}

String FileSystem::GetTemporaryFolder()
{
    std::error_code error;
    fs::path const folder = fs::temp_directory_path(error);
    return error ? String("/tmp") : FromPath(folder);
}

String GetSystemErrorText(int errorNumber)
{
    return String(std::generic_category().message(errorNumber));
}

}
