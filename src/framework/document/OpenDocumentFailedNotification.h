#pragma once

#include "framework/kernel/Notification.h"
#include "framework/kernel/StringT.h"

#include <vector>

/// How the opening of a file went: filled by the loader, read by its caller, and posted if the user has to know.
/// Belongs to one thread until it is posted.
class OpenDocumentFailedNotification : public Kernel::Notification
{
public:
    /// 0 is success. 1 and 11 to 45: the file is missing or is no usable document. 2 to 10: it is there and somebody or
    /// something keeps it from us.
    enum Result : int
    {
        Success = 0,
        FileNotFound = 1,
        LockedByOther = 2,
        AccessDenied = 3,
        LockFailed = 4,
        CannotReadFile = 11,
        NotADocument = 12,
        OtherFileType = 13,
        Truncated = 14,
        ItemMissing = 15,
        FutureVersion = 16,
        Corrupt = 17,
        OutOfResources = 18,
        Cancelled = 46
    };

    /// \param inFront the user opens the file, as opposed to the program for its own use
    OpenDocumentFailedNotification(String const & path, bool inFront);
    ~OpenDocumentFailedNotification() override;

    [[nodiscard]] String const & GetPath() const { return m_Path; }
    [[nodiscard]] bool IsInFront() const { return m_InFront; }

    [[nodiscard]] int GetResult() const { return m_Result; }
    void SetResult(int result) { m_Result = result; }
    /// With one sentence for the user, in the user's language, and the place in the file, which may be empty.
    void SetResult(int result, String reason, String place);
    [[nodiscard]] String const & GetReason() const { return m_Reason; }
    [[nodiscard]] String const & GetPlace() const { return m_Place; }

    /// The container was opened; what failed, if anything, lies inside.
    [[nodiscard]] bool IsArchiveOpened() const { return m_ArchiveOpened; }
    void SetArchiveOpened(bool opened) { m_ArchiveOpened = opened; }

    /// The file was opened, with something the user should know: a font missing, a picture missing.
    void AddWarning(String warning) { m_Warnings.push_back(std::move(warning)); }
    [[nodiscard]] bool HasWarnings() const { return !m_Warnings.empty(); }
    [[nodiscard]] std::vector<String> const & GetWarnings() const { return m_Warnings; }

private:
    String const m_Path;
    bool const m_InFront;
    int m_Result = Success;
    bool m_ArchiveOpened = false;
    String m_Reason;
    String m_Place;
    std::vector<String> m_Warnings;
};
