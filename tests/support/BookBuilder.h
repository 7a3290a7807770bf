#pragma once

#include "core/BookController.h"
#include "framework/document/DocumentSection.h"
#include "support/TemporaryFolder.h"

#include <string>
#include <vector>

namespace Book
{
class BookCommand;
}

/// What a chapter's document is to hold.
struct ChapterSketch
{
    int m_Pages = 1;
    /// The first section; by default an untouched one.
    DocumentSection::Values m_Section;
    bool m_FacingPages = true;
    /// One anchor each, at the start of the text.
    std::vector<std::string> m_Anchors;
    /// Endnotes that run through the book.
    int m_BookEndnotes = 0;
    /// Full names of index topics, "Topic!Subtopic", marked at the start of the text.
    std::vector<std::string> m_Topics;
    std::string m_Title;
    Raster::Format m_Format = Raster::Format::Rgba8;
    bool m_Restricted = false;
};

/// Makes real chapter documents in a folder of its own, and real books of them. Closes its books at the end and waits
/// until everything is at rest.
class BookBuilder
{
public:
    BookBuilder() = default;
    ~BookBuilder();
    BookBuilder(BookBuilder const &) = delete;
    BookBuilder & operator=(BookBuilder const &) = delete;

    [[nodiscard]] TemporaryFolder const & GetFolder() const { return m_Folder; }

    /// Writes a chapter's document file and gives its path.
    String WriteChapter(std::string const & name, ChapterSketch const & sketch = {});

    /// A new, registered book, made by the command for that.
    Kernel::Counted<Book::BookController> NewBook();
    /// The same with these chapters added by command.
    Kernel::Counted<Book::BookController> NewBook(std::vector<String> const & paths);
    /// Opens a book file by the command for that; null if it can't be opened.
    Kernel::Counted<Book::BookController> LoadBook(String const & path);
    /// Closes a book as a front end does, and waits.
    void CloseBook(Kernel::Counted<Book::BookController> const & book);

    /// Runs a command on the book's queue to its end.
    static void Run(Kernel::Counted<Book::BookController> const & book, Kernel::Counted<Book::BookCommand> command);
    /// Waits until everything is at rest.
    static void Rest();

    /// The chapters' names in book order, separated by spaces.
    [[nodiscard]] static std::string Names(Book::BookController const & book);
    /// The start-from page of every chapter, in book order, separated by spaces.
    [[nodiscard]] static std::string Starts(Book::BookController const & book);

private:
    TemporaryFolder m_Folder;
    std::vector<Kernel::Counted<Book::BookController>> m_Books;
};
