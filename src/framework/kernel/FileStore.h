#pragma once

#include "framework/kernel/FileStoreCompressionHint.h"
#include "framework/kernel/FileStoreItem.h"
#include "framework/kernel/InStream.h"
#include "framework/kernel/StringT.h"

#include <vector>

namespace Kernel
{

/// The read side of a store of named items, handed to whatever loads itself from one. It lets an item reach its
/// neighbours, at once or, kept as a `Counted`, later.
class FileStore : public virtual Countable
{
public:
    /// The path of the store's file; empty for a store in memory.
    [[nodiscard]] virtual String const & GetPath() const = 0;
    [[nodiscard]] virtual bool HasItem(String const & name) const = 0;
    /// The content of an item, read to its end and checked; null if there is no such item. Throws
    /// `ArchiveCorruptionException` or `ArchiveFileException`.
    [[nodiscard]] virtual Counted<RawData const> ReadItem(String const & name) const = 0;
};

/// A store without items, for what is loaded from memory alone.
class EmptyFileStore : public FileStore
{
public:
    [[nodiscard]] String const & GetPath() const override { return m_Path; }
    [[nodiscard]] bool HasItem(String const &) const override { return false; }
    [[nodiscard]] Counted<RawData const> ReadItem(String const &) const override { return nullptr; }

private:
    String m_Path;
};

/// The write side.
class FileStoreOut : public virtual Countable
{
public:
    /// The path under which the file will be known; empty for memory.
    [[nodiscard]] virtual String const & GetPath() const = 0;
    /// False for a run that only collects the paths that objects refer to, and writes nothing.
    [[nodiscard]] virtual bool IsFullSave() const = 0;
    /// Called by objects for each other file that they refer to.
    virtual void ReferToPath(String const & path) = 0;
    /// Writes a neighbouring item. Each name once. Throws `ArchiveFileException`.
    virtual void SaveFile(String const & name, FileStoreCompressionHint const & hint, FileStoreItem const & item) = 0;
    virtual void SaveBytes(String const & name, FileStoreCompressionHint const & hint, Counted<RawData const> data) = 0;
};

/// Takes no items, keeps the paths that it was told: for writing to memory, and for collecting paths.
class CollectingFileStoreOut : public FileStoreOut
{
public:
    explicit CollectingFileStoreOut(bool fullSave) : m_FullSave(fullSave) {}

    [[nodiscard]] String const & GetPath() const override { return m_Path; }
    [[nodiscard]] bool IsFullSave() const override { return m_FullSave; }
    void ReferToPath(String const & path) override { m_Paths.push_back(path); }
    void SaveFile(String const &, FileStoreCompressionHint const &, FileStoreItem const &) override {}
    void SaveBytes(String const &, FileStoreCompressionHint const &, Counted<RawData const>) override {}

    /// In the order told, repeats included.
    [[nodiscard]] std::vector<String> const & GetPaths() const { return m_Paths; }

private:
    String m_Path;
    bool const m_FullSave;
    std::vector<String> m_Paths;
};

}
