#pragma once

#include "framework/kernel/Exception.h"

namespace Kernel
{

/// Reading or writing an open file failed.
class FileIOException : public Exception
{
public:
    enum class Reason
    {
        Unknown = 0,
        WriteFailed = 1,
        AccessDenied = 2,
        PermissionDenied = 3,
        OutOfSpace = 4,
        DeviceError = 5,
        ReadFailed = 6,
    };

    FileIOException(Reason reason, String path, String message)
        : FileIOException(reason, std::move(path), std::move(message), 0, reason != Reason::ReadFailed)
    {
    }

    /// From an `errno` value; `writing` tells which of the two general reasons stands for a value that has no own.
    [[nodiscard]] static FileIOException FromErrno(int errorNumber, String const & path, bool writing);

    [[nodiscard]] Reason GetReason() const { return m_Reason; }
    [[nodiscard]] String const & GetPath() const { return m_Path; }
    /// The system's own number, for those who tell more reasons apart; 0 if it gave none.
    [[nodiscard]] int GetErrno() const { return m_Errno; }
    /// It failed while writing, and not while reading.
    [[nodiscard]] bool IsWriting() const { return m_Writing; }

private:
    FileIOException(Reason reason, String path, String message, int errorNumber, bool writing)
        : Exception(std::move(message)),
          m_Errno(errorNumber),
          m_Writing(writing),
          m_Reason(reason),
          m_Path(std::move(path))
    {
    }

    int m_Errno;
    bool m_Writing;
    Reason m_Reason;
    String m_Path;
};

}
