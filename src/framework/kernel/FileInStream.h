#pragma once

#include "framework/kernel/File.h"
#include "framework/kernel/InStream.h"

namespace Kernel
{

/// Reads a file.
class FileInStream : public InStream
{
public:
    /// Null if the file cannot be opened; with `throwOnFailure` that throws `File::OpenUnmanagedException` instead.
    [[nodiscard]] static Counted<FileInStream> Open(char const * path, bool throwOnFailure);

    std::size_t Read(void * buffer, std::size_t size) override { return m_File.Read(buffer, size); }
    [[nodiscard]] std::uint64_t GetLength() const override { return m_Length; }
    [[nodiscard]] std::uint64_t GetPosition() const override { return m_File.GetPosition(); }
    void Seek(std::uint64_t offset) override;
    [[nodiscard]] String GetSourceName() const override { return m_File.GetPath(); }

private:
    File m_File;
    std::uint64_t m_Length = 0;
};

}
