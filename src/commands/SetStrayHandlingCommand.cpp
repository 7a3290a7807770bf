#include "commands/SetStrayHandlingCommand.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SetStrayHandlingCommand, "SSHC");

SetStrayHandlingCommand::SetStrayHandlingCommand() = default;

SetStrayHandlingCommand::SetStrayHandlingCommand(bool pad, bool merge) : m_PadStrays(pad), m_MergeStrays(merge) {}

Kernel::LocalisedString SetStrayHandlingCommand::GetDescription() const
{
    return Kernel::LocalisedString("Set stray handling", "Book Commands");
}

void SetStrayHandlingCommand::Do()
{
    GetBookController()->SetPadStrays(m_PadStrays);
    GetBookController()->SetMergeStrays(m_MergeStrays);
}

}
