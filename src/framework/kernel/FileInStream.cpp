#include "framework/kernel/FileInStream.h"

#include "framework/kernel/Assert.h"

namespace Kernel
{

Counted<FileInStream> FileInStream::Open(char const * path, bool throwOnFailure)
{
    auto stream = MakeCounted<FileInStream>();
    auto const result = stream->m_File.OpenEx(path, "rb", File::ShareMode::Shared, File::VisibilityMode::Normal);
    if (result != File::OpenUnmanagedResult::Success) {
        if (throwOnFailure) {
            throw File::OpenUnmanagedException(result, File::GetResultText(result, path));
        }
        return nullptr;
    }
    stream->m_Length = stream->m_File.GetSize();
    return stream;
}

void FileInStream::Seek(std::uint64_t offset)
{
    KORVANE_ASSERT(offset <= m_Length);
    m_File.Seek(offset);
}

}
