#pragma once

#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/ThreadSafety.h"

/// The side of an open document that is a file. Safe on any thread.
class DocumentControllerArchive
{
public:
    /// The path of the file, byte for byte as it was given; empty for a document that has never been saved.
    [[nodiscard]] String GetPath() const;

    /// Ends what the document still fetches from its file, after a load that failed: nothing of the file is kept open.
    virtual void StopOfflining() const = 0;

protected:
    DocumentControllerArchive() = default;
    virtual ~DocumentControllerArchive() = default;
    DocumentControllerArchive(DocumentControllerArchive const &) = delete;
    DocumentControllerArchive & operator=(DocumentControllerArchive const &) = delete;

    /// For a document in the registry of `VantraController`, that one has to be told as well.
    void SetPath(String const & path);

private:
    Kernel::CriticalSection m_PathLock;
    String m_Path KORVANE_GUARDED_BY(m_PathLock);
};
