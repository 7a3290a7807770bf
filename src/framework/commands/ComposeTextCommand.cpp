#include "framework/commands/ComposeTextCommand.h"

namespace
{

CommandRegistration const s_Compose(typeid(ComposeTextCommand), "ComposeTextCommand");

}

Kernel::LocalisedString ComposeTextCommand::GetDescription() const
{
    return Kernel::LocalisedString("Compose text", "Document Command");
}

void ComposeTextCommand::Do()
{
    m_Outcome = GetDocument()->ComposeText(m_Force, m_Abort);
}

void ComposeTextCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    GetDocument()->AppendComposeNotifications(m_Outcome, notifications);
}
