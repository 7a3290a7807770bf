#include "core/RecentBooks.h"

namespace Book
{

void RecentBooks::Append(Kernel::Counted<BookController> book)
{
    BookController const * const key = book.Get();
    m_Places.emplace(key, m_Books.insert(m_Books.end(), std::move(book)));
}

void RecentBooks::Remove(Kernel::Counted<BookController const> const & book)
{
    if (const auto place = m_Places.find(book.Get()); place != m_Places.end()) {
        m_Books.erase(place->second);
        m_Places.erase(place);
    }
}

void RecentBooks::MarkUsed(Kernel::Counted<BookController const> const & book)
{
    if (const auto place = m_Places.find(book.Get()); place != m_Places.end()) {
        m_Books.splice(m_Books.end(), m_Books, place->second);
    }
}

}
