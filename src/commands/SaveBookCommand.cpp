#include "commands/SaveBookCommand.h"

#include "core/BookSavedNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SaveBookCommand, "SBkC");

SaveBookCommand::SaveBookCommand() = default;

SaveBookCommand::SaveBookCommand(bool closeOnSuccess) : m_CloseOnSuccess(closeOnSuccess) {}

Kernel::LocalisedString SaveBookCommand::GetDescription() const
{
    return Kernel::LocalisedString("Save Book", "Book Command");
}

void SaveBookCommand::Do()
{
    SetDirection(Forward);
    // Nothing changes the book meanwhile: its queue is busy with this command.
    GetBookController()->ReleaseWriterLock();
    GetBookController()->SaveBook(m_Result);
    GetBookController()->AcquireWriterLock();
}

void SaveBookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
    Tell<BookSavedNotification>(notifications, m_Result, m_CloseOnSuccess);
}

}
