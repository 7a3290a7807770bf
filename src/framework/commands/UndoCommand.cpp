#include "framework/commands/UndoCommand.h"

namespace
{

CommandRegistration const s_Undo(typeid(UndoCommand), "UndoCommand");
CommandRegistration const s_Redo(typeid(RedoCommand), "RedoCommand");

}

Kernel::LocalisedString UndoCommand::GetDescription() const
{
    return Kernel::LocalisedString("Undo", "Document Command");
}

void UndoCommand::Do()
{
    DocumentController & document = *GetDocument();
    if (document.RemoveFormatOverride()) {
        return;
    }
    m_Undone = document.GetHistory().Undo();
    if (m_Undone) {
        document.MarkChanged();
    }
}

void UndoCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (m_Undone) {
        m_Undone->NotifyWithCacheUpdates(notifications);
    }
}

Kernel::LocalisedString RedoCommand::GetDescription() const
{
    return Kernel::LocalisedString("Redo", "Document Command");
}

void RedoCommand::Do()
{
    m_Redone = GetDocument()->GetHistory().Redo();
    if (m_Redone) {
        GetDocument()->MarkChanged();
    }
}

void RedoCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (m_Redone) {
        m_Redone->NotifyWithCacheUpdates(notifications);
    }
}
