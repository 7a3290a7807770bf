#include "commands/BookCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/VantraController.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <atomic>
#include <gtest/gtest.h>
#include <map>
#include <thread>
#include <utility>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

constexpr int ThreadCount = 8;
constexpr int BookCount = 4;
constexpr int CommandsPerThread = 200;

/// Who handed a command in, and which of that thread's for that book it was.
struct Ticket
{
    int m_Thread = 0;
    int m_Book = 0;
    int m_Number = 0;
};

class TicketNotification final : public BookNotification
{
public:
    TicketNotification(Counted<BookController const> const & book, Ticket ticket)
        : BookNotification(book),
          m_Ticket(ticket)
    {
    }
    Ticket const m_Ticket;
};

/// Changes its book, and says so.
class TicketCommand final : public BookCommand
{
public:
    explicit TicketCommand(Ticket ticket) : m_Ticket(ticket) {}
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {"Ticket", "Test command"}; }
    void Do() override
    {
        auto const book = GetBookController();
        book->MoveChapters(nullptr, {book->GetChapterAtIndex(0)});
        book->SetIsDirty(m_Ticket.m_Number % 2 == 0);
    }
    void Notify(std::vector<Counted<Kernel::Notification>> & notifications) override
    {
        Tell<TicketNotification>(notifications, m_Ticket);
    }

private:
    Ticket const m_Ticket;
};

}

TEST(ConcurrentBooksTest, EveryAcceptedCommandRunsOnceAndIsToldInOrderWhileBooksClose)
{
    BookCollection & collection = BookCollection::GetInstance();
    collection.SetUpdatePageNumbersAutomatically(false);
    {
        BookBuilder builder;
        std::vector<String> const paths{builder.WriteChapter("a.kvdoc"), builder.WriteChapter("b.kvdoc")};
        std::vector<Counted<BookController>> books;
        for (int index = 0; index < BookCount; ++index) {
            books.push_back(builder.NewBook(paths));
        }
        NotificationRecorder recorder;
        std::atomic<int> ended{0};
        std::atomic<int> begun{0};
        std::vector<std::thread> threads;
        for (int thread = 0; thread < ThreadCount; ++thread) {
            threads.emplace_back([&, thread] {
                std::vector<int> numbers(BookCount);
                for (int index = 0; index < CommandsPerThread; ++index) {
                    int const book = (thread + index) % BookCount;
                    auto const command =
                        MakeCounted<TicketCommand>(Ticket{thread, book, numbers[static_cast<std::size_t>(book)]++});
                    command->SetCompletionCallback([&ended] { ++ended; });
                    if (index % 16 == 0) {
                        collection.EnqueueCommandAndWait(command, books[static_cast<std::size_t>(book)]);
                    } else {
                        collection.EnqueueCommand(command, books[static_cast<std::size_t>(book)]);
                    }
                    // Readers go on meanwhile, with lock and without.
                    auto const & read = books[static_cast<std::size_t>((book + 1) % BookCount)];
                    EXPECT_EQ(read->ChapterCount(), 2);
                    EXPECT_TRUE(read->ContainsChapter(paths[1]));
                    read->AcquireReaderLock();
                    EXPECT_TRUE(read->GetNextChapter(read->GetChapterAtIndex(0)));
                    read->ReleaseReaderLock();
                    ++begun;
                }
            });
        }
        // Two of the books close in the middle of it, as a front end closes them.
        while (begun < ThreadCount * CommandsPerThread / 2) {
            std::this_thread::yield();
        }
        builder.CloseBook(books[0]);
        builder.CloseBook(books[3]);
        for (std::thread & thread : threads) {
            thread.join();
        }
        BookBuilder::Rest();

        std::map<std::pair<int, int>, int> next;
        std::map<int, int> counts;
        int told = 0;
        for (auto const & notification : recorder.All<TicketNotification>()) {
            Ticket const & ticket = notification->m_Ticket;
            EXPECT_EQ(notification->GetBookController(),
                      Counted<BookController const>(books[static_cast<std::size_t>(ticket.m_Book)]));
            // None is missing before it: what a closing book refused was the end of what it got.
            int const expected = next[{ticket.m_Thread, ticket.m_Book}]++;
            EXPECT_EQ(ticket.m_Number, expected) << "thread " << ticket.m_Thread << ", book " << ticket.m_Book;
            ++counts[ticket.m_Book];
            ++told;
        }
        EXPECT_EQ(ended, told);
        constexpr int All = ThreadCount * CommandsPerThread / BookCount;
        EXPECT_EQ(counts[1], All);
        EXPECT_EQ(counts[2], All);
        EXPECT_LE(counts[0], All);
        // Each command moved the first of two chapters to the end.
        for (std::size_t index = 0; index < books.size(); ++index) {
            EXPECT_EQ(BookBuilder::Names(*books[index]), counts[static_cast<int>(index)] % 2 == 0 ? "a b" : "b a");
        }
    }
    collection.SetUpdatePageNumbersAutomatically(true);
}

TEST(ConcurrentBooksTest, DocumentsOpenAndCloseInFrontWhileTheirBooksGoOn)
{
    BookCollection & collection = BookCollection::GetInstance();
    {
        BookBuilder builder;
        std::vector<String> paths;
        for (char const * const name : {"a.kvdoc", "b.kvdoc", "c.kvdoc"}) {
            paths.push_back(builder.WriteChapter(name));
        }
        std::vector<Counted<BookController>> const books{builder.NewBook(paths), builder.NewBook(paths)};
        BookBuilder::Rest();
        std::vector<std::thread> threads;
        for (String const & path : paths) {
            threads.emplace_back([&path] {
                for (int round = 0; round < 5; ++round) {
                    OpenDocumentFailedNotification failure(path, true);
                    Counted<DocumentController const> const document =
                        VantraController::GetInstance().OpenDocument(path, failure);
                    ASSERT_TRUE(document) << failure.GetReason();
                    VantraController::GetInstance().EnqueueCommandAndWait(
                        MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
                }
            });
        }
        for (auto const & book : books) {
            threads.emplace_back([&collection, &book] {
                for (int round = 0; round < 10; ++round) {
                    book->UpdateChapters();
                    book->UpdateForegroundChapters();
                    // What a reader may ask for besides, from any thread.
                    Counted<BookController const>(book)->UpdateForegroundChapterStatus();
                    collection.SetPageNumberOptions(book, book->GetChapterAtIndex(round % 3), true, 1);
                }
            });
        }
        for (std::thread & thread : threads) {
            thread.join();
        }
        BookBuilder::Rest();
        for (auto const & book : books) {
            EXPECT_EQ(BookBuilder::Names(*book), "a b c");
            for (int index = 0; index < 3; ++index) {
                // Which of the valid states depends on who has looked last, and what the other book had open then.
                EXPECT_TRUE(book->GetChapterAtIndex(index)->IsValid()) << index;
                EXPECT_FALSE(book->GetDocumentControllerForChapter(book->GetChapterAtIndex(index), true)) << index;
            }
        }
    }
}
