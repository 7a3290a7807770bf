#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/SaveBookAsCommand.h"
#include "commands/SaveBookCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "core/BookSavedNotification.h"
#include "core/ChapterFileNotifications.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

class BookLifeTest : public testing::Test
{
protected:
    BookLifeTest() { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    ~BookLifeTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    BookBuilder m_Builder;
    NotificationRecorder m_Recorder;
};

}

TEST_F(BookLifeTest, ANewBookIsSavedClosedAndOpenedAgain)
{
    String const path = m_Builder.GetFolder() / "book.kvbook";
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
    EXPECT_EQ(m_Recorder.Names().front(), "NewBookNotification");
    m_Recorder.Clear();

    BookBuilder::Run(book, MakeCounted<SaveBookAsCommand>(path, true));
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookSavedNotification"));
    auto const saved = m_Recorder.All<BookSavedNotification>();
    ASSERT_EQ(saved.size(), 1u);
    EXPECT_TRUE(saved[0]->GetResult().IsSuccess()) << saved[0]->GetResult().GetText();
    EXPECT_EQ(saved[0]->GetPath(), path);
    EXPECT_TRUE(saved[0]->IsCloseOnSuccess());
    EXPECT_FALSE(book->CanSave());
    m_Recorder.Clear();

    m_Builder.CloseBook(book);
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookClosedNotification"));
    EXPECT_EQ(BookCollection::GetInstance().GetBookFromPath(path), nullptr);
    m_Recorder.Clear();

    auto const again = m_Builder.LoadBook(path);
    ASSERT_TRUE(again);
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("NewBookNotification"));
    EXPECT_EQ(BookBuilder::Names(*again), "a b");
    EXPECT_EQ(BookCollection::GetInstance().GetBookFromPath(path), Counted<BookController const>(again));
}

TEST_F(BookLifeTest, ASaveThatFailsIsToldLikeAnyOther)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc")});
    m_Recorder.Clear();
    BookBuilder::Run(book, MakeCounted<SaveBookAsCommand>(m_Builder.GetFolder() / "missing/book.kvbook", false));
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookSavedNotification"));
    auto const saved = m_Recorder.All<BookSavedNotification>();
    EXPECT_FALSE(saved[0]->GetResult().IsSuccess());
    EXPECT_FALSE(saved[0]->IsCloseOnSuccess());
    EXPECT_TRUE(book->IsDirty());
}

TEST_F(BookLifeTest, AFileThatIsNoBookLeavesNothingButTheReason)
{
    String const path = m_Builder.GetFolder().WriteFile("text.kvbook", "no book");
    int const before = BookCollection::GetInstance().GetNumberOfActiveBookControllers();
    LoadBookCommand & command = *new LoadBookCommand(path);
    Counted<LoadBookCommand> const held(&command);
    VantraController::GetInstance().EnqueueCommand(held);
    EXPECT_EQ(held->GetBookController(), nullptr);
    ASSERT_TRUE(held->GetResult());
    EXPECT_NE(held->GetResult()->GetResult(), 0);
    EXPECT_THAT(m_Recorder.Names(), ElementsAre("OpenDocumentFailedNotification"));
    EXPECT_EQ(BookCollection::GetInstance().GetNumberOfActiveBookControllers(), before);
    EXPECT_EQ(VantraController::GetInstance().GetLoadingItems(), 0);
}

TEST_F(BookLifeTest, ABookWithMissingChaptersAsksForThem)
{
    String const path = m_Builder.GetFolder() / "book.kvbook";
    String const gone = m_Builder.WriteChapter("gone.kvdoc");
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), gone});
    BookBuilder::Run(book, MakeCounted<SaveBookAsCommand>(path, false));
    m_Builder.CloseBook(book);
    BookBuilder::Rest();
    Kernel::FileSystem::Delete(gone, 0);
    m_Recorder.Clear();

    ASSERT_TRUE(m_Builder.LoadBook(path));
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("PromptMissingChapterFileNotification", "NewBookNotification"));
    auto const prompts = m_Recorder.All<PromptMissingChapterFileNotification const>();
    ASSERT_EQ(prompts.size(), 1u);
    EXPECT_EQ(prompts[0]->GetDefaultChoice(), PromptNo);
    prompts[0]->Answer(PromptYes);
    auto const dialogues = m_Recorder.All<LocateMissingChapterFileNotification const>();
    ASSERT_EQ(dialogues.size(), 1u);
    EXPECT_EQ(dialogues[0]->GetCurrentPath(), gone);
    String const moved = m_Builder.WriteChapter("found.kvdoc");
    dialogues[0]->ProcessResponse(moved);
    BookBuilder::Rest();
    auto const again = BookCollection::GetInstance().GetBookFromPath(path);
    EXPECT_TRUE(again->ContainsChapter(moved));
    EXPECT_FALSE(again->ContainsChapter(gone));
    EXPECT_EQ(again->GetChapterFromPath(moved)->DescribePages(), "1 - 1");
}
