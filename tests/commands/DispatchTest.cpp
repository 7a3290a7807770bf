#include "commands/AddChapterCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/CloseDocumentNotification.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/FileSystem.h"
#include "framework/raster/DynamicBitmap.h"
#include "support/AllocationCounter.h"
#include "support/BookBuilder.h"
#include "support/HeldQueue.h"
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

TEST_F(DispatchTest, HandsInWhatAnEventCallsForAndNothingElse)
{
    auto const other = m_Builder.NewBook({PathOf(1)});
    Counted<DocumentController const> const document = OpenInFront(PathOf(1));
    Counted<DocumentController const> const stranger = OpenInFront(m_Builder.WriteChapter("stranger.kvdoc"));
    Counted<BookChapter const> const first = m_Book->GetChapterAtIndex(0);
    Counted<DocumentController const> const background = m_Book->LoadChapterDocument(first, true, false);
    BookBuilder::Rest();
    m_Collection.SetUIActiveBookController(m_Book);
    Counted<BookController const> const book = m_Book;

    struct Row
    {
        char const * m_Why;
        std::function<void()> m_Post;
        std::vector<std::string> m_ToBook;
        std::vector<std::string> m_ToOther;
    };
    using Names = std::vector<std::string>;
    Names const nothing;
    Names const renumber{"UpdateNumbersCommand"};
    Names const open{"ChapterOpenCommand", "UpdateNumbersCommand"};
    Names const preflight{"PreflightChaptersCommand"};
    Names const saved{"UpdateChapterCommand"};
    for (Row const & row : {
             Row{"topics go up into one book's master", [&] { Post<IndexTopicsChangedNotification>(document); },
                 {"SetMasterIndexCommand"}, nothing},
             Row{"those of a document in no book do not", [&] { Post<IndexTopicsChangedNotification>(stranger); }, nothing,
                 nothing},
             Row{"anchors", [&] { Post<AnchorsChangedNotification>(document, false); }, {"ReconcileAnchorsCommand"},
                 nothing},
             Row{"anchors that were only laid out anew", [&] { Post<AnchorsChangedNotification>(document, true); },
                 nothing, nothing},
             Row{"structure", [&] { Post<DocumentStructureChangedNotification>(document, false); },
                 {"ReconcileAnchorsCommand"}, nothing},
             Row{"structure that was only laid out anew",
                 [&] { Post<DocumentStructureChangedNotification>(document, true); }, nothing, nothing},
             Row{"an opened document reaches all its books", [&] { Post<NewDocumentNotification>(document); }, open, open},
             Row{"pages", [&] { Post<PageStructureChangedNotification>(document); }, renumber, nothing},
             Row{"a new section", [&] { Post<DocumentSectionAddedNotification>(document); }, renumber, nothing},
             Row{"a changed section", [&] { Post<DocumentSectionChangedNotification>(document); }, renumber, nothing},
             Row{"preflight of a document in front", [&] { Post<PreflightResultsUpdatedNotification>(document); },
                 preflight, preflight},
             Row{"preflight of one that only the book has open",
                 [&] { Post<PreflightResultsUpdatedNotification>(background); }, nothing, nothing},
             Row{"a save that left the time alone",
                 [&] { Post<DocumentSaveNotification>(document, DocumentSaveResult()); }, saved, saved},
             Row{"the book's own save of a chapter",
                 [&] { Post<DocumentSaveNotification>(background, DocumentSaveResult()); }, nothing, nothing},
             Row{"the book's structure", [&] { Post<BookStructureChangedNotification>(book, first); }, renumber, nothing},
             Row{"the first spread of a chapter", [&] {
                     Post<DocumentCacheBitmapChangedNotification>(document, document->GetDocument()->GetSpreadAtIndex(0));
                 }, nothing, nothing},
             Row{"something else", [&] {
                     Post<CommandProgressNotification>(book, String("Work"), 0.5f, false);
                 }, nothing, nothing},
         }) {
        for (bool const automatic : {true, false}) {
            m_Collection.SetUpdatePageNumbersAutomatically(automatic);
            HeldQueue held(m_Book);
            HeldQueue heldOther(other);
            row.m_Post();
            // Page numbers stay when nobody wants them to follow by themselves.
            bool const isHeldBack = !automatic && row.m_ToBook == renumber;
            EXPECT_EQ(held.Take(), isHeldBack ? nothing : row.m_ToBook) << row.m_Why;
            EXPECT_EQ(heldOther.Take(), row.m_ToOther) << row.m_Why;
        }
    }
    m_Collection.SetUpdatePageNumbersAutomatically(false);
    m_Collection.SetUIActiveBookController(nullptr);
    m_Book->ReleaseChapterDocument(first, false);
    CloseInFront(stranger);
    CloseInFront(document);
}

TEST_F(DispatchTest, TopicsAndAnchorsOfAChapterAreTheBooksToSave)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(0));
    Post<IndexTopicsChangedNotification>(document);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Book->IsDirty());
    m_Book->SetIsDirty(false);
    Post<AnchorsChangedNotification>(document, false);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Book->IsDirty());
    CloseInFront(document);
}

