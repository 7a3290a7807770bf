#pragma once

#include "framework/kernel/File.h"
#include "framework/kernel/FileLock.h"

#include <memory>

namespace Kernel
{

/// A new content for a file, written beside it and put in its place in one step. While it is being written the target
/// is as it was; a program that is killed leaves at most a file of a recognisable name beside the target, which the
/// next one that writes there removes.
///
/// The new file is locked exclusively from its creation on, before it has the target's name. It gets the target's
/// owner, as far as the system allows it, and permissions. A target that is a link stays one: the file it points at is replaced.
class ReplacementFile
{
public:
    /// What `Commit` did.
    enum class Outcome
    {
        Replaced,
        /// The target held the same bytes already; it and its time were left alone.
        Unchanged,
    };

    /// Null if the file cannot be made, with the reason in `result`. With `File::ShareMode::RespectLocks` that is also
    /// so if somebody else than `ownLock`, which may be null, holds a lock on the target.
    [[nodiscard]] static std::unique_ptr<ReplacementFile>
    Create(String const & target, File::ShareMode share, FileLock * ownLock, File::OpenUnmanagedResult & result);
    /// Removes the file unless it was committed.
    ~ReplacementFile();
    ReplacementFile(ReplacementFile const &) = delete;
    ReplacementFile & operator=(ReplacementFile const &) = delete;

    /// For writing, and for reading back.
    [[nodiscard]] File & GetFile() { return *m_File; }
    [[nodiscard]] String const & GetTarget() const { return m_Target; }
    /// Nobody has taken the file away or put another in its place.
    [[nodiscard]] bool IsInPlace() const { return m_Lock && m_Lock->IsFor(m_Path); }

    /// Compares with the target if `keepIfEqual`; flushes, gives the file a modification time above the target's,
    /// renames and flushes the folder. Throws `FileIOException`; the target is untouched then. A failure to flush the
    /// folder after the rename is not one: the new content is in its place.
    Outcome Commit(bool keepIfEqual);
    /// The lock on what is now at the target, exclusive; null after `Unchanged`.
    [[nodiscard]] Counted<FileLock> TakeLock();

private:
    ReplacementFile() = default;

    [[nodiscard]] bool EqualsTarget() const;
    void MoveTimeForward();

    String m_Target;
    String m_Path;
    std::shared_ptr<File> m_File;
    Counted<FileLock> m_Lock;
    bool m_Committed = false;
};

}
