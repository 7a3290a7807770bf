#include "output/FileLink.h"

#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"
#include "framework/kernel/Uri.h"

namespace Book
{

namespace
{

/// The folder of a path without its trailing separator; one of fewer than four characters is a root and keeps it.
String FolderOf(String const & path)
{
    String const folder = Kernel::Path::GetFolderWithSeparator(path);
    return folder.Length() < 4 ? folder : String(folder.View().substr(0, folder.Length() - 1));
}

}

String WebAddress(String const & path)
{
    String const address = Kernel::HasUriProtocol(path) ? path : String("https://") + path;
    std::string_view const text = address;
    return text.ends_with('\\') ? String(text.substr(0, text.size() - 1)) : address;
}

bool IsPdfPath(String const & path)
{
    return Kernel::Path::GetExtension(path) == "pdf";
}

bool CopyBeside(String const & path, String const & pdfPath, String & relative)
{
    String const name = Kernel::Path::GetFileNameWithoutExtension(path);
    String const extension = Kernel::Path::GetExtension(path);
    relative = extension.Empty() ? name : Kernel::Format("%1.%2", name, extension);

    String const destination = Kernel::PathTraitsDos::Append(FolderOf(pdfPath), relative);
    return Kernel::FileSystem::Exists(destination) || Kernel::FileSystem::CopyFile(path, destination);
}

}
