#pragma once

#include "core/BookController.h"
#include "core/Published.h"
#include "core/RecentBooks.h"
#include "framework/document/BookSink.h"
#include "framework/kernel/BroadcastNotification.h"

#include <atomic>
#include <vector>

namespace Book
{

class BookCommand;

/// The meeting place of the book layer: the registry of open books, the road of commands to them, the answers to the
/// document framework's questions about documents that are chapters, and the turning of the framework's notifications
/// into book work. One a process, built at first use, when it registers as sink; it lives to the end.
///
/// A book that has left the registry turns every call for it into nothing.
///
/// Threads: all of it may be called from any thread. The registry is a snapshot that writers swap under `m_BooksLock`,
/// which comes before `m_RecentBooksLock`; neither is held while a command is handed in. `Notify` runs on the
/// collection's own delivery line, never waits for a queue, and takes a book's writer lock in `UpdateChapter` only.
///
/// Who implements what: registry, look-ups and passwords in this folder; what builds structure and status commands, and
/// the dispatch, in `commands`; what builds content commands in `content`.
class BookCollection final : public BroadcastNotificationSink, public BookSink
{
public:
    using BookList = std::vector<Kernel::Counted<BookController>>;
    using ChapterList = std::vector<Kernel::Counted<BookChapter const>>;

    [[nodiscard]] static BookCollection & GetInstance();

    // Registry --------------------------------------------------------------------------------------------------------

    /// Nothing if the book is registered already.
    void AddBookController(Kernel::Counted<BookController> book);
    /// Takes the book out, also from its place in front.
    void RemoveBookController(Kernel::Counted<BookController const> book);
    /// All open books in the order in which they were added.
    [[nodiscard]] BookList Books() const;
    [[nodiscard]] int GetNumberOfActiveBookControllers() const;
    /// The book at that place among all; null out of range.
    [[nodiscard]] Kernel::Counted<BookController const> GetActiveBookController(int index) const;
    /// The same book in mutable form; null if it is not registered. Whoever changes a book from outside its queue goes
    /// through this.
    [[nodiscard]] Kernel::Counted<BookController>
    GetMutableBookController(Kernel::Counted<BookController const> book) const;
    /// The user interface has this book in front; null for none. Takes effect at once, also for a book that is not
    /// registered yet.
    void SetUIActiveBookController(Kernel::Counted<BookController const> book);
    /// Tells everybody that the book at `path` is the current one, by a `CurrentBookChangedNotification`. Nothing if
    /// there is no such book; nothing is stored.
    void SetActiveBookController(String path);

    // Look-ups --------------------------------------------------------------------------------------------------------

    [[nodiscard]] Kernel::Counted<BookController const> GetBookFromPath(String path) const;
    /// The book that a document belongs to, by its path: the one in front if it has the chapter, else the most recently
    /// commanded one that has it, else null.
    [[nodiscard]] Kernel::Counted<BookController const>
    GetBookFromDocument(Kernel::Counted<DocumentController const> document) const;
    [[nodiscard]] bool IsInBook(String const & path) const;

    // Commands --------------------------------------------------------------------------------------------------------

    /// Queues a command on the book and makes it the most recently commanded one. Dropped in silence if the book is no
    /// longer registered.
    void EnqueueCommand(Kernel::Counted<BookCommand> command, Kernel::Counted<BookController const> book);
    /// The same, and returns when this command has run and its completion callback has returned: not the queue's end.
    /// Returns at once if the book is not registered or its queue refuses the command; what the command would have left
    /// in its fields is then not there. A caller that is the book's own turn, or blocks it, gets the command run in
    /// place, as with any wait for a queue.
    void EnqueueCommandAndWait(Kernel::Counted<BookCommand> command, Kernel::Counted<BookController const> book);
    /// The book's queue refuses commands from now on, and runs empty.
    void DisableCommandEnqueueAndEmpty(Kernel::Counted<BookController const> book);

    // Updates: all but the last three only hand in commands -----------------------------------------------------------

