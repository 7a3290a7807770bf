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
        return FileKind::Missing;
    }
    char head[128] = {};
    std::ifstream(path, std::ios::binary).read(head, sizeof head);
    std::string_view const view(head, sizeof head);
    return std::string_view::npos != view.find("KvBk")   ? FileKind::Book
           : std::string_view::npos != view.find("KvDc") ? FileKind::Document
                                                         : FileKind::Other;
}

}
