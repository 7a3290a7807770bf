#pragma once

#include <filesystem>

namespace App
{

enum class FileKind
{
    Missing,
    Folder,
    Book,
    Document,
    Other
};

/// The kind of a file by its first bytes, whatever its name says.
[[nodiscard]] FileKind KindOf(std::filesystem::path const & path);

}
