#include "core/BookCollection.h"

#include "core/BookNotification.h"
#include "framework/document/BookSinkCollection.h"
#include "framework/document/DocumentController.h"
#include "framework/document/VantraController.h"

#include <algorithm>

namespace Book
{

BookCollection & BookCollection::GetInstance()
{
    // Never destroyed: threads of queues may still ask while the process ends.
    static BookCollection & instance = *new BookCollection;
    return instance;
}

BookCollection::BookCollection()
{
    BroadcastNotification::RegisterBroadcastSink(this);
    BookSinkCollection::RegisterBookSink(this);
}

BookCollection::~BookCollection()
{
    BroadcastNotification::UnregisterBroadcastSink(this);
    BookSinkCollection::UnregisterBookSink(this);
}

void BookCollection::AddBookController(Kernel::Counted<BookController> book)
{
    Kernel::ScopedLock const lock(m_BooksLock);
    BookList books = *m_Books.Get();
    if (std::find(books.begin(), books.end(), book) != books.end()) {
        return;
    }
    books.push_back(book);
    m_Books.Set(Snapshot(std::move(books)));
    Kernel::ScopedLock const recentLock(m_RecentBooksLock);
    m_RecentBooks.Append(std::move(book));
}

void BookCollection::RemoveBookController(Kernel::Counted<BookController const> book)
{
    Kernel::ScopedLock const lock(m_BooksLock);
    Kernel::ScopedLock const recentLock(m_RecentBooksLock);
    BookList books = *m_Books.Get();
    std::erase_if(books, [&](const auto & entry) { return entry == book; });
    m_Books.Set(Snapshot(std::move(books)));
    m_RecentBooks.Remove(book);
    // In one step: the front end may put another book in front at this moment.
    m_UIActiveBook.Replace(book, nullptr);
}

BookCollection::BookList BookCollection::Books() const
{
    return *m_Books.Get();
}

int BookCollection::GetNumberOfActiveBookControllers() const
{
    return static_cast<int>(m_Books.Get().size());
}

Kernel::Counted<BookController const> BookCollection::GetActiveBookController(int index) const
{
    const Snapshot<BookList> books = m_Books.Get();
    return index < 0 || index >= static_cast<int>(books.size()) ? nullptr : books[static_cast<std::size_t>(index)];
}

Kernel::Counted<BookController>
BookCollection::GetMutableBookController(Kernel::Counted<BookController const> book) const
{
    const Snapshot<BookList> books = m_Books.Get();
    const auto found = std::find_if(books.begin(), books.end(), [&](const auto & entry) { return entry == book; });
    return found == books.end() ? nullptr : *found;
}

void BookCollection::SetUIActiveBookController(Kernel::Counted<BookController const> book)
{
    m_UIActiveBook.Set(std::move(book));
}

void BookCollection::SetActiveBookController(String path)
{
    if (const auto book = GetBookFromPath(std::move(path))) {
        VantraController::GetInstance().Broadcast(Kernel::MakeCounted<CurrentBookChangedNotification>(book));
    }
}

Kernel::Counted<BookController const> BookCollection::GetBookFromPath(String path) const
{
    const Snapshot<BookList> books = m_Books.Get();
    const auto found =
        std::find_if(books.begin(), books.end(), [&](const auto & book) { return book->GetPath() == path; });
    return found == books.end() ? nullptr : *found;
}

Kernel::Counted<BookController const>
BookCollection::GetBookFromDocument(Kernel::Counted<DocumentController const> document) const
{
    return document ? GetBookFromChapterPath(document->GetPath()) : nullptr;
}

Kernel::Counted<BookController const> BookCollection::GetBookFromChapterPath(String const & path) const
{
    const Kernel::Counted<BookController const> inFront = m_UIActiveBook.Get();
    if (inFront && inFront->ContainsChapter(path)) {
        return inFront;
    }
    Kernel::ScopedLock const lock(m_RecentBooksLock);
    return m_RecentBooks.FindLatest([&](const auto & book) { return book->ContainsChapter(path); });
}

bool BookCollection::IsInBook(String const & path) const
{
    return static_cast<bool>(GetBookFromChapterPath(path));
}

bool BookCollection::IsInBook(Kernel::Counted<DocumentController const> document)
{
    return static_cast<bool>(GetBookFromDocument(std::move(document)));
}

void BookCollection::DisableCommandEnqueueAndEmpty(Kernel::Counted<BookController const> book)
{
    if (const auto mutableBook = GetMutableBookController(std::move(book))) {
        mutableBook->DisableCommandEnqueueAndEmpty();
    }
}

void BookCollection::MarkRecent(const Kernel::Counted<BookController const> & book)
{
    Kernel::ScopedLock const lock(m_RecentBooksLock);
    m_RecentBooks.MarkUsed(book);
}

void BookCollection::UpdateChapters(Kernel::Counted<BookController const> book)
{
    if (const auto mutableBook = GetMutableBookController(std::move(book))) {
        mutableBook->UpdateChapters();
    }
}

bool BookCollection::UpdateChapter(Kernel::Counted<BookController const> book, String const & path)
{
    const auto mutableBook = GetMutableBookController(book);
    if (!mutableBook) {
        return false;
    }
    mutableBook->AcquireWriterLock();
    bool changed = true;
    if (const auto chapter = mutableBook->GetChapterFromPath(path)) {
        changed = chapter->UpdateTimeStamp();
        chapter->SetStatus(BookChapter::Status::Ok);
        VantraController::GetInstance().Broadcast(Kernel::MakeCounted<ChapterChangedNotification>(book, chapter));
    }
    mutableBook->ReleaseWriterLock();
    return changed;
}

String BookCollection::GetPasswordForGuid(String guid, Kernel::Counted<DocumentController const> document)
{
    const auto book = GetBookFromDocument(document);
    const auto chapter = book ? book->GetChapterFromDocumentController(document) : nullptr;
    return chapter ? chapter->GetPassword(std::move(guid)) : String();
}

void BookCollection::SetPasswordForGuid(String guid, String password,
                                        Kernel::Counted<DocumentController const> document)
{
    const auto book = GetBookFromDocument(document);
    const auto chapter = book ? book->GetChapterFromDocumentController(document) : nullptr;
    if (chapter) {
        if (const auto mutableChapter = book->GetMutableChapter(chapter)) {
            mutableChapter->SetPassword(std::move(guid), std::move(password));
        }
    }
}

}
