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
        : Exception(std::move(message)),
          m_Reason(reason),
          m_Path(std::move(path))
    {
    }

    /// From an `errno` value; `writing` tells which of the two general reasons stands for a value that has no own.
    [[nodiscard]] static FileIOException FromErrno(int errorNumber, String const & path, bool writing);

    [[nodiscard]] Reason GetReason() const { return m_Reason; }
    [[nodiscard]] String const & GetPath() const { return m_Path; }

private:
    Reason m_Reason;
    String m_Path;
};

}
