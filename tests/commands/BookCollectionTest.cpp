#include "core/BookCollection.h"
#include "commands/BookCommand.h"
#include "commands/EngageBookLockCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookNotification.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentSettings.h"
#include "framework/document/VantraController.h"
#include "framework/story/StoryBuilder.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gtest/gtest.h>

#include <atomic>
#include <barrier>
#include <string>
#include <thread>
#include <vector>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class BookCollectionTest : public testing::Test
{
protected:
    BookCollectionTest() { m_Collection.SetUpdatePageNumbersAutomatically(false); }
    ~BookCollectionTest() override { m_Collection.SetUpdatePageNumbersAutomatically(true); }

    BookCollection & m_Collection = BookCollection::GetInstance();
    BookBuilder m_Builder;
};

}

TEST_F(BookCollectionTest, RegistersABookOnceAndForgetsItWhole)
{
    auto const book = MakeCounted<BookController>();
    book->SetPath("/books/one.kvbook");
    int const before = m_Collection.GetNumberOfActiveBookControllers();
    m_Collection.AddBookController(book);
    m_Collection.AddBookController(book);
    EXPECT_EQ(m_Collection.GetNumberOfActiveBookControllers(), before + 1);
    EXPECT_EQ(m_Collection.GetActiveBookController(before), Counted<BookController const>(book));
    EXPECT_EQ(m_Collection.GetActiveBookController(-1), nullptr);
    EXPECT_EQ(m_Collection.GetActiveBookController(before + 1), nullptr);
    EXPECT_EQ(m_Collection.GetMutableBookController(book), book);
    EXPECT_EQ(m_Collection.GetBookFromPath("/books/one.kvbook"), Counted<BookController const>(book));
    EXPECT_EQ(m_Collection.GetBookFromPath("/books/ONE.kvbook"), nullptr);
    m_Collection.SetUIActiveBookController(book);
    m_Collection.RemoveBookController(book);
    EXPECT_EQ(m_Collection.GetMutableBookController(book), nullptr);
    EXPECT_EQ(m_Collection.GetNumberOfActiveBookControllers(), before);
    book->AddChapter("/nowhere/a.kvdoc", -1);
    EXPECT_FALSE(m_Collection.IsInBook(String("/nowhere/a.kvdoc"))) << "nor is it in front any more";
    EXPECT_FALSE(m_Collection.UpdateChapter(book, String("/nowhere/a.kvdoc")));
    m_Collection.EnqueueCommand(MakeCounted<EngageBookLockCommand>(true), book);
}

TEST_F(BookCollectionTest, ADocumentBelongsToTheBookInFrontOrTheLastCommandedOne)
{
    String const path = m_Builder.WriteChapter("a.kvdoc");
    auto const first = m_Builder.NewBook({path});
    auto const second = m_Builder.NewBook({path});
    OpenDocumentFailedNotification failure(path, true);
    Counted<DocumentController const> const document = VantraController::GetInstance().OpenDocument(path, failure);
    ASSERT_TRUE(document);
    BookBuilder::Rest();

    BookBuilder::Run(first, MakeCounted<EngageBookLockCommand>(false));
    EXPECT_EQ(m_Collection.GetBookFromDocument(document), Counted<BookController const>(first));
    m_Collection.SetUIActiveBookController(second);
    EXPECT_EQ(m_Collection.GetBookFromDocument(document), Counted<BookController const>(second));
    EXPECT_TRUE(m_Collection.IsInBook(document));
    EXPECT_EQ(m_Collection.GetBookFromDocument(nullptr), nullptr);

    // A book command that somebody meant for the document runs on that book.
    Counted<BookChapter const> const chapter = second->GetChapterAtIndex(0);
    EXPECT_TRUE(m_Collection.HandleCommand(document, MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 17)));
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStartFromPage(), 17);

    m_Collection.SetPasswordForGuid("guid", "secret", document);
    EXPECT_EQ(m_Collection.GetPasswordForGuid("guid", document), "secret");
    EXPECT_EQ(first->GetChapterAtIndex(0)->GetPassword("guid"), "");
    m_Collection.SetUIActiveBookController(nullptr);
    VantraController::GetInstance().EnqueueCommandAndWait(
        MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
}

