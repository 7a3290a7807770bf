#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/StringT.h"

#include <memory>

namespace Kernel
{

class File;

/// A lock that this process holds on a file for as long as the object lives: shared by many or exclusive to one. It is
/// the lock of an open file description, so two objects exclude each other within one process as well, and the system
/// lifts it when the process ends in any way. It binds those who ask for locks; it does not stop plain reading.
class FileLock : public virtual Countable
{
public:
    enum class Kind
    {
        Shared,
        Exclusive,
    };
    enum class Result
    {
        Success,
        /// Somebody else holds a lock that stands against it.
        Locked,
        /// The file cannot be opened; `errno` tells why.
        CannotOpen,
    };

    /// Opens and locks the file at once or not at all; never waits. If the path has meanwhile come to name another file
    /// (somebody replaced it between opening and locking) it starts again with that one. A file that may only be read
    /// gets a shared lock in place of an exclusive one: nobody with the same rights can change it.
    [[nodiscard]] static Counted<FileLock> Acquire(String const & path, Kind kind, Result & result);
    /// Locks an open file. Null if somebody else's lock stands against it.
    [[nodiscard]] static Counted<FileLock> AcquireOn(std::shared_ptr<File> file, Kind kind);

    [[nodiscard]] Kind GetKind() const { return m_Kind; }
    /// Changes the lock in place; false, and unchanged, if others' locks forbid it or the file is open for reading
    /// only.
    bool ChangeKind(Kind kind);
    /// The path names the file that is locked, not one that has since taken its place.
    [[nodiscard]] bool IsFor(String const & path) const;
    /// The locked file, for reading it through the same description.
    [[nodiscard]] std::shared_ptr<File> const & GetFile() const { return m_File; }

private:
    FileLock(std::shared_ptr<File> file, Kind kind);

    std::shared_ptr<File> const m_File;
    Kind m_Kind;
};

}
