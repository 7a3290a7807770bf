#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

/// A book of two real chapters at rest, with nothing unsaved: what raises its dirty mark or says something is the event
/// that the test posts.
class DispatchTest : public testing::Test
{
protected:
    DispatchTest()
    {
        m_Collection.SetUpdatePageNumbersAutomatically(false);
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
        BookBuilder::Rest();
        m_Book->SetIsDirty(false);
    }
    ~DispatchTest() override { m_Collection.SetUpdatePageNumbersAutomatically(true); }

    Counted<DocumentController> OpenInFront(String const & path)
    {
        OpenDocumentFailedNotification failure(path, true);
        auto const document = m_Application.OpenDocument(path, failure);
        EXPECT_TRUE(document) << failure.GetReason();
        BookBuilder::Rest();
        m_Book->SetIsDirty(false);
        return document;
    }
    void CloseInFront(Counted<DocumentController const> const & document)
    {
        m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        BookBuilder::Rest();
    }
    template <typename T, typename... TArguments>
    void Post(TArguments &&... arguments)
    {
        m_Application.Broadcast(MakeCounted<T>(std::forward<TArguments>(arguments)...));
    }
    [[nodiscard]] String PathOf(int index) { return m_Book->GetChapterAtIndex(index)->GetPath(); }

    VantraController & m_Application = VantraController::GetInstance();
    BookCollection & m_Collection = BookCollection::GetInstance();
    BookBuilder m_Builder;
    Counted<BookController> m_Book;
};

}

TEST_F(DispatchTest, TopicsOfAChapterGoUpIntoTheMasterUnlessTheBookItselfIsAtWork)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(0));
    m_Book->SetInIndexUpdate(true);
    Post<IndexTopicsChangedNotification>(document);
    m_Book->SetInIndexUpdate(false);
    // The flag is down again when this one is delivered; it counts that it stood when it was posted.
    BookBuilder::Rest();
    EXPECT_FALSE(m_Book->IsDirty());
    Post<IndexTopicsChangedNotification>(document);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Book->IsDirty());
    CloseInFront(document);
}

TEST_F(DispatchTest, AnchorsReachTheBookUnlessOnlyTheLayoutChanged)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(0));
    Post<AnchorsChangedNotification>(document, true);
    Post<DocumentStructureChangedNotification>(document, true);
    m_Book->SetInReconcileAnchors(true);
    Post<AnchorsChangedNotification>(document, false);
    m_Book->SetInReconcileAnchors(false);
    BookBuilder::Rest();
    EXPECT_FALSE(m_Book->IsDirty());
    Post<DocumentStructureChangedNotification>(document, false);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Book->IsDirty());
    CloseInFront(document);
}

TEST_F(DispatchTest, OpeningAChapterReachesEveryBookThatHasIt)
{
    auto const second = m_Builder.NewBook({PathOf(1)});
    auto const stranger = m_Builder.NewBook({m_Builder.WriteChapter("x.kvdoc")});
    BookBuilder::Rest();
    auto const document = OpenInFront(PathOf(1));
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::OpenForEdit);
    EXPECT_EQ(second->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::OpenForEdit);
    EXPECT_EQ(stranger->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::Ok);
    CloseInFront(document);
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::Ok);
    EXPECT_EQ(second->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::Ok);
}

TEST_F(DispatchTest, ASaveInFrontMovesTheTimeAndThePages)
{
    auto const document = OpenInFront(PathOf(0));
    auto const command = MakeCounted<ModifySectionCommand>(0u);
    command->SetStartNumberingAt(41);
    m_Application.EnqueueCommandAndWait(command, document, true);
    EXPECT_TRUE(document->IsDirty());
    m_Book->SaveOpenChapters();
    BookBuilder::Rest();
    EXPECT_EQ(m_Book->GetChapterAtIndex(0)->DescribePages(), "41 - 41");
    EXPECT_FALSE(m_Book->GetChapterAtIndex(0)->WouldUpdateTimeStamp());
    EXPECT_TRUE(m_Book->IsDirty());
    CloseInFront(document);
}

TEST_F(DispatchTest, AFileThatChangedWhileItWasOpenSetsOffAFullPass)
{
    auto const document = OpenInFront(PathOf(0));
    ChapterSketch longer;
    longer.m_Pages = 3;
    m_Builder.WriteChapter("b.kvdoc", longer);
    // Nobody told the book about its second chapter; the pass that the close sets off finds it.
    std::filesystem::path const file = PathOf(0).ToStd();
    std::filesystem::last_write_time(file, std::filesystem::last_write_time(file) + std::chrono::hours(1));
    CloseInFront(document);
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->DescribePages(), "1 - 3");
    EXPECT_EQ(m_Book->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::Ok);
}

TEST_F(DispatchTest, TextChangesAreLookedAtInTheForegroundOnly)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(0));
    ChapterSketch longer;
    longer.m_Pages = 3;
    m_Builder.WriteChapter("b.kvdoc", longer);
    NotificationRecorder recorder;
    Post<StoryChangedNotification>(document, true);
    EXPECT_TRUE(recorder.BookNames().empty());
    Post<StoryChangedNotification>(document, false);
    EXPECT_THAT(recorder.BookNames(), testing::ElementsAre("ChapterChangedNotification")) << "one pass has run";
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->DescribePages(), "1 - 1") << "a closed chapter is not opened for it";
    CloseInFront(document);
}

TEST_F(DispatchTest, AnUnrelatedSaveLooksAfterEstrangedChapters)
{
    String const path = m_Builder.WriteChapter("x.kvdoc");
    auto const document = OpenInFront(path);
    NotificationRecorder recorder;
    Post<DocumentSaveNotification>(Counted<DocumentController const>(document), DocumentSaveResult());
    EXPECT_TRUE(recorder.BookNames().empty());
    m_Book->GetChapterAtIndex(1)->SetStatus(BookChapter::Status::OpenForEdit);
    Post<DocumentSaveNotification>(Counted<DocumentController const>(document), DocumentSaveResult());
    EXPECT_THAT(recorder.BookNames(), testing::ElementsAre("ChapterChangedNotification"));
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::Ok);
    CloseInFront(document);
}

TEST_F(DispatchTest, StructureChangesRenumberOnlyWhereUpdatesAreAutomatic)
{
    ChapterSketch longer;
    longer.m_Pages = 4;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("x.kvdoc", longer), m_Builder.WriteChapter("y.kvdoc")});
    BookBuilder::Rest();
    EXPECT_EQ(book->GetChapterAtIndex(1)->DescribePages(), "1 - 1");
    m_Collection.SetUpdatePageNumbersAutomatically(true);
    Post<BookStructureChangedNotification>(Counted<BookController const>(book),
                                           Counted<BookChapter const>(book->GetChapterAtIndex(0)));
    BookBuilder::Rest();
    EXPECT_EQ(book->GetChapterAtIndex(1)->DescribePages(), "5 - 5");
}

TEST_F(DispatchTest, PageNumberOptionsAreStoredAlsoWithoutAutomaticUpdates)
{
    Counted<BookChapter const> const chapter = m_Book->GetChapterAtIndex(1);
    m_Collection.SetPageNumberOptions(m_Book, chapter, false, 12);
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStartFromPage(), 12);
    EXPECT_EQ(chapter->DescribePages(), "1 - 1");
    m_Collection.SetUpdatePageNumbersAutomatically(true);
    m_Collection.SetPageNumberOptions(m_Book, chapter, false, 12);
    BookBuilder::Rest();
    EXPECT_EQ(chapter->DescribePages(), "12 - 12");
}
