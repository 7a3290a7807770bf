#include "framework/commands/UpdateRunningHeadersCommand.h"

namespace
{

CommandRegistration const s_Update(typeid(UpdateRunningHeadersCommand), "UpdateRunningHeadersCommand");

}

Kernel::LocalisedString UpdateRunningHeadersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update running heads", "Document Command");
}

void UpdateRunningHeadersCommand::Do()
{
    GetDocument()->UpdateRunningHeads();
}
