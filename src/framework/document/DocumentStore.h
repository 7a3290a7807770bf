#pragma once

#include "framework/kernel/Archive.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"

/// The file of an open document, for what is read from it later: glyphs and pictures. Shared by all who read; closing
/// it leaves them with nothing more to read. Safe on any thread.
class DocumentStore : public virtual Kernel::Countable
{
public:
    [[nodiscard]] Kernel::Counted<Kernel::Archive> GetArchive() const;
    /// Null closes the file and gives its lock back.
    void SetArchive(Kernel::Counted<Kernel::Archive> archive);
    /// Null if there is no file, no such item, or if it can't be read.
    [[nodiscard]] Kernel::Counted<Kernel::RawData const> ReadItem(String const & name) const;

private:
    mutable Kernel::CriticalSection m_Lock;
    Kernel::Counted<Kernel::Archive> m_Archive KORVANE_GUARDED_BY(m_Lock);
};
