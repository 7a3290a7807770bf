#pragma once

#include "framework/kernel/Exception.h"

#include <cstddef>
#include <cstdint>

namespace Kernel
{

/// An open file of the system; closed when the object goes. One thread at a time, except for `ReadAt`.
class File
{
public:
    /// What others may do with the file meanwhile.
    enum class ShareMode
    {
        /// Anything; locks of others are not looked at.
        Shared = 0,
        /// Opening for writing is refused where another program holds a lock on the file.
        RespectLocks = 1,
    };
    enum class VisibilityMode
    {
        Normal = 0,
    };
    enum class OpenUnmanagedResult
    {
        Success = 0,
        /// Opened for reading although writing was asked for as well.
        SuccessReadOnly = 1,
        NotFound = 2,
        InvalidMode = 3,
        /// The folder that the new file belongs in does not exist.
        FolderMissing = 4,
        AccessDenied = 5,
        PermissionDenied = 6,
        SharingViolation = 7,
        LockViolation = 8,
        Busy = 9,
        ReadOnlyVolume = 10,
        IsFolder = 11,
        TooManyOpenFiles = 12,
        OutOfMemory = 13,
        DeviceError = 14,
        DiskFull = 15,
        QuotaExceeded = 16,
        NameTooLong = 17,
        Unknown = 18,
    };

    /// Thrown by those operations that have no result to give the code in.
    class OpenUnmanagedException : public Exception
    {
    public:
        OpenUnmanagedException(OpenUnmanagedResult result, String message)
            : Exception(std::move(message)),
              m_Result(result)
        {
        }
        [[nodiscard]] OpenUnmanagedResult GetResult() const { return m_Result; }

    private:
        OpenUnmanagedResult m_Result;
    };

    File();
    ~File();
    File(File const &) = delete;
    File & operator=(File const &) = delete;

    /// Opens in a mode as the C library's: "rb", "wb" (made or emptied), "r+b" (read and write; "SuccessReadOnly" where
    /// only reading is allowed), "ab", and with an "x" at the end only a file that is new. A file that is open already
    /// is closed first. A folder is never opened.
    OpenUnmanagedResult OpenEx(char const * path, char const * mode, ShareMode share, VisibilityMode visibility);

    [[nodiscard]] bool IsOpen() const { return 0 <= m_Descriptor; }
    [[nodiscard]] String const & GetPath() const { return m_Path; }
    [[nodiscard]] int GetDescriptor() const { return m_Descriptor; }
    /// False if the system reports a failure of an earlier write only now.
    bool Close();

    /// These throw `FileIOException`. `Read` gives fewer bytes than asked for only at the end of the file; `ReadAt`
    /// reads at an offset and leaves the position alone, so that several threads may use it; `Flush` is through to the
    /// disk.
    std::size_t Read(void * buffer, std::size_t size);
    std::size_t ReadAt(std::uint64_t offset, void * buffer, std::size_t size) const;
    void Write(void const * data, std::size_t size);
    void WriteAt(std::uint64_t offset, void const * data, std::size_t size);
    void Flush();
    void Seek(std::uint64_t offset);
    [[nodiscard]] std::uint64_t GetPosition() const { return m_Position; }
    [[nodiscard]] std::uint64_t GetSize() const;

    /// The code for an `errno` value of a failed opening.
    [[nodiscard]] static OpenUnmanagedResult ResultFromErrno(int errorNumber);
    /// A sentence about the failed opening of a file.
    [[nodiscard]] static String GetResultText(OpenUnmanagedResult result, String const & path);

private:
    String m_Path;
    int m_Descriptor = -1;
    std::uint64_t m_Position = 0;
};

}
