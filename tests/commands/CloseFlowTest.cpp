#include "commands/CloseBookCommand.h"
#include "commands/LoadBookCommand.h"
#include "commands/SaveBookAsCommand.h"
#include "commands/SaveBookCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "core/BookSavedNotification.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/DiskFault.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <cerrno>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

/// The part of a front end: closes a book that was saved for that, and drops one that has closed.
class FrontEnd final : public BroadcastNotificationSink
{
public:
    FrontEnd() { BroadcastNotification::RegisterBroadcastSink(this); }
    ~FrontEnd() override { BroadcastNotification::UnregisterBroadcastSink(this); }

    void Notify(Counted<Kernel::Notification> notification) override
    {
        if (auto const saved = Kernel::CountedCast<BookSavedNotification>(notification)) {
            if (saved->IsCloseOnSuccess() && saved->GetResult().IsSuccess()) {
                VantraController::GetInstance().EnqueueCommand(MakeCounted<CloseBookCommand>(saved->GetBookController()));
            }
        } else if (auto const closed = Kernel::CountedCast<BookClosedNotification>(notification)) {
            BookCollection::GetInstance().RemoveBookController(closed->GetBookController());
        }
    }
};

/// A saved book of two chapters, the first of which the user has open.
class CloseFlowTest : public testing::Test
{
protected:
    CloseFlowTest()
    {
        m_Collection.SetUpdatePageNumbersAutomatically(false);
        m_Path = m_Builder.GetFolder() / "book.kvbook";
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
        BookBuilder::Run(m_Book, MakeCounted<SaveBookAsCommand>(m_Path, false));
        String const path = m_Book->GetChapterAtIndex(0)->GetPath();
        OpenDocumentFailedNotification failure(path, true);
        m_Document = m_Application.OpenDocument(path, failure);
        BookBuilder::Rest();
    }
    ~CloseFlowTest() override
    {
        m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(m_Document, nullptr, false, false));
        m_Collection.SetUpdatePageNumbersAutomatically(true);
    }
    void EditDocument()
    {
        auto const command = MakeCounted<ModifySectionCommand>(0u);
        command->SetStartNumberingAt(7);
        ASSERT_TRUE(m_Application.EnqueueCommandAndWait(command, m_Document, true));
        ASSERT_TRUE(m_Document->IsDirty());
    }
    [[nodiscard]] bool IsOpen() const { return static_cast<bool>(m_Collection.GetMutableBookController(m_Book)); }

    VantraController & m_Application = VantraController::GetInstance();
    BookCollection & m_Collection = BookCollection::GetInstance();
    BookBuilder m_Builder;
    String m_Path;
    Counted<BookController> m_Book;
    Counted<DocumentController> m_Document;
};

}

TEST_F(CloseFlowTest, TheUsersWorkIsSettledThenTheBookIsSavedClosedAndDropped)
{
    FrontEnd const frontEnd;
    EXPECT_TRUE(m_Book->CanCloseOpenChapters());
    EXPECT_FALSE(m_Book->CanSaveOpenChapters());
    EditDocument();
    EXPECT_TRUE(m_Book->CanSaveOpenChapters());
    m_Book->SaveOpenChapters();
    BookBuilder::Rest();
    EXPECT_FALSE(m_Book->CanSaveOpenChapters());
    EXPECT_FALSE(m_Document->IsDirty());
    EXPECT_TRUE(m_Book->CanSave()) << "the save of the chapter has changed what the book knows of it";

    NotificationRecorder recorder;
    m_Collection.EnqueueCommand(MakeCounted<SaveBookCommand>(true), m_Book);
    EXPECT_THAT(recorder.BookNames(), ElementsAre("BookChangedNotification", "BookSavedNotification",
                                                  "BookClosedNotification", "BookChapterInclusionChangedNotification"));
    EXPECT_FALSE(m_Book->IsDirty());
    EXPECT_FALSE(IsOpen());
    auto const left = recorder.All<BookChapterInclusionChangedNotification>();
    ASSERT_EQ(left.size(), 1u);
    EXPECT_THAT(left[0]->GetDocuments(), ElementsAre(m_Document));

    // The document stays the user's, and belongs to no book any more.
    EXPECT_TRUE(m_Application.IsActiveDocumentController(m_Document));
    EXPECT_FALSE(m_Collection.IsInBook(Counted<DocumentController const>(m_Document)));
    Counted<BookChapter const> const chapter = m_Book->GetChapterAtIndex(1);
    int const start = chapter->GetStartFromPage();
    recorder.Clear();
    m_Collection.EnqueueCommand(MakeCounted<UpdateChapterSettingsCommand>(chapter, false, start + 1), m_Book);
    EXPECT_THAT(recorder.BookNames(), testing::IsEmpty());
    EXPECT_EQ(chapter->GetStartFromPage(), start) << "a book that was dropped can't be touched";

    // What was saved is there when the book is opened again, and the open document is told that it is in a book.
    auto const again = m_Builder.LoadBook(m_Path);
    ASSERT_TRUE(again);
    EXPECT_THAT(recorder.BookNames(),
                ElementsAre("NewBookNotification", "BookChapterInclusionChangedNotification"));
    EXPECT_EQ(again->GetChapterAtIndex(0)->DescribePages(), "7 - 7");
}

TEST_F(CloseFlowTest, ABookThatCouldNotBeSavedStaysOpen)
{
    FrontEnd const frontEnd;
    m_Book->SetIsDirty(true);
    NotificationRecorder recorder;
    {
        Kernel::DiskFaultFromNth const full(Kernel::DiskOperation::Write, 1, ENOSPC);
        BookBuilder::Run(m_Book, MakeCounted<SaveBookCommand>(true));
    }
    EXPECT_THAT(recorder.BookNames(), ElementsAre("BookChangedNotification", "BookSavedNotification"));
    EXPECT_TRUE(IsOpen());
    EXPECT_TRUE(m_Book->IsDirty());
    EXPECT_FALSE(m_Book->IsCommandEnqueueDisabled());
}

TEST_F(CloseFlowTest, ACloseRunsWhatTheQueueHadAcceptedAndRefusesTheRest)
{
    FrontEnd const frontEnd;
    Counted<BookChapter const> const chapter = m_Book->GetChapterAtIndex(1);
    int run = 0;
    for (int start = 1; start <= 20; ++start) {
        auto const command = MakeCounted<UpdateChapterSettingsCommand>(chapter, false, start);
        command->SetCompletionCallback([&run] { ++run; });
        m_Collection.EnqueueCommand(command, m_Book);
    }
    m_Application.EnqueueCommandAndWait(MakeCounted<CloseBookCommand>(m_Book));
    m_Collection.EnqueueCommand(MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 99), m_Book);
    BookBuilder::Rest();
    EXPECT_EQ(run, 20);
    EXPECT_EQ(chapter->GetStartFromPage(), 20);
    EXPECT_FALSE(IsOpen());
}
