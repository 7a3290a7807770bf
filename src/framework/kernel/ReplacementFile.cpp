#include "framework/kernel/ReplacementFile.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <dirent.h>
#include <string>
#include <sys/stat.h>
#include <unistd.h>
#include <vector>

namespace Kernel
{

namespace
{

using OpenResult = File::OpenUnmanagedResult;

constexpr std::string_view Suffix = ".kvtmp";

/// Leading dot, so that file managers don't show it: ".name-123-1.kvtmp".
std::string PrefixOf(String const & target)
{
    // Cut, so that the name stays within what a file system allows wherever the target's own does.
    return "." + Path::GetFileName(target).ToStd().substr(0, 180) + "-";
}

/// What stands between prefix and suffix: two numbers. Anything else belongs to another target.
bool IsNumberPair(std::string_view text)
{
    std::size_t const dash = text.find('-');
    return dash != std::string_view::npos && dash != 0 && dash + 1 < text.size() &&
           text.find_first_not_of("0123456789", dash + 1) == std::string_view::npos &&
           text.substr(0, dash).find_first_not_of("0123456789") == std::string_view::npos;
}

/// Removes what programs that were killed have left beside the target. One that is still being written is locked.
void RemoveLeftovers(String const & target)
{
    std::string const prefix = PrefixOf(target);
    String const folder = Path::GetFolderWithSeparator(target);
    // Read directly: the folder may hold thousands of files, of which none is of interest.
    std::unique_ptr<DIR, int (*)(DIR *)> const listing(::opendir(folder.Empty() ? "." : folder.c_str()), &::closedir);
    while (dirent const * const entry = listing ? ::readdir(listing.get()) : nullptr) {
        std::string_view const name(entry->d_name);
        if (name.size() <= prefix.size() + Suffix.size() || !name.starts_with(prefix) || !name.ends_with(Suffix) ||
            !IsNumberPair(name.substr(prefix.size(), name.size() - prefix.size() - Suffix.size()))) {
            continue;
        }
        String const path = folder + String(name);
        FileLock::Result result{};
        if (Counted<FileLock> const lock = FileLock::Acquire(path, FileLock::Kind::Exclusive, result);
            lock && lock->GetKind() == FileLock::Kind::Exclusive &&
            DiskFault::Ask(DiskOperation::Delete, path.c_str()) == 0) {
            ::unlink(path.c_str());
        }
    }
}

/// So that a file stays its owner's when somebody else who may do so saves it.
void TakeOwnerAndPermissions(String const & target, int descriptor)
{
    struct stat facts;
    if (::stat(target.c_str(), &facts) != 0) {
        return;
    }
    if (::fchown(descriptor, facts.st_uid, facts.st_gid) != 0) {
        // Only some may give files away: then the new one is the saver's own.
        static_cast<void>(errno);
    }
    ::fchmod(descriptor, facts.st_mode & 07777);
}

/// Why the target may not be replaced, or Success.
OpenResult CheckTarget(String const & target, File::ShareMode share, FileLock * ownLock)
{
    struct stat facts;
    if (::stat(target.c_str(), &facts) != 0) {
        if (errno == ELOOP) {
            // Nothing is missing that could be made first.
            return OpenResult::Unknown;
        }
        return errno == ENOENT ? OpenResult::Success : File::ResultFromErrno(errno);
    }
    if (S_ISDIR(facts.st_mode)) {
        return OpenResult::IsFolder;
    }
    if (::access(target.c_str(), W_OK) != 0) {
        return File::ResultFromErrno(errno);
    }
    if (share == File::ShareMode::Shared) {
        return OpenResult::Success;
    }
    if (ownLock && ownLock->IsFor(target)) {
        // Others may share it: only the exclusive lock shows that they don't.
        FileLock::Kind const before = ownLock->GetKind();
        if (!ownLock->ChangeKind(FileLock::Kind::Exclusive)) {
            return OpenResult::LockViolation;
        }
        ownLock->ChangeKind(before);
        return OpenResult::Success;
    }
    FileLock::Result result{};
    bool const free = static_cast<bool>(FileLock::Acquire(target, FileLock::Kind::Exclusive, result));
    return free || result != FileLock::Result::Locked ? OpenResult::Success : OpenResult::LockViolation;
}

}

std::unique_ptr<ReplacementFile> ReplacementFile::Create(String const & target, File::ShareMode share,
                                                         FileLock * ownLock, OpenResult & result)
{
    static std::atomic<unsigned> s_Counter{0};

    std::unique_ptr<ReplacementFile> replacement(new ReplacementFile);
    // Through links, so that the file is replaced and not the link.
    replacement->m_Target = FileSystem::Exists(target) ? FileSystem::GetCanonicalPath(target) : target;
    result = CheckTarget(replacement->m_Target, share, ownLock);
    if (result != OpenResult::Success) {
        return nullptr;
    }
    for (;;) {
        replacement->m_Path = Path::GetFolderWithSeparator(replacement->m_Target) + PrefixOf(replacement->m_Target) +
                              std::to_string(::getpid()) + "-" + std::to_string(++s_Counter) + std::string(Suffix);
        if (FileSystem::Exists(replacement->m_Path)) {
            continue;
        }
        replacement->m_File = std::make_shared<File>();
        result = replacement->m_File->OpenEx(replacement->m_Path.c_str(), "w+bx", File::ShareMode::Shared,
                                             File::VisibilityMode::Normal);
        if (result != OpenResult::Success) {
            replacement->m_Path = String();
            return nullptr;
        }
        replacement->m_Lock = FileLock::AcquireOn(replacement->m_File, FileLock::Kind::Exclusive);
        if (replacement->IsInPlace()) {
            break;
        }
        // Somebody who clears away leftovers came between making and locking it: it is his, take another name.
        replacement->m_Lock = nullptr;
    }
    TakeOwnerAndPermissions(replacement->m_Target, replacement->m_File->GetDescriptor());
    RemoveLeftovers(replacement->m_Target);
    return replacement;
}

ReplacementFile::~ReplacementFile()
{
    if (!m_Committed && !m_Path.Empty()) {
        ::unlink(m_Path.c_str());
    }
}

bool ReplacementFile::EqualsTarget() const
{
    File target;
    if (target.OpenEx(m_Target.c_str(), "rb", File::ShareMode::Shared, File::VisibilityMode::Normal) !=
            OpenResult::Success ||
        target.GetSize() != m_File->GetSize()) {
        return false;
    }
    constexpr std::size_t BlockSize = 128 * 1024;
    std::vector<char> mine(BlockSize);
    std::vector<char> others(BlockSize);
    for (std::uint64_t at = 0;; at += BlockSize) {
        std::size_t const got = m_File->ReadAt(at, mine.data(), BlockSize);
        try {
            if (target.ReadAt(at, others.data(), BlockSize) != got ||
                std::memcmp(mine.data(), others.data(), got) != 0) {
                return false;
            }
        } catch (FileIOException const &) {
            // A target that can't be read any more is all the more to be replaced.
            return false;
        }
        if (got < BlockSize) {
            return true;
        }
    }
}

void ReplacementFile::MoveTimeForward()
{
    TimeStamp before;
    TimeStamp now;
    if (!FileSystem::GetModifiedTime(m_Target, before) || !FileSystem::GetModifiedTime(m_Path, now)) {
        return;
    }
    // The system's clock for files ticks in milliseconds, and some file systems keep two seconds: the first step that
    // the file system can show is taken.
    static constexpr std::int64_t Steps[] = {1, 1'000, 1'000'000, 1'000'000'000, 2'000'000'000};
    for (std::int64_t const step : Steps) {
        if (before < now) {
            return;
        }
        if (!FileSystem::SetModifiedTime(m_Path, TimeStamp(before.Nanoseconds() + step)) ||
            !FileSystem::GetModifiedTime(m_Path, now)) {
            return;
        }
    }
}

ReplacementFile::Outcome ReplacementFile::Commit(bool keepIfEqual)
{
    if (keepIfEqual && EqualsTarget()) {
        m_Lock = nullptr;
        return Outcome::Unchanged;
    }
    m_File->Flush();
    MoveTimeForward();
    if (!FileSystem::Rename(m_Path, m_Target, FileSystem::IfExists::Replace)) {
        throw FileIOException::FromErrno(errno, m_Target, true);
    }
    m_Committed = true;
    return Outcome::Replaced;
}

Counted<FileLock> ReplacementFile::TakeLock()
{
    return std::exchange(m_Lock, nullptr);
}

}
