#include "framework/commands/SetMetadataTimestampCommand.h"

namespace
{

CommandRegistration const s_Stamp(typeid(SetMetadataTimestampCommand), "SetMetadataTimestampCommand");
CommandRegistration const s_Set(typeid(SetMetadataCommand), "SetMetadataCommand");

}

Kernel::LocalisedString SetMetadataTimestampCommand::GetDescription() const
{
    return Kernel::LocalisedString("Set time stamp", "Document Command");
}

void SetMetadataTimestampCommand::Do()
{
    DocumentMetadata::Values values = GetDocument()->GetMetadata()->GetValues();
    String & stamp = Created == m_Action    ? values.m_Created
                     : Modified == m_Action ? values.m_Modified
                                            : values.m_Output;
    stamp = m_Time.Empty() ? DocumentController::GetTimeText() : m_Time;
    GetDocument()->SetMetadata(std::move(values));
    if (Output != m_Action) {
        GetDocument()->MarkChanged();
    }
}

Kernel::LocalisedString SetMetadataCommand::GetDescription() const
{
    return Kernel::LocalisedString("Change document information", "Document Command");
}

void SetMetadataCommand::Do()
{
    m_Before = GetDocument()->GetMetadata()->GetValues();
    GetDocument()->SetMetadata(m_Values);
    GetDocument()->UpdateRunningHeads();
    // Fields in the text may show the title.
    GetDocument()->SetTextDirty();
}

void SetMetadataCommand::Undo()
{
    GetDocument()->SetMetadata(m_Before);
    GetDocument()->UpdateRunningHeads();
    GetDocument()->SetTextDirty();
}

void SetMetadataCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<DocumentStructureChangedNotification>(Self(), false));
}
