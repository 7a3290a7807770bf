// Binds documents into a book, with nothing but the installed library:
//
//     bind BOOK.kvbook CHAPTER.kvdoc...
//
// opens the book, or makes one if there is none, adds the documents as chapters at its end, saves it, and tells on the
// way what the library says of its work. korvane import makes documents of Markdown.

#include "commands/AddChapterCommand.h"
#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/NewBookCommand.h"
#include "commands/SaveBookAsCommand.h"
#include "core/BookCollection.h"
#include "core/BookController.h"
#include "core/BookNotification.h"
#include "core/BookSavedNotification.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/BroadcastNotification.h"

#include <atomic>
#include <filesystem>
#include <iostream>
#include <vector>

namespace
{

using BookPtr = Kernel::Counted<Book::BookController const>;

/// Hears all that happens, on a thread of the library's own, which must not wait for a book's or document's queue.
class Ear : public BroadcastNotificationSink
{
public:
    Ear() { BroadcastNotification::RegisterBroadcastSink(this); }
    ~Ear() override { BroadcastNotification::UnregisterBroadcastSink(this); }

    void Notify(Kernel::Counted<Kernel::Notification> notification) override
    {
        Kernel::Notification const * const heard = notification.Get();
        if (dynamic_cast<Book::NewBookNotification const *>(heard)) {
            std::cout << "a book is open\n";
        } else if (dynamic_cast<Book::BookStructureChangedNotification const *>(heard)) {
            std::cout << "the list of chapters has changed\n";
        } else if (auto const * saved = dynamic_cast<Book::BookSavedNotification const *>(heard)) {
            m_WasSaved = saved->GetResult().IsSuccess();
            std::cout << (m_WasSaved ? "saved as " : "could not be saved as ") << saved->GetPath().ToStd() << '\n';
        } else if (auto const * closed = dynamic_cast<Book::BookClosedNotification const *>(heard)) {
            // Who hears that a book has closed takes it out of the collection.
            Book::BookCollection::GetInstance().RemoveBookController(closed->GetBookController());
            std::cout << "the book is closed\n";
        } else if (auto const * failed = dynamic_cast<OpenDocumentFailedNotification const *>(heard)) {
            std::cout << failed->GetPath().ToStd() << ": " << failed->GetReason().ToStd() << '\n';
        }
    }

    [[nodiscard]] bool WasSaved() const { return m_WasSaved; }

private:
    std::atomic<bool> m_WasSaved = false;
};

BookPtr OpenOrMake(String const & path)
{
    VantraController & application = VantraController::GetInstance();
    if (std::filesystem::exists(path.ToStd())) {
        auto const load = Kernel::MakeCounted<Book::LoadBookCommand>(path);
        application.EnqueueCommandAndWait(Kernel::Counted<VantraCommand>(load));
        return load->GetBookController();
    }
    auto const make = Kernel::MakeCounted<Book::NewBookCommand>();
    application.EnqueueCommandAndWait(Kernel::Counted<VantraCommand>(make));
    return make->GetBookController();
}

void List(Book::BookController const & book)
{
    std::vector<Kernel::Counted<Book::BookChapter const>> chapters;
    book.GetChapters(chapters);
    for (auto const & chapter : chapters) {
        std::cout << (chapter->IsKey() ? "* " : "  ") << chapter->GetName().ToStd() << ", pages "
                  << chapter->DescribePages().ToStd() << '\n';
    }
}

}

int main(int argc, char ** argv)
{
    if (argc < 2) {
        std::cerr << "Usage: bind BOOK.kvbook CHAPTER.kvdoc...\n";
        return 2;
    }
    auto const fullPath = [](char const * path) { return String(std::filesystem::absolute(path).string()); };
    String const path = fullPath(argv[1]);
    std::vector<String> documents;
    for (int at = 2; at < argc; ++at) {
        documents.push_back(fullPath(argv[at]));
    }

    Ear const ear;
    VantraController & application = VantraController::GetInstance();
    Book::BookCollection & books = Book::BookCollection::GetInstance();
    BookPtr book = OpenOrMake(path);
    if (book) {
        // A null chapter to add before means the end.
        books.EnqueueCommandAndWait(Kernel::MakeCounted<Book::AddChapterCommand>(documents, nullptr), book);
        // The renumbering that the addition has set going.
        application.WaitUntilIdle();
        books.EnqueueCommandAndWait(Kernel::MakeCounted<Book::SaveBookAsCommand>(path, false), book);
        List(*book);
        application.EnqueueCommandAndWait(Kernel::MakeCounted<Book::CloseBookCommand>(book));
        book.Reset();
    }
    // Documents close, and notifications arrive, behind our back.
    application.WaitUntilIdle();
    return ear.WasSaved() ? 0 : 1;
}
