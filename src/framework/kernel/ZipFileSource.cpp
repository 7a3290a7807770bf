#include "framework/kernel/ZipFileSource.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>
#include <zip.h>

namespace Kernel
{

namespace
{

constexpr std::size_t WindowLimit = 256 * 1024;

}

ZipFileSource::ZipFileSource(std::shared_ptr<File> file) : m_File(std::move(file)) {}

ZipFileSource::~ZipFileSource() = default;

void ZipFileSource::ThrowFailure()
{
    if (m_Failure) {
        std::rethrow_exception(std::exchange(m_Failure, nullptr));
    }
}

std::int64_t ZipFileSource::Read(void * buffer, std::uint64_t size)
{
    std::size_t const got = m_File->ReadAt(m_ReadPosition, buffer, size);
    m_ReadPosition += got;
    return static_cast<std::int64_t>(got);
}

void ZipFileSource::Write(void const * data, std::size_t size)
{
    if (WindowLimit < m_Window.size() + size) {
        WriteOut();
    }
    std::size_t const at = static_cast<std::size_t>(m_WritePosition - m_WindowStart);
    m_Window.resize(std::max(m_Window.size(), at + size));
    std::memcpy(m_Window.data() + at, data, size);
    m_WritePosition += size;
    m_WriteEnd = std::max(m_WriteEnd, m_WritePosition);
}

void ZipFileSource::SeekWrite(std::uint64_t offset)
{
    if (offset < m_WindowStart || m_WindowStart + m_Window.size() < offset) {
        m_WritePosition = offset;
        WriteOut();
    }
    m_WritePosition = offset;
}

void ZipFileSource::WriteOut()
{
    m_File->WriteAt(m_WindowStart, m_Window.data(), m_Window.size());
    m_Window.clear();
    m_WindowStart = m_WritePosition;
}

/// The commands of libzip, in C; nothing may be thrown through it.
struct ZipFileSourceCallback
{
    static zip_int64_t Call(void * state, void * data, zip_uint64_t length, zip_source_cmd_t command)
    {
        auto & source = *static_cast<ZipFileSource *>(state);
        try {
            return Work(source, data, length, command);
        } catch (...) {
            if (!source.m_Failure) {
                source.m_Failure = std::current_exception();
            }
            return -1;
        }
    }

    static zip_int64_t Work(ZipFileSource & source, void * data, zip_uint64_t length, zip_source_cmd_t command)
    {
        switch (command) {
        case ZIP_SOURCE_OPEN:
            source.m_ReadPosition = 0;
            return 0;
        case ZIP_SOURCE_READ:
            return source.Read(data, length);
        case ZIP_SOURCE_CLOSE:
        case ZIP_SOURCE_FREE:
        case ZIP_SOURCE_BEGIN_WRITE:
        case ZIP_SOURCE_ROLLBACK_WRITE:
        case ZIP_SOURCE_REMOVE:
            return 0;
        case ZIP_SOURCE_STAT: {
            auto * const stat = static_cast<zip_stat_t *>(data);
            zip_stat_init(stat);
            stat->size = source.m_File->GetSize();
            stat->valid = ZIP_STAT_SIZE;
            return sizeof(*stat);
        }
        case ZIP_SOURCE_ERROR: {
            int const codes[] = {source.m_Failure ? ZIP_ER_READ : ZIP_ER_INTERNAL, errno};
            KORVANE_ASSERT(sizeof(codes) <= length);
            std::memcpy(data, codes, sizeof(codes));
            return sizeof(codes);
        }
        case ZIP_SOURCE_SEEK: {
            zip_error_t error;
            zip_error_init(&error);
            zip_int64_t const to =
                zip_source_seek_compute_offset(source.m_ReadPosition, source.m_File->GetSize(), data, length, &error);
            if (to < 0) {
                return -1;
            }
            source.m_ReadPosition = static_cast<std::uint64_t>(to);
            return 0;
        }
        case ZIP_SOURCE_TELL:
            return static_cast<zip_int64_t>(source.m_ReadPosition);
        case ZIP_SOURCE_WRITE:
            source.Write(data, length);
            return static_cast<zip_int64_t>(length);
        case ZIP_SOURCE_SEEK_WRITE: {
            zip_error_t error;
            zip_error_init(&error);
            zip_int64_t const to =
                zip_source_seek_compute_offset(source.m_WritePosition, source.m_WriteEnd, data, length, &error);
            if (to < 0) {
                return -1;
            }
            source.SeekWrite(static_cast<std::uint64_t>(to));
            return 0;
        }
        case ZIP_SOURCE_TELL_WRITE:
            return static_cast<zip_int64_t>(source.m_WritePosition);
        case ZIP_SOURCE_COMMIT_WRITE:
            source.WriteOut();
            return 0;
        case ZIP_SOURCE_SUPPORTS:
            return ZIP_SOURCE_SUPPORTS_WRITABLE;
        default:
            return -1;
        }
    }
};

zip_source * ZipFileSource::MakeSource()
{
    return zip_source_function_create(&ZipFileSourceCallback::Call, this, nullptr);
}

}
