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
    ChapterMarshall() = default;
    explicit ChapterMarshall(Kernel::Counted<BookController> book);
    ~ChapterMarshall() override;
    /// A copy would end uses that it never began.
    ChapterMarshall(ChapterMarshall const &) = delete;
    ChapterMarshall & operator=(ChapterMarshall const &) = delete;

    /// The chapter's document, open; null if it cannot be opened. With `prepare` it is made ready for output: time
    /// stamp, composed text, running heads, and the colour format of the key chapter for as long as it is held here.
    Kernel::Counted<DocumentController const> GetChapter(Kernel::Counted<BookChapter const> chapter, bool prepare);

    /// Ends all uses, oldest first.
    void Release();

private:
    struct MarshalledChapter
    {
        Kernel::Counted<BookChapter const> m_Chapter;
        Kernel::Counted<DocumentController const> m_Document;
        /// Brought to the key chapter's colour format here, which has to be taken back.
        bool m_Converted = false;
    };

    static constexpr std::size_t Capacity = 3;

    [[nodiscard]] bool Prepare(Kernel::Counted<DocumentController const> const & document) const;
    void ReleaseEntry(MarshalledChapter & entry) const;

    Kernel::Counted<BookController> m_Book;
    std::deque<MarshalledChapter> m_Entries;
};

}
