#include "framework/document/DocumentStore.h"

#include "framework/kernel/Trace.h"

Kernel::Counted<Kernel::Archive> DocumentStore::GetArchive() const
{
    Kernel::ScopedLock const lock(m_Lock);
    return m_Archive;
}

void DocumentStore::SetArchive(Kernel::Counted<Kernel::Archive> archive)
{
    Kernel::ScopedLock const lock(m_Lock);
    m_Archive.Swap(archive);
}

Kernel::Counted<Kernel::RawData const> DocumentStore::ReadItem(String const & name) const
{
    Kernel::Counted<Kernel::Archive> const archive = GetArchive();
    if (!archive || !archive->HasItem(name)) {
        return nullptr;
    }
    try {
        return archive->ReadItem(name);
    } catch (Kernel::Exception const & exception) {
        // Whoever asked goes on without: by composing again, or with a marked box.
        Kernel::Trace(exception.GetMessage() + "\n");
        return nullptr;
    }
}
