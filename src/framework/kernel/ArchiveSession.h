#pragma once

#include "framework/kernel/ArchiveThumbnails.h"
#include "framework/kernel/FileStore.h"

namespace Kernel
{

class Archive;

/// The writing of one archive's items. It is made by `Archive::CreateSessionAdv` and ended by `Archive::CloseSession`,
/// which keeps the archive alive between the two. Items come out in the order of the calls, thumbnails last.
class ArchiveSession : public FileStoreOut
{
public:
    [[nodiscard]] String const & GetPath() const override;
    [[nodiscard]] bool IsFullSave() const override { return true; }
    void ReferToPath(String const &) override {}
    void SaveFile(String const & name, FileStoreCompressionHint const & hint, FileStoreItem const & item) override;
    void SaveBytes(String const & name, FileStoreCompressionHint const & hint, Counted<RawData const> data) override;
    /// Null means none.
    void SetThumbnails(Counted<ArchiveThumbnails> thumbnails);

private:
    friend class Archive;
    explicit ArchiveSession(Counted<Archive> archive);

    Counted<Archive> m_Archive;
};

/// Holds a session open. One that goes without `Archive::CloseSession` drops what was written.
class ArchiveSessionHandle
{
public:
    ArchiveSessionHandle() = default;
    ~ArchiveSessionHandle() { Release(); }
    ArchiveSessionHandle(ArchiveSessionHandle const &) = delete;
    ArchiveSessionHandle & operator=(ArchiveSessionHandle const &) = delete;

    [[nodiscard]] ArchiveSession * Get() const { return m_Session.Get(); }
    ArchiveSession * operator->() const { return m_Session.Get(); }
    explicit operator bool() const { return static_cast<bool>(m_Session); }
    void Release();

private:
    friend class Archive;
    Counted<ArchiveSession> m_Session;
};

}
