#include "commands/ChapterOpenCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/CloseDocumentNotification.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/Node.h"
#include "framework/document/VantraController.h"

#include <typeinfo>

namespace Book
{

namespace
{

/// What a notification means to the books.
enum class Event
{
    None,
    IndexTopicsChanged,
    AnchorsChanged,
    DocumentOpened,
    DocumentCloses,
    PagesChanged,
    PreflightDone,
    DocumentSaved,
    BookStructureChanged,
    StoryChanged,
    BitmapChanged
};

template <typename T>
bool Is(Kernel::Notification const & notification)
{
    return dynamic_cast<T const *>(&notification) != nullptr;
}

Event FindEvent(Kernel::Notification const & notification)
{
    if (Is<IndexTopicsChangedNotification>(notification)) {
        return Event::IndexTopicsChanged;
    }
    if (Is<AnchorsChangedNotification>(notification) || Is<DocumentStructureChangedNotification>(notification)) {
        return Event::AnchorsChanged;
    }
    if (Is<NewDocumentNotification>(notification)) {
        return Event::DocumentOpened;
    }
    if (Is<CloseDocumentNotification>(notification)) {
        return Event::DocumentCloses;
    }
    if (Is<PageStructureChangedNotification>(notification) || Is<DocumentSectionAddedNotification>(notification) ||
        Is<DocumentSectionChangedNotification>(notification)) {
        return Event::PagesChanged;
    }
    if (Is<PreflightResultsUpdatedNotification>(notification)) {
        return Event::PreflightDone;
    }
    if (Is<DocumentSaveNotification>(notification)) {
        return Event::DocumentSaved;
    }
    if (Is<BookStructureChangedNotification>(notification)) {
        return Event::BookStructureChanged;
    }
    if (Is<StoryChangedNotification>(notification)) {
        return Event::StoryChanged;
    }
    return Is<DocumentCacheBitmapChangedNotification>(notification) ? Event::BitmapChanged : Event::None;
}

/// The same with the last class remembered: this sees every notification of the application, mostly in runs of a kind.
Event FindEventCached(Kernel::Notification const & notification)
{
    thread_local std::type_info const * lastClass = nullptr;
    thread_local Event lastEvent = Event::None;
    std::type_info const & thisClass = typeid(notification);
    if (!lastClass || *lastClass != thisClass) {
        lastEvent = FindEvent(notification);
        lastClass = &thisClass;
    }
    return lastEvent;
}

/// A change that says of itself that it means nothing to others: only the layout was done again.
bool IsLayoutOnly(Kernel::Notification const & notification)
{
    return dynamic_cast<DocumentContentNotification const &>(notification).IsLayoutOnly();
}

}

template <typename TAction>
void BookCollection::ForEachBookWith(String const & path, TAction const & action) const
{
    Snapshot<BookList> const books = m_Books.Get();
    for (Kernel::Counted<BookController> const & book : books) {
        if (book->ContainsChapter(path)) {
            action(Kernel::Counted<BookController const>(book));
        }
    }
}

void BookCollection::Notify(Kernel::Counted<Kernel::Notification> notification)
{
    Event const event = FindEventCached(*notification);
    if (event == Event::None) {
        return;
    }
    if (event == Event::BookStructureChanged) {
        auto const & change = dynamic_cast<BookStructureChangedNotification const &>(*notification);
        UpdatePageNumbers(change.GetBookController(), change.GetChapter());
        return;
    }
    Kernel::Counted<DocumentController const> const document =
        dynamic_cast<DocumentNotification const &>(*notification).GetDocumentController();
    VantraController & application = VantraController::GetInstance();
    switch (event) {
    case Event::IndexTopicsChanged:
        if (auto const book = GetBookFromDocument(document); book && !book->IsInIndexUpdate()) {
            EnqueueSetMasterIndex(book, document);
        }
        break;
    case Event::AnchorsChanged:
        if (IsLayoutOnly(*notification)) {
            break;
        }
        if (auto const book = GetBookFromDocument(document); book && !book->IsInReconcileAnchors()) {
            EnqueueReconcileAnchors(book, book->GetChapterFromDocumentController(document), document);
        }
        break;
    case Event::DocumentOpened:
        ForEachBookWith(document->GetPath(), [&](Kernel::Counted<BookController const> const & book) {
            EnqueueCommand(Kernel::MakeCounted<ChapterOpenCommand>(document), book);
            UpdateChapterNumbers(book, document);
        });
        break;
    case Event::DocumentCloses:
        if (auto const book = GetBookFromDocument(document)) {
            UpdateAnchors(book, document);
        }
        // Also for a document that is in no book now: by the time that it is closed it may be.
        dynamic_cast<CloseDocumentNotification &>(*notification).AddCallback([this](String const & path) {
            ForEachBookWith(path, [&](Kernel::Counted<BookController const> const & book) {
                if (UpdateChapter(book, path)) {
                    UpdateChapters(book);
                }
            });
        });
        break;
    case Event::PagesChanged:
        if (auto const book = GetBookFromDocument(document)) {
            UpdatePageNumbers(book, document);
        }
        break;
    case Event::PreflightDone:
        ForEachBookWith(document->GetPath(), [&](Kernel::Counted<BookController const> const & book) {
            if (application.IsActiveDocumentController(document)) {
                UpdateChapterPreflight(book, document);
            }
        });
        break;
    case Event::DocumentSaved: {
        Snapshot<BookList> const books = m_Books.Get();
        for (Kernel::Counted<BookController> const & book : books) {
            if (!book->ContainsChapter(document->GetPath())) {
                if (book->ContainsEstrangedChapters()) {
                    UpdateChapters(book);
                }
            } else if (application.IsActiveDocumentController(document)) {
                UpdateChapter(book, document);
            }
        }
        break;
    }
    case Event::StoryChanged:
        if (IsLayoutOnly(*notification)) {
            break;
        }
        if (auto const book = GetMutableBookController(GetBookFromDocument(document))) {
            book->UpdateForegroundChapters();
        }
        break;
    case Event::BitmapChanged: {
        auto const node = dynamic_cast<DocumentCacheBitmapChangedNotification const &>(*notification).GetNode();
        if (!node || node->GetNodeIndex() != 0) {
            break;
        }
        auto const book = GetMutableBookController(GetBookFromDocument(document));
        auto const chapter = book ? book->GetChapterFromDocumentController(document) : nullptr;
        if (chapter && chapter->IsKey()) {
            book->UpdateThumbnail(document->GetDocumentCacheBitmap(0, false));
        }
        break;
    }
    case Event::None:
    case Event::BookStructureChanged:
        break;
    }
}

}
