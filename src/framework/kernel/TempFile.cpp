#include "framework/kernel/TempFile.h"

#include "framework/kernel/DiskFault.h"
#include "framework/kernel/PathTraitsDos.h"
#include "framework/kernel/Uuid.h"

#include <sys/stat.h>

namespace Kernel
{

Counted<FileOutStream> TempFile::GenerateTempOutFile(String & path, String const & extension, bool deleteOnRelease)
{
    bool const dotted = extension.Empty() || extension.View().starts_with('.');
    auto file = std::make_unique<File>();
    // Fixed entropy gives the same names to two programs: another id until one is new.
    for (int attempt = 0; attempt < 100; ++attempt) {
        String const name = ConcatString({"korvane-", Uuid().ToString(), dotted ? "" : ".", extension});
        String const wanted = PathTraitsDos::Append(FileSystem::GetTemporaryFolder(), name);
        auto const result = file->OpenEx(wanted.c_str(), "w+bx", File::ShareMode::Shared, File::VisibilityMode::Normal);
        if (result == File::OpenUnmanagedResult::Success) {
            ::fchmod(file->GetDescriptor(), 0600);
            path = wanted;
            return FileOutStream::CreateInPlace(std::move(file), deleteOnRelease);
        }
        if (!FileSystem::Exists(wanted)) {
            break;
        }
    }
    path = String();
    return nullptr;
}

}
