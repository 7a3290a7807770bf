#pragma once

#include <filesystem>

namespace App
{

enum class FileKind
{
    Missing,
    Folder,
    /// The system keeps its content, or the folder that it lies in, from the user.
    Shut,
    Book,
    Document,
    Other
};

/// The kind of a file by its first bytes, whatever its name says.
[[nodiscard]] FileKind KindOf(std::filesystem::path const & path);

}
