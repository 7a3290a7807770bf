#include "framework/commands/UpgradeDocumentCommand.h"

namespace
{

CommandRegistration const s_Upgrade(typeid(UpgradeDocumentCommand), "UpgradeDocumentCommand");

}

Kernel::LocalisedString UpgradeDocumentCommand::GetDescription() const
{
    return Kernel::LocalisedString("Upgrade document", "Document Command");
}

void UpgradeDocumentCommand::Do()
{
    if (GetDocument()->IsFromOlderVersion()) {
        GetDocument()->MarkChanged();
    }
}