TEST_F(DispatchTest, WhatAnUpdateItselfProvokesStartsNoOther)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(1));
    m_Collection.SetUpdatePageNumbersAutomatically(true);
    HeldQueue held(m_Book);
    m_Book->SetInIndexUpdate(true);
    m_Book->SetInReconcileAnchors(true);
    m_Book->SetInNumberUpdate(true);
    Post<IndexTopicsChangedNotification>(document);
    Post<AnchorsChangedNotification>(document, false);
    Post<DocumentStructureChangedNotification>(document, false);
    Post<PageStructureChangedNotification>(document);
    Post<DocumentSectionAddedNotification>(document);
    Post<DocumentSectionChangedNotification>(document);
    Post<BookStructureChangedNotification>(Counted<BookController const>(m_Book), nullptr);
    // Delivered when the flags may be down again; it counts that they stood when these were posted.
    m_Book->SetInIndexUpdate(false);
    m_Book->SetInReconcileAnchors(false);
    m_Book->SetInNumberUpdate(false);
    EXPECT_THAT(held.Take(), testing::IsEmpty());
    m_Collection.SetUpdatePageNumbersAutomatically(false);
    CloseInFront(document);
}

TEST_F(DispatchTest, ACloseIsHeardAlsoByABookThatGotTheDocumentMeanwhile)
{
    String const path = m_Builder.WriteChapter("late.kvdoc");
    auto const document = OpenInFront(path);
    auto const closing = MakeCounted<CloseDocumentNotification>(Counted<DocumentController const>(document));
    m_Application.Broadcast(closing);
    BookBuilder::Rest();
    BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(path));
    Counted<BookChapter> const chapter = m_Book->GetChapterFromPath(path);
    NotificationRecorder recorder;
    recorder.Clear();
    closing->Closed(path);
    auto const told = recorder.All<ChapterChangedNotification>();
    ASSERT_FALSE(told.empty());
    EXPECT_THAT(told[0]->GetChapters(), testing::ElementsAre(chapter));
    CloseInFront(document);
}

TEST_F(DispatchTest, AnchorsAreLookedAtOnceMoreBeforeADocumentCloses)
{
    Counted<DocumentController const> const document = OpenInFront(PathOf(0));
    Counted<BookChapter> const chapter = m_Book->GetChapterAtIndex(0);
    chapter->SetAnchorsDirty();
    Post<CloseDocumentNotification>(document);
    BookBuilder::Rest();
    EXPECT_FALSE(chapter->AreAnchorsDirty());
    CloseInFront(document);
}

TEST_F(DispatchTest, ThePreviewFollowsTheFirstSpreadOfTheKeyChapter)
{
    ChapterSketch longer;
    longer.m_Pages = 4;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("key.kvdoc", longer), PathOf(1)});
    Counted<DocumentController const> const key = OpenInFront(book->GetChapterAtIndex(0)->GetPath());
    Counted<DocumentController const> const other = OpenInFront(PathOf(1));
    m_Collection.SetUIActiveBookController(book);
    Counted<Raster::DynamicBitmap const> const before = MakeCounted<Raster::DynamicBitmap>();
    auto const spreadOf = [](Counted<DocumentController const> const & document, int index) {
        return document->GetDocument()->GetSpreadAtIndex(index);
    };
    book->UpdateThumbnail(before);
    Post<DocumentCacheBitmapChangedNotification>(key, spreadOf(key, 1));
    Post<DocumentCacheBitmapChangedNotification>(other, spreadOf(other, 0));
    BookBuilder::Rest();
    EXPECT_EQ(book->GetThumbnail(), before) << "neither another spread nor another chapter";
    Post<DocumentCacheBitmapChangedNotification>(key, spreadOf(key, 0));
    BookBuilder::Rest();
    EXPECT_EQ(book->GetThumbnail(), key->GetDocumentCacheBitmap(0, false));
    EXPECT_NE(book->GetThumbnail(), before);
    m_Collection.SetUIActiveBookController(nullptr);
    CloseInFront(other);
    CloseInFront(key);
}

#ifdef KORVANE_COUNTS_ALLOCATIONS
TEST_F(DispatchTest, AnUnrelatedNotificationCostsNoMemory)
{
    Counted<Kernel::Notification> const first =
        MakeCounted<CommandProgressNotification>(m_Book, String("Work"), 0.5f, false);
    Counted<Kernel::Notification> const second = MakeCounted<CommandFailedNotification>(m_Book, String(), String());
    m_Collection.Notify(first);
    std::uint64_t const before = CountAllocations();
    for (int round = 0; round < 100; ++round) {
        m_Collection.Notify(first);
        m_Collection.Notify(second);
    }
    EXPECT_EQ(CountAllocations(), before);
    ::operator delete(::operator new(1));
    EXPECT_GT(CountAllocations(), before) << "else nothing was counted";
}
#endif

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
    // As after a replacement of a chapter that was gone: there is no first chapter that changed.
    NotificationRecorder recorder;
    Post<BookStructureChangedNotification>(Counted<BookController const>(book), nullptr);
    BookBuilder::Rest();
    EXPECT_TRUE(recorder.All<CommandFailedNotification>().empty());
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