TEST_F(BookCollectionTest, ABookStaysInFrontWhoeverElseCloses)
{
    auto const document = DocumentController::CreateDocument({}, Story::StoryBuilder().Finish());
    DocumentSaveResult saved;
    document->SaveDocument(saved, m_Builder.GetFolder() / "a.kvdoc");
    document->ShutDownArchive();
    auto const stays = m_Builder.NewBook();
    auto const rival = m_Builder.NewBook();
    auto const goes = m_Builder.NewBook();
    stays->AddChapter(document->GetPath(), -1);
    rival->AddChapter(document->GetPath(), -1);

    // One thread of a front end has two books in front in turn, another closes and opens one of them all the while.
    constexpr int Rounds = 50000;
    std::barrier start(2);
    std::atomic<bool> stop{false};
    int lost = 0;
    std::thread front([&] {
        start.arrive_and_wait();
        for (int round = 0; round < Rounds; ++round) {
            m_Collection.SetUIActiveBookController(goes);
            m_Collection.SetUIActiveBookController(stays);
            lost += m_Collection.GetBookFromDocument(document) == stays ? 0 : 1;
        }
        stop = true;
    });
    start.arrive_and_wait();
    while (!stop) {
        m_Collection.RemoveBookController(goes);
        m_Collection.AddBookController(goes);
    }
    front.join();
    EXPECT_EQ(lost, 0);
    m_Collection.SetUIActiveBookController(nullptr);
    EXPECT_EQ(m_Collection.GetBookFromDocument(document), Counted<BookController const>(rival));
}

TEST_F(BookCollectionTest, TellsWhichBookIsCurrentAndStoresNothing)
{
    auto const book = m_Builder.NewBook();
    book->SetPath("/books/current.kvbook");
    NotificationRecorder recorder;
    m_Collection.SetActiveBookController("/books/none.kvbook");
    m_Collection.SetActiveBookController("/books/current.kvbook");
    auto const told = recorder.All<CurrentBookChangedNotification>();
    ASSERT_EQ(told.size(), 1u);
    EXPECT_EQ(told[0]->GetBookController(), Counted<BookController const>(book));
}

TEST_F(BookCollectionTest, AClosedBookTakesNoCommands)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc")});
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    m_Collection.DisableCommandEnqueueAndEmpty(book);
    m_Collection.EnqueueCommand(MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 17), book);
    BookBuilder::Rest();
    EXPECT_NE(chapter->GetStartFromPage(), 17);
}

TEST_F(BookCollectionTest, WaitingForACommandEndsAlsoIfNobodyWillRunIt)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc")});
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    int ended = 0;
    auto const set = [&](int start) {
        auto const command = MakeCounted<UpdateChapterSettingsCommand>(chapter, false, start);
        command->SetCompletionCallback([&ended] { ++ended; });
        m_Collection.EnqueueCommandAndWait(command, book);
    };
    set(3);
    EXPECT_EQ(chapter->GetStartFromPage(), 3);
    EXPECT_EQ(ended, 1) << "the caller's own callback has run by then";
    m_Collection.DisableCommandEnqueueAndEmpty(book);
    set(4);
    m_Builder.CloseBook(book);
    set(5);
    EXPECT_EQ(chapter->GetStartFromPage(), 3) << "refused, and then dropped";
    EXPECT_EQ(ended, 1);
}

namespace
{

/// Waits for a command of a book, this one's own or another, in the middle of its turn.
class AskingCommand final : public BookCommand
{
public:
    AskingCommand(Counted<BookController const> book, Counted<BookCommand> asked)
        : m_Book(std::move(book)),
          m_Asked(std::move(asked))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {"Ask", "Test command"}; }
    void Do() override { BookCollection::GetInstance().EnqueueCommandAndWait(m_Asked, m_Book); }

private:
    Counted<BookController const> const m_Book;
    Counted<BookCommand> const m_Asked;
};

}

TEST_F(BookCollectionTest, BooksThatWaitForEachOtherDoNotWaitForEver)
{
    String const path = m_Builder.WriteChapter("a.kvdoc");
    auto const first = m_Builder.NewBook({path});
    auto const second = m_Builder.NewBook({path});
    Counted<BookChapter const> const chapter = first->GetChapterAtIndex(0);
    // First asks second, whose command asks first again: that one runs in the turn that waits.
    auto const innermost = MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 11);
    auto const back = MakeCounted<AskingCommand>(first, innermost);
    BookBuilder::Run(first, MakeCounted<AskingCommand>(second, back));
    EXPECT_EQ(chapter->GetStartFromPage(), 11);
    BookBuilder::Run(first, MakeCounted<AskingCommand>(
                                first, MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 12)));
    EXPECT_EQ(chapter->GetStartFromPage(), 12) << "nor does a book that waits for itself";
}

TEST_F(BookCollectionTest, HoldsAThousandBooks)
{
    std::vector<Counted<BookController>> books;
    int const before = m_Collection.GetNumberOfActiveBookControllers();
    for (int index = 0; index < 1000; ++index) {
        auto const book = m_Builder.NewBook();
        book->SetPath("/books/" + std::to_string(index) + ".kvbook");
        books.push_back(book);
    }
    EXPECT_EQ(m_Collection.GetNumberOfActiveBookControllers(), before + 1000);
    EXPECT_EQ(m_Collection.GetBookFromPath("/books/777.kvbook"), Counted<BookController const>(books[777]));
    for (auto const & book : books) {
        m_Collection.EnqueueCommand(MakeCounted<EngageBookLockCommand>(false), book);
    }
    for (auto const & book : books) {
        m_Builder.CloseBook(book);
    }
    EXPECT_EQ(m_Collection.GetNumberOfActiveBookControllers(), before);
}