    void UpdateNumbers(Kernel::Counted<BookController const> book, ChapterList chapters, bool pages, bool lists,
                       bool notes);
    /// Renumbers the pages of this chapter and all behind it. Nothing while a number update runs, or without automatic
    /// updates.
    void UpdatePageNumbers(Kernel::Counted<BookController const> book, Kernel::Counted<BookChapter const> chapter);
    void UpdatePageNumbers(Kernel::Counted<BookController const> book,
                           Kernel::Counted<DocumentController const> document);
    /// Gives a document that has just opened its numbers, automatic updates or not.
    void UpdateChapterNumbers(Kernel::Counted<BookController const> book,
                              Kernel::Counted<DocumentController const> document);
    void UpdateChapterPreflight(Kernel::Counted<BookController const> book,
                                Kernel::Counted<DocumentController const> document);
    void UpdateChapters(Kernel::Counted<BookController const> book);
    /// Stores where the chapter's numbers start, and renumbers from there if updates are automatic.
    void SetPageNumberOptions(Kernel::Counted<BookController const> book, Kernel::Counted<BookChapter const> chapter,
                              bool continueFromPrevious, int startPage);
    /// Hands in what has to be brought up to date before output, by the switches below, between an engage and a release
    /// of the book lock. With all five switches for output off, nothing, not even the lock.
    void PreOutput(Kernel::Counted<BookController const> book, ChapterList chapters);
    void UpdateAnchors(Kernel::Counted<BookController const> book, Kernel::Counted<DocumentController const> document);
    /// The chapter's document has closed. Under the book's writer lock. True if the file has changed while the book was
    /// not looking, or the book has no such chapter; false if the book is gone.
    bool UpdateChapter(Kernel::Counted<BookController const> book, String const & path);
    /// The chapter's document has been saved. Under the book's writer lock. True if the file's time has moved.
    bool UpdateChapter(Kernel::Counted<BookController const> book, Kernel::Counted<DocumentController const> document);

    // Switches of the session, all on at start ------------------------------------------------------------------------

    void SetUpdatePageNumbersAutomatically(bool update) { m_UpdatePageNumbersAutomatically = update; }
    void SetUpdateNumbersBeforeOutput(bool update) { m_UpdateNumbersBeforeOutput = update; }
    void SetUpdateCrossReferencesBeforeOutput(bool update) { m_UpdateCrossReferencesBeforeOutput = update; }
    void SetUpdateEndnotesBeforeOutput(bool update) { m_UpdateEndnotesBeforeOutput = update; }
    void SetUpdateTocsBeforeOutput(bool update) { m_UpdateTocsBeforeOutput = update; }
    void SetUpdateIndexBeforeOutput(bool update) { m_UpdateIndexBeforeOutput = update; }

    // Every notification of the application ---------------------------------------------------------------------------

    void Notify(Kernel::Counted<Kernel::Notification> notification) override;

    // Answers to the document framework -------------------------------------------------------------------------------

    [[nodiscard]] bool IsAnyTocOutOfDate(Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] bool IsIndexOutOfDate(Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] bool IsInBook(Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] Kernel::Counted<DomainCommand>
    MakeUpdateIndexCommand(Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] Kernel::Counted<DomainCommand>
    MakeUpdateAllTocsCommand(Kernel::Counted<DocumentController const> document) override;
    /// Takes book commands that were meant for a chapter's document to the book's queue. True if it took the command.
    bool HandleCommand(Kernel::Counted<DocumentController const> document,
                       Kernel::Counted<DomainCommand> command) override;
    bool GetAnchors(AnchorVisitor & visitor, Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] bool IsAnchorPointValid(Kernel::Counted<AnchorInstance const> instance,
                                          Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] AnchorInfo const * GetAnchorInfo(String const & uid,
                                                   Kernel::Counted<DocumentController const> document) override;
    /// An anchor that no chapter has counts as above.
    [[nodiscard]] bool IsAnchorAbove(String const & uid, Kernel::Counted<DocumentController const> document) override;
    [[nodiscard]] String GetPasswordForGuid(String guid, Kernel::Counted<DocumentController const> document) override;
    void SetPasswordForGuid(String guid, String password, Kernel::Counted<DocumentController const> document) override;
    ~BookCollection() override;

private:
    BookCollection();

    [[nodiscard]] Kernel::Counted<BookController const> GetBookFromChapterPath(String const & path) const;
    /// Moves the book to the back of the recent ones, if it is there.
    void MarkRecent(const Kernel::Counted<BookController const> & book);
    /// For each book that has a chapter at `path`.
    template <typename TAction>
    void ForEachBookWith(String const & path, const TAction & action) const;

    // What the dispatch hands in of content commands.
    void EnqueueSetMasterIndex(Kernel::Counted<BookController const> book,
                               Kernel::Counted<DocumentController const> document);
    void EnqueueReconcileAnchors(Kernel::Counted<BookController const> book, Kernel::Counted<BookChapter const> chapter,
                                 Kernel::Counted<DocumentController const> document);

    Published<Snapshot<BookList>> m_Books;
    /// The same books, the one that last received a command at the back. Under its lock only.
    RecentBooks m_RecentBooks;
    Published<Kernel::Counted<BookController const>> m_UIActiveBook;
    Kernel::CriticalSection m_BooksLock;
    Kernel::CriticalSection m_RecentBooksLock;
    std::atomic<bool> m_UpdatePageNumbersAutomatically{true};
    std::atomic<bool> m_UpdateNumbersBeforeOutput{true};
    std::atomic<bool> m_UpdateCrossReferencesBeforeOutput{true};
    std::atomic<bool> m_UpdateEndnotesBeforeOutput{true};
    std::atomic<bool> m_UpdateTocsBeforeOutput{true};
    std::atomic<bool> m_UpdateIndexBeforeOutput{true};
};

}
