#include "framework/document/DocumentControllerArchive.h"

String DocumentControllerArchive::GetPath() const
{
    Kernel::ScopedLock const lock(m_PathLock);
    return m_Path;
}

void DocumentControllerArchive::SetPath(String const & path)
{
    Kernel::ScopedLock const lock(m_PathLock);
    m_Path = path;
}
