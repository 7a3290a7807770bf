#include "framework/kernel/Path.h"

#include <algorithm>

namespace Kernel
{

namespace
{

std::size_t FileNameStart(std::string_view path)
{
    std::size_t const last = path.find_last_of("/\\");
    return last == std::string_view::npos ? 0 : last + 1;
}

}

String Path::GetFileName(String const & path)
{
    return String(path.View().substr(FileNameStart(path)));
}

String Path::GetFileNameWithoutExtension(String const & path)
{
    std::string_view const name = path.View().substr(FileNameStart(path));
    return String(name.substr(0, std::min(name.find_last_of('.'), name.size())));
}

String Path::GetExtension(String const & path)
{
    std::string_view const name = path.View().substr(FileNameStart(path));
    std::size_t const dot = name.find_last_of('.');
    return dot == std::string_view::npos ? String() : String(name.substr(dot + 1));
}

String Path::GetFolderWithSeparator(String const & path)
{
    return String(path.View().substr(0, FileNameStart(path)));
}

String Path::GetFolder(String const & path)
{
    std::size_t const start = FileNameStart(path);
    return String(path.View().substr(0, 1 < start ? start - 1 : start));
}

bool Path::IsAbsolute(String const & path)
{
    std::string_view const view = path.View();
    bool const drive = 2 <= view.size() && view[1] == ':' &&
                       (('a' <= view[0] && view[0] <= 'z') || ('A' <= view[0] && view[0] <= 'Z'));
    return drive || (!view.empty() && IsSeparator(view[0]));
}

}
