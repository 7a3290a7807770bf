#include "framework/commands/ConvertFormatOrProfileCommand.h"

namespace
{

CommandRegistration const s_Convert(typeid(ConvertFormatOrProfileCommand), "ConvertFormatOrProfileCommand");

}

Kernel::LocalisedString ConvertFormatOrProfileCommand::GetDescription() const
{
    return Kernel::LocalisedString("Convert colours for output", "Document Command");
}

void ConvertFormatOrProfileCommand::Do()
{
    GetDocument()->SetFormatOverride(m_Format, m_Profiles);
}

void ConvertFormatOrProfileCommand::Undo()
{
    GetDocument()->RemoveFormatOverride();
}
