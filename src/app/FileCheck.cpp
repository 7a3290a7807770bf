#include "app/FileCheck.h"

#include "import/Text.h"

#include <algorithm>
#include <fstream>

namespace App
{

namespace fs = std::filesystem;
using Import::Text;

namespace
{

/// Whether a file is, by its name or by its first bytes, what a verb writes.
bool IsOfKind(fs::path const & path, OutputKind kind)
{
    std::string extension = path.extension().string();
    std::transform(extension.begin(), extension.end(), extension.begin(),
                   [](char c) { return 'A' <= c && c <= 'Z' ? static_cast<char>(c + 32) : c; });
    if ((OutputKind::Pdf == kind ? ".pdf" : ".png") == extension) {
        return true;
    }
    std::string_view const wanted = OutputKind::Pdf == kind ? "%PDF-" : "\x89PNG";
    char head[8] = {};
    std::ifstream(path, std::ios::binary).read(head, static_cast<std::streamsize>(wanted.size()));
    return std::string_view(head, wanted.size()) == wanted;
}

}

fs::path FullPath(std::string const & file)
{
    std::error_code error;
    return fs::absolute(file, error).lexically_normal();
}

std::optional<fs::path> FindBook(std::string const & file, Import::MessageList & messages)
{
    fs::path const path = FullPath(file);
    std::error_code error;
    fs::file_status const status = fs::status(path, error);
    if (fs::is_regular_file(status)) {
        return path;
    }
    if (fs::is_directory(status)) {
        messages.Error("file-foreign", {file}, Text("This is a folder; name the book file (.kvbook) in it.", "Program"));
    } else if (fs::exists(status)) {
        messages.Error("file-foreign", {file}, Text("This is a device or a pipe, so it holds no book.", "Program"));
    } else if (fs::file_type::none == status.type()) {
        messages.Error("book-missing", {file}, Text("The file cannot be reached: %1.", "Program", error.message()));
    } else {
        messages.Error("book-missing", {file},
                       Text("There is no such book file; \"korvane new\" makes one.", "Program"));
    }
    return std::nullopt;
}

std::optional<fs::path> LockBook(std::string const & file, BookFileLock & lock, Import::MessageList & messages)
{
    std::optional<fs::path> path = FindBook(file, messages);
    std::string problem;
    if (path && !lock.Take(*path, problem)) {
        messages.Error("book-locked", {file}, problem);
        return std::nullopt;
    }
    return path;
}

std::optional<fs::path> ClaimBook(std::string const & file, bool onlyReads, BookFileLock & lock,
                                  Import::MessageList & messages)
{
    return onlyReads ? FindBook(file, messages) : LockBook(file, lock, messages);
}

bool CheckOutput(fs::path const & target, OutputKind kind, Import::MessageList & messages)
{
    std::error_code error;
    if (fs::is_directory(target, error)) {
        messages.Error("target-folder", {target.string()}, Text("This is a folder; name a file in it.", "Program"));
        return false;
    }
    if (fs::path const folder = target.parent_path(); !fs::is_directory(folder, error)) {
        messages.Error("folder-missing", {target.string()},
                       Text("The folder %1 does not exist; make it first.", "Program", folder.string()));
        return false;
    }
    // Devices and pipes take anything; an empty file has nothing to lose.
    if (fs::is_regular_file(target, error) && 0 < fs::file_size(target, error) && !IsOfKind(target, kind)) {
        messages.Error("target-exists", {target.string()},
                       Text("There is a file of this name that is of another kind, and it is not replaced; choose "
                            "another name, or remove it first.",
                            "Program"));
        return false;
    }
    return true;
}

}
