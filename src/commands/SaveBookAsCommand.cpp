#include "commands/SaveBookAsCommand.h"

#include "core/BookSavedNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SaveBookAsCommand, "SBaC");

SaveBookAsCommand::SaveBookAsCommand() = default;

SaveBookAsCommand::SaveBookAsCommand(String const & path, bool closeOnSuccess)
    : m_Path(path),
      m_CloseOnSuccess(closeOnSuccess)
{
}

Kernel::LocalisedString SaveBookAsCommand::GetDescription() const
{
    return Kernel::LocalisedString("Save Book As", "Book Command");
}

void SaveBookAsCommand::Do()
{
    SetDirection(Forward);
    // Nothing changes the book meanwhile: its queue is busy with this command.
    GetBookController()->ReleaseWriterLock();
    GetBookController()->SaveBookAsCopy(m_Result, m_Path);
    GetBookController()->AcquireWriterLock();
}

void SaveBookAsCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
    Tell<BookSavedNotification>(notifications, m_Result, m_CloseOnSuccess);
}

}
