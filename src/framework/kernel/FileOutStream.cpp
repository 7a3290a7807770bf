#include "framework/kernel/FileOutStream.h"

#include "framework/kernel/Format.h"

#include <sys/stat.h>
#include <unistd.h>

namespace Kernel
{

namespace
{

/// Small writes are gathered up to this size.
constexpr std::size_t GatherSize = 128 * 1024;

bool IsSpecialFile(char const * path)
{
    struct stat facts;
    return ::stat(path, &facts) == 0 && !S_ISREG(facts.st_mode) && !S_ISDIR(facts.st_mode);
}

}

Counted<FileOutStream> FileOutStream::Create(char const * path, File::ShareMode share,
                                             File::OpenUnmanagedResult & result, String * message)
{
    Counted<FileOutStream> stream(new FileOutStream);
    stream->m_Path = path;
    if (IsSpecialFile(path)) {
        stream->m_InPlace = std::make_unique<File>();
        result = stream->m_InPlace->OpenEx(path, "wb", File::ShareMode::Shared, File::VisibilityMode::Normal);
    } else {
        stream->m_Replacement = ReplacementFile::Create(path, share, nullptr, result);
    }
    if (result != File::OpenUnmanagedResult::Success) {
        if (message) {
            *message = File::GetResultText(result, path);
        }
        return nullptr;
    }
    return stream;
}

Counted<FileOutStream> FileOutStream::CreateInPlace(std::unique_ptr<File> file, bool deleteOnRelease)
{
    Counted<FileOutStream> stream(new FileOutStream);
    stream->m_Path = file->GetPath();
    stream->m_InPlace = std::move(file);
    stream->m_DeleteOnRelease = deleteOnRelease;
    return stream;
}

FileOutStream::~FileOutStream()
{
    if (m_DeleteOnRelease) {
        ::unlink(m_Path.c_str());
    }
}

template <typename TWork>
void FileOutStream::Guarded(TWork const & work)
{
    if (m_Error) {
        return;
    }
    try {
        work();
    } catch (FileIOException const & exception) {
        m_Error = exception;
        if (!m_Handler) {
            throw;
        }
        m_Handler->OnWriteError(exception);
    }
}

void FileOutStream::WriteOut()
{
    File & file = m_Replacement ? m_Replacement->GetFile() : *m_InPlace;
    file.Write(m_Gathered.data(), m_Gathered.size());
    m_Gathered.clear();
}

void FileOutStream::Write(void const * data, std::size_t size)
{
    Guarded([&] {
        if (GatherSize < m_Gathered.size() + size) {
            WriteOut();
        }
        if (GatherSize < size) {
            File & file = m_Replacement ? m_Replacement->GetFile() : *m_InPlace;
            file.Write(data, size);
        } else {
            auto const * const bytes = static_cast<std::uint8_t const *>(data);
            m_Gathered.insert(m_Gathered.end(), bytes, bytes + size);
        }
    });
    m_Position += size;
}

bool FileOutStream::CopyFromStream(InStream & source, StreamCopyProgress * progress)
{
    std::uint64_t const total = source.GetLength() - source.GetPosition();
    std::vector<std::uint8_t> block(256 * 1024);
    for (std::uint64_t done = 0; done < total;) {
        if (progress && !progress->OnProgress(done, total)) {
            return false;
        }
        std::size_t got = 0;
        try {
            got = source.Read(block.data(), block.size());
        } catch (FileIOException const & exception) {
            // A source that fails half-way must not become a target that looks whole.
            m_Error = exception;
            if (!m_Handler) {
                throw;
            }
            m_Handler->OnReadError(exception);
            return true;
        }
        if (got == 0) {
            break;
        }
        Write(block.data(), got);
        done += got;
    }
    return !progress || progress->OnProgress(total, total);
}

bool FileOutStream::Close()
{
    if (m_Closed) {
        return !m_Error;
    }
    m_Closed = true;
    Guarded([&] {
        WriteOut();
        if (m_Replacement) {
            m_Replacement->Commit(false);
        } else if (!m_InPlace->Close()) {
            throw FileIOException::FromErrno(errno, m_Path, true);
        }
    });
    m_Replacement.reset();
    return !m_Error;
}

}
