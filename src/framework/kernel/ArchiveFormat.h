#pragma once

#include "framework/kernel/IDTag.h"

#include <cstddef>
#include <string>
#include <string_view>

/// The first entry of an archive, which docs/file-format.md describes. Only the archive uses this.
namespace Kernel::ArchiveFormat
{

/// Name of the entry. It is stored, and without an extra field, so that its content begins at byte 38.
inline constexpr std::string_view TypeEntry = "mimetype";
inline constexpr std::size_t LocalHeaderSize = 30;
inline constexpr std::size_t TypeOffset = LocalHeaderSize + TypeEntry.size();
/// The content: this, the four characters of the file-type tag, the version mark and one digit.
inline constexpr std::string_view TypePrefix = "application/x-kv.";
inline constexpr std::string_view VersionMark = ";v=";
inline constexpr char Version = '1';
inline constexpr std::size_t TagOffset = TypeOffset + TypePrefix.size();
inline constexpr std::size_t VersionOffset = TagOffset + 4 + VersionMark.size();
/// A look at so many bytes tells the type.
inline constexpr std::size_t LookSize = 64;
static_assert(VersionOffset < LookSize);

[[nodiscard]] inline std::string TypeText(IDTag tag)
{
    std::string text(TypePrefix);
    for (int shift = 24; 0 <= shift; shift -= 8) {
        text += static_cast<char>(tag.Value() >> shift);
    }
    return text.append(VersionMark) + Version;
}

}
