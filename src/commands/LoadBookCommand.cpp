#include "commands/LoadBookCommand.h"

#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/VantraController.h"

namespace Book
{

LoadBookCommand::LoadBookCommand(String const & path) : m_Path(path) {}

Kernel::LocalisedString LoadBookCommand::GetDescription() const
{
    return Kernel::LocalisedString("Load book", "Command description");
}

void LoadBookCommand::Do()
{
    m_Result = Kernel::MakeCounted<OpenDocumentFailedNotification>(m_Path, false);
    m_Book = Kernel::MakeCounted<BookController>();
    VantraController::GetInstance().IncrementLoadingItems();
    bool const loaded = m_Book->LoadBook(m_Path, *m_Result);
    VantraController::GetInstance().DecrementLoadingItems();
    if (!loaded) {
        m_Book = nullptr;
        return;
    }
    BookCollection::GetInstance().AddBookController(m_Book);
    m_Book->CollateMissingChapters();
}

void LoadBookCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    if (!m_Book) {
        if (m_Result) {
            notifications.push_back(m_Result);
        }
        return;
    }
    notifications.push_back(Kernel::MakeCounted<NewBookNotification>(m_Book));
    if (m_Result->HasWarnings()) {
        notifications.push_back(m_Result);
    }
    auto const documents = m_Book->GetForegroundControllers({});
    if (!documents.empty()) {
        notifications.push_back(Kernel::MakeCounted<BookChapterInclusionChangedNotification>(m_Book, documents));
    }
}

}
