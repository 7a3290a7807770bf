#include "framework/commands/SaveDocumentCommand.h"

#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"

namespace
{

CommandRegistration const s_Save(typeid(SaveDocumentCommand), "SaveDocumentCommand");

/// How many names are tried for a document that is kept beside its file.
constexpr int MaximumKeptNames = 100;

}

Kernel::LocalisedString SaveDocumentCommand::GetDescription() const
{
    return Kernel::LocalisedString("Save document", "Document Command");
}

void SaveDocumentCommand::Do()
{
    GetDocument()->SaveDocument(m_Result, String());
    if (!m_Result.IsSuccess() && m_KeepOnFailure) {
        KeepBesideFile();
    }
}

void SaveDocumentCommand::KeepBesideFile()
{
    m_FailedPath = GetDocument()->GetPath();
    if (!KeepAs(m_FailedPath)) {
        // The disk is full, or the folder may not be written: another place is better than none.
        KeepAs(Kernel::FileSystem::GetTemporaryFolder() + "/" + Kernel::Path::GetFileName(m_FailedPath));
    }
    // The document's own notifications are off when nobody has it in front, and this one has to be heard.
    VantraController::GetInstance().Broadcast(
        Kernel::MakeCounted<DocumentSaveFailedNotification>(Self(), m_FailedPath, m_Result.GetText(), m_KeptPath));
}

bool SaveDocumentCommand::KeepAs(String const & path)
{
    for (int i = 1; i <= MaximumKeptNames; ++i) {
        String const candidate = Kernel::Format("%1.unsaved-%2", path, i);
        if (Kernel::FileSystem::Exists(candidate)) {
            continue;
        }
        DocumentSaveResult kept;
        GetDocument()->SaveCopy(kept, candidate);
        if (kept.IsSuccess()) {
            m_KeptPath = candidate;
        }
        return kept.IsSuccess();
    }
    return false;
}

void SaveDocumentCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (m_NotifySave) {
        notifications.push_back(Kernel::MakeCounted<DocumentSaveNotification>(Self(), m_Result));
    }
}
