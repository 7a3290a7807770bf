#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Writes the document to its own file. The writer lock is given up while the file is written. What would come out the
/// same to the byte is not written.
class SaveDocumentCommand : public PassingDocumentCommand
{
public:
    /// \param closeAfterwards handed on to who hears of the save; the document is not closed here
    /// \param notify a `DocumentSaveNotification` tells how it went, if the document posts notifications at all
    SaveDocumentCommand(bool closeAfterwards, bool notify) : m_CloseAfterwards(closeAfterwards), m_NotifySave(notify) {}

    /// Shows progress, which a document that nobody has in front does not.
    bool m_ShowProgress = true;
    /// The document's last user has let go: if its file can't be written, a `DocumentSaveFailedNotification` tells so,
    /// and the changed document is kept beside the file, or in the folder for temporary files, under a name that it
    /// states.
    bool m_KeepOnFailure = false;

    [[nodiscard]] bool IsCloseAfterwards() const { return m_CloseAfterwards; }
    [[nodiscard]] DocumentSaveResult const & GetResult() const { return m_Result; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] ProgressType GetProgressType() override { return m_ShowProgress ? ShowProgress : NoProgress; }

private:
    void KeepBesideFile();
    /// Under the path with a number behind it. False if it can't be written there.
    bool KeepAs(String const & path);

    DocumentSaveResult m_Result;
    String m_FailedPath;
    String m_KeptPath;
    bool const m_CloseAfterwards;
    bool const m_NotifySave;
};
