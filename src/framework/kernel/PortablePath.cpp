#include "framework/kernel/PortablePath.h"

#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Path.h"

#include <string>

namespace Kernel
{

namespace
{

constexpr std::string_view Mark = "./";

}

String PortablePath::Make(String const & path, String const & filePath)
{
    String const folder = Path::GetFolderWithSeparator(FileSystem::GetAbsolutePath(filePath));
    std::string const whole = FileSystem::GetAbsolutePath(path).ToStd();
    if (folder.Empty() || !whole.starts_with(folder.View()) || whole.size() == folder.Length()) {
        return path;
    }
    return String(std::string(Mark) + whole.substr(folder.Length()));
}

String PortablePath::Resolve(String const & text, String const & filePath)
{
    if (!text.View().starts_with(Mark)) {
        return text;
    }
    String const file = Path::IsAbsolute(filePath) ? filePath : FileSystem::GetAbsolutePath(filePath);
    return Path::GetFolderWithSeparator(file) + String(text.View().substr(Mark.size()));
}

}
