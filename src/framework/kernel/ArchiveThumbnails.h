#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/RawData.h"

#include <utility>
#include <vector>

namespace Kernel
{

/// Preview pictures that go into an archive beside its items, where file managers look for them.
class ArchiveThumbnails : public virtual Countable
{
public:
    enum class FileType
    {
        /// Thumbnails/thumbnail.png
        Png = 0,
    };

    /// One file of each type; a later one takes the earlier one's place.
    void AddFile(FileType type, Counted<RawData const> data);
    /// The bytes of a type, or null.
    [[nodiscard]] Counted<RawData const> GetFile(FileType type) const;

    /// The name of the item that holds the type.
    [[nodiscard]] static char const * GetItemName(FileType type);

private:
    std::vector<std::pair<FileType, Counted<RawData const>>> m_Files;
};

}
