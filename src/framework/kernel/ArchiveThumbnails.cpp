#include "framework/kernel/ArchiveThumbnails.h"

#include <algorithm>

namespace Kernel
{

void ArchiveThumbnails::AddFile(FileType type, Counted<RawData const> data)
{
    std::erase_if(m_Files, [type](auto const & file) { return file.first == type; });
    m_Files.emplace_back(type, std::move(data));
}

Counted<RawData const> ArchiveThumbnails::GetFile(FileType type) const
{
    for (auto const & [fileType, data] : m_Files) {
        if (fileType == type) {
            return data;
        }
    }
    return nullptr;
}

char const * ArchiveThumbnails::GetItemName(FileType)
{
    return "Thumbnails/thumbnail.png";
}

}
