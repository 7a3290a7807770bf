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
        CannotReplace = 2,
        AccessDenied = 3,
        LockedByOther = 4,
        FolderMissing = 5,
        ReadFailed = 10,
        SourceDamaged = 15,
        CannotCreate = 20,
        DiskFull = 21,
        WriteFailed = 22,
        CannotFlush = 23,
        TooLarge = 27,
        OtherReason = 28,
        NameTooLong = 29,
        BadName = 30,
        OtherArchive = 34,
        SessionFailed = 38,
        ItemFailed = 39,
        NoDevice = 40,
        ReadOnlyDevice = 41,
        Interrupted = 42,
        QuotaExceeded = 43,
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
