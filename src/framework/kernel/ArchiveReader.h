#pragma once

#include "framework/kernel/Archive.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ZipFileSource.h"

#include <cstdint>
#include <map>
#include <memory>

struct zip;

namespace Kernel
{

/// The items of an open container. Only the archive uses this.
struct Archive::Reader
{
public:
    /// Reads and checks the directory. Null on failure, with the reason in `result`.
    [[nodiscard]] static std::unique_ptr<Reader> Open(std::shared_ptr<File> file, IDTag type, OpenResult & result);
    ~Reader();

    struct Item
    {
        std::uint64_t m_Index;
        std::uint64_t m_Size;
        std::uint64_t m_CompressedSize;
        std::uint32_t m_Checksum;
        bool m_Deflated;
    };

    /// In the order of the file, the type entry left out.
    [[nodiscard]] std::vector<String> const & GetNames() const { return m_Names; }
    [[nodiscard]] Item const * Find(String const & name) const;
    /// Throws `ArchiveCorruptionException`, `FileIOException`.
    [[nodiscard]] Counted<RawData const> Read(String const & name, Item const & item) const;

private:
    explicit Reader(std::shared_ptr<File> file) : m_File(std::move(file)), m_Source(m_File) {}
    bool ReadDirectory();
    void ReadRaw(String const & name, Item const & item, std::uint8_t * target) const;
    [[noreturn]] void Fail(String const & name, String const & fault) const;

    std::shared_ptr<File> const m_File;
    mutable ZipFileSource m_Source;
    /// libzip's handle is for one thread at a time.
    mutable CriticalSection m_Lock;
    struct zip * m_Zip = nullptr;
    std::vector<String> m_Names;
    std::map<String, Item> m_Items;
};

}
