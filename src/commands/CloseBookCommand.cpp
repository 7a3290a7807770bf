#include "commands/CloseBookCommand.h"

#include "core/BookCollection.h"
#include "core/BookNotification.h"

namespace Book
{

CloseBookCommand::CloseBookCommand(Kernel::Counted<BookController const> book) : m_Book(std::move(book)) {}

Kernel::LocalisedString CloseBookCommand::GetDescription() const
{
    return Kernel::LocalisedString("Close book", "Book Commands");
}

void CloseBookCommand::Do()
{
    BookCollection::GetInstance().DisableCommandEnqueueAndEmpty(m_Book);
}

void CloseBookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<BookClosedNotification>(m_Book));
    auto const documents = m_Book->GetForegroundControllers({});
    if (!documents.empty()) {
        notifications.push_back(Kernel::MakeCounted<BookChapterInclusionChangedNotification>(m_Book, documents));
    }
}

}
