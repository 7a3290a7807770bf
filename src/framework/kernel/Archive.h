#pragma once

#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/ArchiveSession.h"
#include "framework/kernel/FileLock.h"
#include "framework/kernel/FileStore.h"
#include "framework/kernel/TimeStamp.h"

#include <memory>
#include <optional>

namespace Kernel
{

/// A file that holds named items: a ZIP container whose first entry tells the file type within the first 64 bytes.
/// docs/file-format.md describes it byte by byte.
///
/// An archive was either opened for reading, and then gives its items, or created, and then takes the items of one
/// session, after which it is done with. One thread at a time, except that several may read items at once.
///
/// What is read is distrusted: sizes are counted against limits while reading, every item is read to its end and its
/// checksum compared, names and the directory are checked for consistency when the file is opened.
class Archive : public FileStore
{
public:
    enum class OpenMode
    {
        /// For reading, with a shared lock for as long as the archive or its lock lives.
        Read = 0,
        /// For reading by somebody who means to change the file: exclusive lock.
        ReadExclusive = 1,
        /// For one look, without a lock. What is read is consistent all the same, as a save replaces the file whole.
        ReadUnlocked = 2,
    };
    enum class OpenResult
    {
        Success = 0,
        Missing,
        IsFolder,
        /// File permissions.
        PermissionDenied,
        /// Any other refusal by the system.
        AccessDenied,
        /// Somebody else has it open for writing.
        Locked,
        TooManyOpenFiles,
        /// The disk failed while it was read.
        ReadError,
        /// Not a file of ours at all.
        NotAnArchive,
        /// One of ours, but of another type than asked for.
        OtherType,
        NewerVersion,
        /// It ends early: an interrupted copy, for example.
        Truncated,
        Corrupt,
    };

    /// Why nothing could be created.
    struct CreateResult
    {
        enum Code
        {
            Success = 0,
            Unknown = 1,
            /// The target's folder does not exist; `m_Text` names it.
            FolderMissing = 2,
            /// Somebody else has the target open.
            Locked = 3,
            IsFolder = 4,
            NameTooLong = 5,
            OutOfMemory = 6,
            AccessDenied = 10,
            PermissionDenied = 11,
            ReadOnlyVolume = 12,
            TooManyOpenFiles = 16,
            QuotaExceeded = 17,
            Busy = 18,
            OutOfSpace = 19,
            DeviceError = 20,
        };

        Code m_Code = Success;
        /// A sentence for the user.
        String m_Text;
    };

    enum class SessionType
    {
        /// Writes the whole file anew.
        Whole = 2,
    };
    enum class SessionResult
    {
        Success = 0,
        /// The archive was opened for reading, or has had its session, or somebody has taken its new file away.
        NotWritable = 1,
    };

    /// Opens an archive whose file-type tag is `type`; null on failure, with the reason in the result.
    [[nodiscard]] static Counted<Archive> Open(String const & path, OpenMode mode, IDTag type, OpenResult & result);
    /// The same through a lock that the caller holds on the file.
    [[nodiscard]] static Counted<Archive> OpenLocked(Counted<FileLock> lock, IDTag type, OpenResult & result);
    /// A sentence about a failure to open.
    [[nodiscard]] static String GetResultText(OpenResult result, String const & path);

    /// The file-type tag within the first 64 bytes of a file of ours, or none: tells what a file is by one small read.
    [[nodiscard]] static std::optional<IDTag> IdentifyType(void const * start, std::size_t size);
    [[nodiscard]] static std::optional<IDTag> IdentifyType(String const & path);

    /// A new archive that is written beside its target and takes its place when its session is closed. Null on failure.
    /// If somebody else holds a lock on the target that is a failure.
    [[nodiscard]] static Counted<Archive> CreateWithTemporary(String const & path, IDTag type, CreateResult & result);
    /// The same for one who holds a lock on the target himself, which does not count.
    [[nodiscard]] static Counted<Archive> CreateWithTemporary(String const & path, IDTag type, CreateResult & result,
                                                              FileLock * ownLock);

    ~Archive() override;

    [[nodiscard]] String const & GetPath() const override { return m_Path; }
    [[nodiscard]] IDTag GetType() const { return m_Type; }

    /// Reading. Order of names is that of the file; the first entry, which holds the type, is not among them.
    [[nodiscard]] std::vector<String> GetItemNames() const;
    [[nodiscard]] bool HasItem(String const & name) const override;
    /// Declared size of an item's content in bytes.
    [[nodiscard]] std::optional<std::uint64_t> GetItemSize(String const & name) const;
    [[nodiscard]] Counted<RawData const> ReadItem(String const & name) const override;
    /// Reads the item of that name into `item` by its `Load`; false if there is none or `Load` refuses it. Throws
    /// `ArchiveCorruptionException`, `FutureVersionException` and `ArchiveFileException`.
    bool LoadFile(String const & name, FileStoreItem & item);
    /// Modification time of the file when it was opened.
    [[nodiscard]] TimeStamp GetModifiedTime() const { return m_ModifiedTime; }
    /// The lock under which it was opened or, after `CloseSession`, under which the new file stands; null if there is
    /// none. Whoever keeps it keeps the file locked.
    [[nodiscard]] Counted<FileLock> const & GetLock() const { return m_Lock; }

    /// Writing. `abort` is a flag that ends the session early when it is set, or null. With `verify` everything is read
    /// back and compared before it takes the target's place.
    SessionResult CreateSessionAdv(ArchiveSessionHandle & handle, SessionType type, bool const * abort, bool verify);
    /// Writes the file out, flushes it and puts it in the target's place; with `discard` drops what was written. A file
    /// that would hold the same bytes as the target leaves it alone, time and all. Throws `ArchiveFileException`; the
    /// target is untouched then.
    void CloseSession(ArchiveSessionHandle & handle, bool discard);
    /// After `CloseSession`: the target was left alone.
    [[nodiscard]] bool WasUnchanged() const { return m_Unchanged; }

    /// Items above this size are refused as damaged.
    static constexpr std::uint64_t MaximumItemSize = std::uint64_t(2) << 30;

private:
    friend class ArchiveSession;
    friend struct ArchiveEntrySource;
    struct Reader;
    struct Writer;

    Archive(String path, IDTag type);

    String const m_Path;
    IDTag const m_Type;
    TimeStamp m_ModifiedTime;
    Counted<FileLock> m_Lock;
    std::unique_ptr<Reader> m_Reader;
    std::unique_ptr<Writer> m_Writer;
    bool m_Unchanged = false;
};

}
