#pragma once

#include "core/BookController.h"
#include "framework/kernel/Counted.h"

#include <algorithm>
#include <list>
#include <unordered_map>
#include <utility>

namespace Book
{

/// The open books, the one that last received a command at the back. Every command of every book comes by here, so
/// nothing but the search by what a book holds takes longer with more books. Not safe on several threads at once.
class RecentBooks
{
public:
    /// To the back. The book must not be here.
    void Append(Kernel::Counted<BookController> book);
    /// Nothing if the book is not here; the order of the others is kept.
    void Remove(Kernel::Counted<BookController const> const & book);
    /// To the back, if the book is here.
    void MarkUsed(Kernel::Counted<BookController const> const & book);

    /// The first book from the back of which `matches` says so; null if there is none.
    template <typename TMatches>
    [[nodiscard]] Kernel::Counted<BookController const> FindLatest(TMatches const & matches) const
    {
        const auto found = std::find_if(m_Books.rbegin(), m_Books.rend(), matches);
        return found == m_Books.rend() ? nullptr : *found;
    }

private:
    using List = std::list<Kernel::Counted<BookController>>;

    List m_Books;
    std::unordered_map<BookController const *, List::iterator> m_Places;
};

}
