#pragma once

#include "framework/kernel/Archive.h"
#include "framework/kernel/ReplacementFile.h"

#include <deque>
#include <memory>

namespace Kernel
{

/// Gathers the items of a session and writes the container. Only the archive uses this.
struct Archive::Writer
{
public:
    explicit Writer(std::unique_ptr<ReplacementFile> file) : m_File(std::move(file)) {}

    /// Compresses at once, so that only the smaller form is kept.
    void Add(String const & name, int deflateLevel, Counted<RawData const> data);
    /// Writes the container into the file beside the target. Throws `FileIOException`.
    void Write(IDTag type);
    /// Reads everything back. Throws `ArchiveCorruptionException`.
    void Verify(IDTag type) const;

    std::unique_ptr<ReplacementFile> m_File;
    Counted<ArchiveThumbnails> m_Thumbnails;
    bool const * m_Abort = nullptr;
    bool m_Verify = false;
    bool m_HadSession = false;

private:
    /// What lies in the file for one entry.
    struct Entry
    {
        String m_Name;
        Counted<RawData const> m_Bytes;
        std::uint64_t m_Size;
        std::uint32_t m_Checksum;
        bool m_Deflated;
        std::size_t m_Read = 0;
    };
    friend struct ArchiveEntrySource;

    /// libzip reads the entries when the container is closed; they must not move until then.
    std::deque<Entry> m_Entries;
};

}
