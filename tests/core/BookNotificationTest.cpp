#include "core/BookNotification.h"
#include "core/BookSavedNotification.h"
#include "core/ChapterFileNotifications.h"
#include "framework/kernel/DomainController.h"

#include <gtest/gtest.h>

#include <type_traits>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// A front end keeps what it is to answer later.
template <typename... TNotification>
constexpr bool AreCopied = (std::is_copy_constructible_v<TNotification> && ...);
static_assert(AreCopied<NewBookNotification, BookClosedNotification, CurrentBookChangedNotification,
                        BookChangedNotification, BookStructureChangedNotification, ChapterChangedNotification,
                        BookChapterInclusionChangedNotification, BookSavedNotification, ChooseChapterFileNotification,
                        LocateMissingChapterFileNotification, PromptFixBookPermissionsNotification>);

}

TEST(BookNotificationTest, WhatABatchSaysTwiceIsHeardTwice)
{
    auto const book = MakeCounted<BookController>();
    book->SetPath("/books/a.kvbook");
    auto const chapter = MakeCounted<BookChapter>(String("/x/a.kvdoc"));
    Counted<BookController const> const read = book;
    std::vector<Counted<Kernel::Notification>> const family{
        MakeCounted<NewBookNotification>(read),
        MakeCounted<BookClosedNotification>(read),
        MakeCounted<CurrentBookChangedNotification>(read),
        MakeCounted<BookChangedNotification>(read),
        MakeCounted<BookStructureChangedNotification>(read, nullptr),
        MakeCounted<ChapterChangedNotification>(read, Counted<BookChapter const>(chapter)),
        MakeCounted<BookChapterInclusionChangedNotification>(read,
                                                             std::vector<Counted<DocumentController const>>()),
        MakeCounted<BookSavedNotification>(read, DocumentSaveResult(), true),
        MakeCounted<ChooseChapterFileNotification>(String("Title"), String("/x/a.kvdoc"), read),
        MakeCounted<LocateMissingChapterFileNotification>(String("/x/a.kvdoc"), book),
        MakeCounted<PromptFixBookPermissionsNotification>(book, Counted<BookChapter const>(chapter))};
    for (auto const & notification : family) {
        // Receivers count on each: every change of a chapter list may start at another chapter.
        std::vector<Counted<Kernel::Notification>> batch{notification, notification};
        book->SimplifyNotifications(batch);
        EXPECT_EQ(batch.size(), 2u);
        EXPECT_FALSE(notification->RequiredForPreviewing());
        EXPECT_TRUE(notification->FrontEndProcessingTimeIsCritical());
        EXPECT_FALSE(notification->MustProcessWithoutBookLock());
        EXPECT_EQ(Kernel::CountedCast<BookNotification>(notification)->GetBookController(), read);
    }
    EXPECT_EQ(Kernel::CountedCast<ChapterChangedNotification>(family[5])->GetChapters().size(), 1u);
    EXPECT_EQ(Kernel::CountedCast<BookStructureChangedNotification>(family[4])->GetChapter(), nullptr);
    EXPECT_EQ(Kernel::CountedCast<NewBookNotification>(family[0])->GetPath(), "/books/a.kvbook");
    book->SetPath("/books/b.kvbook");
    EXPECT_EQ(Kernel::CountedCast<BookSavedNotification>(family[7])->GetPath(), "/books/b.kvbook") << "asked now";
}
