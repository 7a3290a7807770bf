#include "app/FileKind.h"

#include <fstream>
#include <string_view>

namespace App
{

namespace fs = std::filesystem;

FileKind KindOf(fs::path const & path)
{
    std::error_code error;
    if (fs::is_directory(path, error)) {
        return FileKind::Folder;
    }
    if (!fs::is_regular_file(path, error)) {
        return std::errc::permission_denied == error ? FileKind::Shut : FileKind::Missing;
    }
    char head[128] = {};
    std::ifstream stream(path, std::ios::binary);
    if (!stream) {
        return FileKind::Shut;
    }
    stream.read(head, sizeof head);
    std::string_view const view(head, sizeof head);
    return std::string_view::npos != view.find("KvBk")   ? FileKind::Book
           : std::string_view::npos != view.find("KvDc") ? FileKind::Document
                                                         : FileKind::Other;
}

}
