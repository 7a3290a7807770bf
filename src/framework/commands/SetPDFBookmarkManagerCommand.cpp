#include "framework/commands/SetPDFBookmarkManagerCommand.h"

namespace
{

CommandRegistration const s_Set(typeid(SetPDFBookmarkManagerCommand), "SetPDFBookmarkManagerCommand");

}

Kernel::LocalisedString SetPDFBookmarkManagerCommand::GetDescription() const
{
    return Kernel::LocalisedString("Change bookmarks", "Document Command");
}

void SetPDFBookmarkManagerCommand::Do()
{
    m_Before = GetDocument()->GetPDFBookmarkManager();
    GetDocument()->SetPDFBookmarkManager(m_Manager);
}

void SetPDFBookmarkManagerCommand::Undo()
{
    GetDocument()->SetPDFBookmarkManager(m_Before);
}

void SetPDFBookmarkManagerCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<AnchorsChangedNotification>(Self(), false));
}
