#include "core/BookNotification.h"

#include "framework/document/DocumentController.h"

namespace Book
{

BookChapterInclusionChangedNotification::BookChapterInclusionChangedNotification(
    const Kernel::Counted<BookController const> & book,
    std::vector<Kernel::Counted<DocumentController const>> documents)
    : BookNotification(book),
      m_Documents(std::move(documents))
{
}

BookChapterInclusionChangedNotification::~BookChapterInclusionChangedNotification() = default;

}
