#include "commands/NewBookCommand.h"

#include "core/BookCollection.h"
#include "core/BookNotification.h"

namespace Book
{

Kernel::LocalisedString NewBookCommand::GetDescription() const
{
    return Kernel::LocalisedString("New book", "Command description");
}

void NewBookCommand::Do()
{
    m_Book = Kernel::MakeCounted<BookController>();
    m_Book->NewBook();
    BookCollection::GetInstance().AddBookController(m_Book);
}

void NewBookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<NewBookNotification>(m_Book));
}

}
