#include "commands/EngageBookLockCommand.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(EngageBookLockCommand, "EBLC");

EngageBookLockCommand::EngageBookLockCommand() = default;

EngageBookLockCommand::EngageBookLockCommand(bool engage) : m_Engage(engage) {}

Kernel::LocalisedString EngageBookLockCommand::GetDescription() const
{
    return Kernel::LocalisedString("Engage BookLock", "Book Command");
}

void EngageBookLockCommand::Do()
{
    GetBookController()->EngageBookLock(m_Engage);
}

}
