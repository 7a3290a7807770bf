#pragma once

#include "core/BookNotification.h"
#include "framework/document/DocumentSaveResult.h"

namespace Book
{

/// A save of the book has ended, well or not.
class BookSavedNotification final : public BookNotification
{
public:
    BookSavedNotification(Kernel::Counted<BookController const> book, const DocumentSaveResult & result,
                          bool closeOnSuccess)
        : BookNotification(book),
          m_Result(result),
          m_CloseOnSuccess(closeOnSuccess)
    {
    }

    [[nodiscard]] const DocumentSaveResult & GetResult() const { return m_Result; }
    /// Path of the book at the time of the call.
    [[nodiscard]] String GetPath() const { return GetBookController()->GetPath(); }
    /// Whoever asked for the save wants the book closed if it went well. As it was given, whatever the result.
    [[nodiscard]] bool IsCloseOnSuccess() const { return m_CloseOnSuccess; }

private:
    DocumentSaveResult m_Result;
    bool m_CloseOnSuccess;
};

}
