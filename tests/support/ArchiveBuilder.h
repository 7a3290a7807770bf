#pragma once

#include "framework/kernel/Archive.h"

#include <string_view>
#include <tuple>
#include <vector>

/// Writes an archive from a few texts.
class ArchiveBuilder
{
public:
    explicit ArchiveBuilder(Kernel::IDTag type) : m_Type(type) {}

    ArchiveBuilder & Deflated(std::string_view name, std::string_view content);
    ArchiveBuilder & Stored(std::string_view name, std::string_view content);
    /// Saves through the real road and gives the archive after its session. Throws what the archive throws; fails the
    /// test if it cannot be created.
    Kernel::Counted<Kernel::Archive> Write(String const & path, Kernel::FileLock * ownLock) const;
    Kernel::Counted<Kernel::Archive> Write(String const & path) const { return Write(path, nullptr); }

private:
    Kernel::IDTag m_Type;
    std::vector<std::tuple<String, Kernel::FileStoreCompressionHintGeneral::CompressionLevel, std::string>> m_Items;
};
