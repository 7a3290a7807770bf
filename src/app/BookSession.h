#pragma once

#include "app/Listener.h"
#include "core/BookController.h"
#include "import/Importer.h"

#include <memory>

namespace Book
{
class BookCommand;
}

namespace App
{

/// One book that the program has open: everything that it does to the book goes through commands, and what came of them
/// it learns from notifications and results. Closes the book at its end. For the program's main thread.
class BookSession
{
public:
    using ChapterList = Book::BookController::ConstChapterList;

    BookSession(Console & console, Listener & listener);
    ~BookSession();
    BookSession(BookSession const &) = delete;
    BookSession & operator=(BookSession const &) = delete;

    /// Opens a book file and looks at all its chapters. False if it can't be opened; the messages tell why.
    bool Open(std::string const & path, Import::MessageList & messages);
    /// The same for a verb that puts the book out: refreshes what it knows of its chapters, with an error for each one that
    /// can't take part.
    bool OpenUsable(std::string const & path, Import::MessageList & messages);
    /// An empty book without a file.
    void Create();
    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(m_Book); }
    [[nodiscard]] Kernel::Counted<Book::BookController const> const & GetBook() const { return m_Book; }
    [[nodiscard]] ChapterList GetChapters() const;

    /// Brings the chapter list in step: deletes what is not among `chapters`, adds what is missing, moves what stands
    /// elsewhere, names the chapters, and renews the preview of a key chapter that was made anew. `hasTitlePage` says
    /// that the first is a title page.
    void MatchChapters(std::vector<Import::ImportedChapter> const & chapters, bool hasTitlePage);
    /// Refreshes what the book knows of its chapters' documents.
    void RefreshChapters();
    /// An error for each chapter whose document can't take part in the output.
    void ReportUnusable(Import::MessageList & messages) const;
    /// Runs the updates before output until no chapter's pages move any more; how many passes it took. After
    /// `g_MostPasses` it says which chapter won't settle.
    int Update(Import::MessageList & messages);
    /// Lets the numbers of pages, lists and notes run on through the book, in the same way until nothing moves.
    int Renumber(Import::MessageList & messages);
    /// Writes the book, to `path` if it has no file yet. False with a message if it failed.
    bool Save(std::string const & path, Import::MessageList & messages);
    /// The same also for a book that has no unsaved work: settings reach the file without counting as such.
    bool SaveAnyway(std::string const & path, Import::MessageList & messages);
    /// Waits until nothing moves any more. A question that waits for its answer lets go of the wait: the answer starts
    /// work anew.
    void WaitForRest();

    /// Runs a command on the book's queue and waits for its end. If the user interrupts, the command's abort flag is
    /// raised.
    void Run(Kernel::Counted<Book::BookCommand> const & command);

    static constexpr int g_MostPasses = 5;

private:
    /// What settles: pages and numbers of all chapters.
    struct Extent
    {
        std::string m_Path;
        int m_Pages = 0;
        int m_Start = 0;
        friend bool operator==(Extent const &, Extent const &) = default;
    };

    [[nodiscard]] std::vector<Extent> GetExtents() const;
    int Settle(std::function<void()> const & runPass, Import::MessageList & messages);

    Console & m_Console;
    Listener & m_Listener;
    Kernel::Counted<Book::BookController const> m_Book;
};

}
