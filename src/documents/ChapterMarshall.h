#pragma once

#include "core/BookController.h"

#include <deque>

namespace Book
{

/// Holds open the chapters that a long pass is working on: at most three, so that a long book never lies in memory
/// whole. First in, first out: asking for a chapter again does not make it younger.
///
/// Belongs to one running command, which builds it and lets it go at its end; no lock. The uses that it counts are its
/// own: who asks for a document neither releases it nor keeps it past the next `GetChapter`.
class ChapterMarshall final : public virtual Kernel::Countable
{
public:
    /// Opens nothing.
    ChapterMarshall();
    explicit ChapterMarshall(Kernel::Counted<BookController> book);
    ~ChapterMarshall() override;
    /// A copy holds the same documents open: they are let go, and conversions taken back, with the last that has them.
    ChapterMarshall(ChapterMarshall const & other);
    ChapterMarshall & operator=(ChapterMarshall const & other);

    /// The chapter's document, open; null if it cannot be opened. With `prepare` it is made ready for output: time
    /// stamp, composed text, running heads, and the colour format of the key chapter for as long as it is held here.
    Kernel::Counted<DocumentController const> GetChapter(Kernel::Counted<BookChapter const> chapter, bool prepare);

    /// Lets all documents go, oldest first.
    void Release();

private:
    /// One use of a chapter's document, which ends with it.
    class MarshalledChapter;

    static constexpr std::size_t Capacity = 3;

    [[nodiscard]] bool Prepare(Kernel::Counted<DocumentController const> const & document) const;

    Kernel::Counted<BookController> m_Book;
    std::deque<Kernel::Counted<MarshalledChapter const>> m_Entries;
};

}
