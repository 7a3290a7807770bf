#pragma once

#include "framework/kernel/StringT.h"

#include <utility>

/// How a save went. A value; 0 is success.
class DocumentSaveResult
{
public:
    enum Result : int
    {
        Success = 0,
        NothingWritten = 1,
        OutOfMemory = 2,
        DiskFull = 3,
        QuotaExceeded = 4,
        TooLarge = 5,
        WriteFailed = 10,
        /// Another file that the save had to read is damaged or gone.
        SourceDamaged = 15,
        CannotCreate = 20,
        AccessDenied = 21,
        PermissionDenied = 22,
        ReadOnlyDevice = 23,
        LockedByOther = 27,
        FolderMissing = 28,
        NameTooLong = 29,
        /// No name, or that of a folder.
        BadName = 30,
        OtherArchive = 34,
        SessionFailed = 38,
        ItemFailed = 39,
        TooManyOpenFiles = 40,
        /// The quota forbids even an empty new file.
        QuotaUsedUp = 41,
        Busy = 42,
        DeviceError = 43,
        Unknown = 44
    };

    [[nodiscard]] int GetResult() const { return m_Result; }
    void SetResult(int result) { m_Result = result; }
    /// For a code with a text of its own.
    void SetResult(enum Result result, String const & text)
    {
        m_Result = result;
        m_Text = text;
    }
    /// One sentence for the user; empty for codes that speak for themselves.
    [[nodiscard]] String const & GetText() const { return m_Text; }

    [[nodiscard]] bool IsSuccess() const { return m_Success; }
    void SetSuccess(bool success) { m_Success = success; }

    /// The failure lies with the file itself, as opposed to what was to be written.
    [[nodiscard]] bool ConcernsFile() const { return m_ConcernsFile; }
    void SetConcernsFile(bool concerns) { m_ConcernsFile = concerns; }

    /// The path of another file that the save had to read and that failed; empty if none did.
    [[nodiscard]] String const & GetOtherArchivePath() const { return m_OtherArchivePath; }
    void SetOtherArchivePath(String path) { m_OtherArchivePath = std::move(path); }

private:
    int m_Result = Success;
    bool m_Success = false;
    bool m_ConcernsFile = false;
    String m_Text;
    String m_OtherArchivePath;
};
