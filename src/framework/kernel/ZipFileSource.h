#pragma once

#include "framework/kernel/File.h"

#include <cstdint>
#include <exception>
#include <memory>
#include <vector>

struct zip_source;

namespace Kernel
{

/// Lets libzip read and write an open `File`, so that our locks, faults and error codes stay in force. Only the archive
/// uses this.
class ZipFileSource
{
public:
    explicit ZipFileSource(std::shared_ptr<File> file);
    ~ZipFileSource();
    ZipFileSource(ZipFileSource const &) = delete;
    ZipFileSource & operator=(ZipFileSource const &) = delete;

    /// A source for `zip_open_from_source`, which takes it over; null if memory is short. This object must outlive it.
    [[nodiscard]] zip_source * MakeSource();

    /// Throws what went wrong in the file during a call of libzip, if anything did; libzip's own code says less.
    void ThrowFailure();

private:
    friend struct ZipFileSourceCallback;

    std::int64_t Read(void * buffer, std::uint64_t size);
    void Write(void const * data, std::size_t size);
    void SeekWrite(std::uint64_t offset);
    void WriteOut();

    std::shared_ptr<File> const m_File;
    std::uint64_t m_ReadPosition = 0;
    // What was written last, not yet in the file: it begins at m_WindowStart. libzip goes back to fill in headers,
    // mostly within it.
    std::vector<std::uint8_t> m_Window;
    std::uint64_t m_WindowStart = 0;
    std::uint64_t m_WritePosition = 0;
    std::uint64_t m_WriteEnd = 0;
    std::exception_ptr m_Failure;
};

}
