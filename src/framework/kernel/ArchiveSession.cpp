#include "framework/kernel/ArchiveSession.h"

#include "framework/kernel/Abortable.h"
#include "framework/kernel/ArchiveWriter.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/MemoryStreams.h"

namespace Kernel
{

ArchiveSession::ArchiveSession(Counted<Archive> archive) : m_Archive(std::move(archive)) {}

String const & ArchiveSession::GetPath() const
{
    KORVANE_ASSERT(m_Archive);
    return m_Archive->GetPath();
}

void ArchiveSession::SaveFile(String const & name, FileStoreCompressionHint const & hint, FileStoreItem const & item)
{
    MemoryOutStream stream;
    item.Save(stream, *this);
    SaveBytes(name, hint, stream.RelinquishOwnership());
}

void ArchiveSession::SaveBytes(String const & name, FileStoreCompressionHint const & hint, Counted<RawData const> data)
{
    KORVANE_ASSERT_MESSAGE(m_Archive && data, "the session is closed, or there is nothing to save");
    if (!Abortable::IsFlagSet(const_cast<bool *>(m_Archive->m_Writer->m_Abort))) {
        m_Archive->m_Writer->Add(name, hint.GetDeflateLevel(), std::move(data));
    }
}

void ArchiveSession::SetThumbnails(Counted<ArchiveThumbnails> thumbnails)
{
    KORVANE_ASSERT(m_Archive);
    m_Archive->m_Writer->m_Thumbnails = std::move(thumbnails);
}

void ArchiveSessionHandle::Release()
{
    m_Session = nullptr;
}

}
