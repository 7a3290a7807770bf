#pragma once

#include "core/BookController.h"

namespace Book
{

/// Holds the user's open chapters still for as long as it lives.
class BookLockSession
{
public:
    explicit BookLockSession(Kernel::Counted<BookController> book) : m_Book(std::move(book))
    {
        m_Book->EngageBookLock(true);
    }
    ~BookLockSession() { m_Book->EngageBookLock(false); }
    BookLockSession(BookLockSession const &) = delete;
    BookLockSession & operator=(BookLockSession const &) = delete;

private:
    Kernel::Counted<BookController> m_Book;
};

}
