#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/IDTag.h"

namespace Kernel
{

class FileStore;
class FileStoreItem;
class FileStoreOut;
class InStream;
class OutStream;

/// Whether an item may lie in an archive that lies in another archive.
enum class Nestable
{
    No = 0,
    Yes = 1,
};

/// Whether an item is worth keeping in what is saved for recovery after a crash.
enum class Recoverable
{
    No = 0,
    Yes = 1,
};

/// Description of a class of items: its uid and how to make one. A static object, built before first use.
class FileStoreItemType
{
public:
    using Creator = Counted<FileStoreItem> (*)();

    constexpr FileStoreItemType(ClassUID uid, Creator creator, Nestable nestable, Recoverable recoverable)
        : m_ClassUID(uid),
          m_Creator(creator),
          m_Nestable(nestable),
          m_Recoverable(recoverable)
    {
    }

    [[nodiscard]] constexpr ClassUID GetClassUID() const { return m_ClassUID; }
    [[nodiscard]] constexpr Creator GetCreator() const { return m_Creator; }
    [[nodiscard]] constexpr Nestable GetNestable() const { return m_Nestable; }
    [[nodiscard]] constexpr Recoverable GetRecoverable() const { return m_Recoverable; }

    /// The type of a uid, or null if nobody has entered it.
    [[nodiscard]] static FileStoreItemType const * Find(ClassUID uid);

    /// A static object of this class, made from the type, enters it in the registry.
    class Init
    {
    public:
        explicit Init(FileStoreItemType const & type);
    };

private:
    ClassUID m_ClassUID;
    Creator m_Creator;
    Nestable m_Nestable;
    Recoverable m_Recoverable;
};

/// What a store needs to know of the state of its items.
class FileStoreStateObject : public virtual Countable
{
public:
    /// The item may be read from the file by several documents at once.
    [[nodiscard]] virtual bool CanShare() const { return false; }
    /// Called after and before the item is marked as changed against its file.
    virtual void PostMarkAsDirty() {}
    virtual void AboutToMakeDirty() {}
};

/// One named item in an archive.
class FileStoreItem : public FileStoreStateObject
{
public:
    /// Writes the content. Throws what the stream throws.
    virtual void Save(OutStream & stream, FileStoreOut & store) const = 0;
    /// Reads the content; false if it is not of this kind. Throws `ArchiveCorruptionException`,
    /// `FutureVersionException` or what the stream throws; the item is then of no use.
    virtual bool Load(InStream & stream, FileStore & store) = 0;
    [[nodiscard]] virtual FileStoreItemType const & GetObjectFileStoreItemType() const = 0;
};

}
