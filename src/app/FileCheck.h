#pragma once

#include "app/BookFileLock.h"
#include "import/Message.h"

#include <filesystem>
#include <optional>
#include <string>

namespace App
{

/// The path from the root of a file that the user named from where they are.
[[nodiscard]] std::filesystem::path FullPath(std::string const & file);

/// The full path of a book that the user named; nothing, with an error, if there is no file that could be one. Whether it
/// is a book only opening it tells.
[[nodiscard]] std::optional<std::filesystem::path> FindBook(std::string const & file, Import::MessageList & messages);

/// The same for a verb that changes the book or its documents: takes the lock, too.
[[nodiscard]] std::optional<std::filesystem::path> LockBook(std::string const & file, BookFileLock & lock,
                                                            Import::MessageList & messages);

/// The same for a verb that may be told to leave the book as it is: reading needs no lock, which a folder that can't be
/// written would refuse.
[[nodiscard]] std::optional<std::filesystem::path> ClaimBook(std::string const & file, bool onlyReads, BookFileLock & lock,
                                                             Import::MessageList & messages);

/// What a verb writes.
enum class OutputKind
{
    Pdf,
    Png
};

/// Whether an output may be written to `target`. If not, an error names the remedy: its folder is missing, `target` is a
/// folder, or there is a file whose name and content are of another kind, such as a chapter or a book, which would be lost.
[[nodiscard]] bool CheckOutput(std::filesystem::path const & target, OutputKind kind, Import::MessageList & messages);

}
