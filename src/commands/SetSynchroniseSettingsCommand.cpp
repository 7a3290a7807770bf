#include "commands/SetSynchroniseSettingsCommand.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SetSynchroniseSettingsCommand, "SySt");

SetSynchroniseSettingsCommand::SetSynchroniseSettingsCommand() = default;

SetSynchroniseSettingsCommand::SetSynchroniseSettingsCommand(BookController::SynchroniseSettings const & settings)
    : m_Settings(settings)
{
}

Kernel::LocalisedString SetSynchroniseSettingsCommand::GetDescription() const
{
    return Kernel::LocalisedString("Set stray handling", "Book Commands");
}

void SetSynchroniseSettingsCommand::Do()
{
    GetBookController()->SetSynchroniseSettings(m_Settings);
}

}
