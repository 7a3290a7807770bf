#pragma once

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/kernel/Notification.h"

#include <vector>

class DocumentController;

namespace Book
{

/// Base of what the book layer tells the application: something about one book. Sent by commands in `Notify`, or
/// broadcast directly; immutable after it is sent.
class BookNotification : public Kernel::Notification
{
public:
    [[nodiscard]] Kernel::Counted<BookController const> GetBookController() const { return m_BookController; }

    // None of the family waits for previews, is quick to show, or passes while the book lock holds documents still.
    [[nodiscard]] bool RequiredForPreviewing() const override { return false; }
    [[nodiscard]] bool FrontEndProcessingTimeIsCritical() const override { return true; }
    [[nodiscard]] bool MustProcessWithoutBookLock() const override { return false; }

protected:
    explicit BookNotification(const Kernel::Counted<BookController const> & book) : m_BookController(book) {}

private:
    Kernel::Counted<BookController const> m_BookController;
};

/// A book has opened.
class NewBookNotification final : public BookNotification
{
public:
    explicit NewBookNotification(const Kernel::Counted<BookController const> & book) : BookNotification(book) {}
    /// Path of the book at the time of the call; empty for a new one.
    [[nodiscard]] String GetPath() const { return GetBookController()->GetPath(); }
};

/// A book has closed: its queue runs empty and takes no command more. The application takes it out of `BookCollection`.
class BookClosedNotification final : public BookNotification
{
public:
    explicit BookClosedNotification(const Kernel::Counted<BookController const> & book) : BookNotification(book) {}
};

/// The user's current book changes.
class CurrentBookChangedNotification final : public BookNotification
{
public:
    explicit CurrentBookChangedNotification(const Kernel::Counted<BookController const> & book) : BookNotification(book)
    {
    }
};

/// Something about the book has changed; views redraw it.
class BookChangedNotification final : public BookNotification
{
public:
    explicit BookChangedNotification(const Kernel::Counted<BookController const> & book) : BookNotification(book) {}
};

/// The chapter list has changed from a chapter on. The book layer itself renumbers from there.
class BookStructureChangedNotification final : public BookNotification
{
public:
    BookStructureChangedNotification(const Kernel::Counted<BookController const> & book,
                                     Kernel::Counted<BookChapter const> chapter)
        : BookNotification(book),
          m_Chapter(std::move(chapter))
    {
    }
    /// The first chapter whose position changed; may be null.
    [[nodiscard]] Kernel::Counted<BookChapter const> GetChapter() const { return m_Chapter; }

private:
    Kernel::Counted<BookChapter const> m_Chapter;
};

/// Facts of these chapters have changed.
class ChapterChangedNotification final : public BookNotification
{
public:
    ChapterChangedNotification(const Kernel::Counted<BookController const> & book,
                               std::vector<Kernel::Counted<BookChapter const>> chapters)
        : BookNotification(book),
          m_Chapters(std::move(chapters))
    {
    }
    ChapterChangedNotification(const Kernel::Counted<BookController const> & book,
                               Kernel::Counted<BookChapter const> chapter)
        : BookNotification(book),
          m_Chapters{std::move(chapter)}
    {
    }
    [[nodiscard]] std::vector<Kernel::Counted<const BookChapter>> const & GetChapters() const { return m_Chapters; }

private:
    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
};

/// These open documents have gone into a book or out of it; what in them depends on that is to be looked at again.
class BookChapterInclusionChangedNotification final : public BookNotification
{
public:
    BookChapterInclusionChangedNotification(const Kernel::Counted<BookController const> & book,
                                            std::vector<Kernel::Counted<DocumentController const>> documents);
    ~BookChapterInclusionChangedNotification() override;
    [[nodiscard]] std::vector<Kernel::Counted<const DocumentController>> const & GetDocuments() const
    {
        return m_Documents;
    }

private:
    std::vector<Kernel::Counted<DocumentController const>> m_Documents;
};

}
