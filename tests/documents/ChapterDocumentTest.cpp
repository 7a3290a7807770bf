#include "commands/PreflightChaptersCommand.h"
#include "core/BookCollection.h"
#include "documents/ChapterMarshall.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentSaveResult.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileLock.h"
#include "framework/kernel/FileSystem.h"
#include "support/BookBuilder.h"

#include <gtest/gtest.h>

#include <thread>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class ChapterDocumentTest : public testing::Test
{
protected:
    ChapterDocumentTest() { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    ~ChapterDocumentTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    /// A book of that many chapters, one page each.
    Counted<BookController> MakeBook(int chapters)
    {
        std::vector<String> paths;
        for (int index = 0; index < chapters; ++index) {
            paths.push_back(m_Builder.WriteChapter(std::string(1, static_cast<char>('a' + index)) + ".kvdoc"));
        }
        auto const book = m_Builder.NewBook(paths);
        BookBuilder::Rest();
        return book;
    }
    static Counted<DocumentController> OpenInFront(String const & path)
    {
        OpenDocumentFailedNotification failure(path, true);
        auto const document = m_Application.OpenDocument(path, failure);
        EXPECT_TRUE(document) << failure.GetReason();
        BookBuilder::Rest();
        return document;
    }
    static void CloseInFront(Counted<DocumentController const> const & document)
    {
        m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        BookBuilder::Rest();
    }

    static inline VantraController & m_Application = VantraController::GetInstance();
    BookBuilder m_Builder;
};

using BackgroundDocumentTest = ChapterDocumentTest;
using ForegroundDocumentTest = ChapterDocumentTest;
using ChapterMarshallTest = ChapterDocumentTest;

}

TEST_F(BackgroundDocumentTest, TwoLoadsNeedTwoReleases)
{
    auto const book = MakeBook(1);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    auto const first = book->LoadChapterDocument(chapter, true, false);
    ASSERT_TRUE(first);
    EXPECT_EQ(book->LoadChapterDocument(chapter, true, false), first);
    EXPECT_FALSE(first->GetWantNotifications());
    EXPECT_FALSE(first->GetCanShowProgress());
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(chapter->GetPath()), nullptr);
    EXPECT_TRUE(book->IsThisChapterThisDocument(chapter, first));
    EXPECT_EQ(book->GetChapterFromDocumentController(first), book->GetChapterAtIndex(0));

    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, false));
    EXPECT_EQ(book->GetDocumentControllerForChapter(chapter, false), first) << "one use is left";
    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, false));
    EXPECT_EQ(book->GetDocumentControllerForChapter(chapter, false), nullptr);
    EXPECT_FALSE(book->ReleaseChapterDocument(chapter, false));
    BookBuilder::Rest();
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
    EXPECT_FALSE(chapter->IsInClose({}));
}

TEST_F(BackgroundDocumentTest, ALoadRightBehindAReleaseOpensTheFileAfresh)
{
    auto const book = MakeBook(1);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    for (int round = 0; round < 20; ++round) {
        auto const document = book->LoadChapterDocument(chapter, false, false);
        ASSERT_TRUE(document) << round;
        book->ReleaseChapterDocument(chapter, false);
        auto const next = book->LoadChapterDocument(chapter, false, false);
        ASSERT_TRUE(next) << round;
        EXPECT_NE(next, document) << round;
        EXPECT_TRUE(next->IsAbleToRunCommands());
        book->ReleaseChapterDocument(chapter, false);
    }
}

TEST_F(BackgroundDocumentTest, ManyThreadsShareOneChapter)
{
    auto const book = MakeBook(2);
    std::vector<std::thread> threads;
    std::atomic<int> failures{0};
    for (int number = 0; number < 4; ++number) {
        threads.emplace_back([&, number] {
            Counted<BookChapter const> const chapter = book->GetChapterAtIndex(number % 2);
            for (int round = 0; round < 30; ++round) {
                auto const document = book->LoadChapterDocument(chapter, false, false);
                if (!document || document->GetDocument()->GetPageCount() != 1) {
                    ++failures;
                }
                book->ReleaseChapterDocument(chapter, false);
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    BookBuilder::Rest();
    EXPECT_EQ(failures, 0);
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(BackgroundDocumentTest, WhatAPassChangedIsSavedByTheLastRelease)
{
    auto const book = MakeBook(1);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    auto const document = book->LoadChapterDocument(chapter, true, false);
    ASSERT_TRUE(document);
    auto const command = MakeCounted<ModifySectionCommand>(0u);
    command->SetStartNumberingAt(31);
    m_Application.EnqueueCommandAndWait(command, document, false);
    ASSERT_TRUE(document->IsDirty());
    book->ReleaseChapterDocument(chapter, true);
    BookBuilder::Rest();
    EXPECT_FALSE(chapter->WouldUpdateTimeStamp()) << "the file counts as looked at";

    auto const again = book->LoadChapterDocument(chapter, true, false);
    ASSERT_TRUE(again);
    EXPECT_EQ(again->GetDocument()->GetSection(0)->GetStartNumberingAt(), 31u);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok);
    book->ReleaseChapterDocument(chapter, false);
}

TEST_F(BackgroundDocumentTest, AFailedLoadSaysWhyInTheStatus)
{
    auto const book = MakeBook(3);
    Counted<BookChapter const> const missing = book->GetChapterAtIndex(0);
    Counted<BookChapter const> const damaged = book->GetChapterAtIndex(1);
    Counted<BookChapter const> const locked = book->GetChapterAtIndex(2);
    Kernel::FileSystem::Delete(missing->GetPath(), 0);
    m_Builder.GetFolder().WriteFile("b.kvdoc", "damaged");
    Kernel::FileLock::Result lockResult{};
    auto const lock = Kernel::FileLock::Acquire(locked->GetPath(), Kernel::FileLock::Kind::Exclusive, lockResult);
    ASSERT_TRUE(lock);

    EXPECT_EQ(book->LoadChapterDocument(missing, true, false), nullptr);
    EXPECT_EQ(missing->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(book->LoadChapterDocument(damaged, true, false), nullptr);
    EXPECT_EQ(damaged->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(book->LoadChapterDocument(locked, true, false), nullptr);
    EXPECT_EQ(locked->GetStatus(), BookChapter::Status::Locked);
    EXPECT_EQ(m_Application.GetLoadingItems(), 0);
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(BackgroundDocumentTest, AFileThatChangedBehindTheBookIsOutOfDate)
{
    auto const book = MakeBook(1);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    ChapterSketch longer;
    longer.m_Pages = 4;
    m_Builder.WriteChapter("a.kvdoc", longer);
    ASSERT_TRUE(book->LoadChapterDocument(chapter, true, false));
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::OutOfDate);
    book->ReleaseChapterDocument(chapter, false);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::OutOfDate) << "nobody has looked at it";
    ASSERT_TRUE(book->LoadChapterDocument(chapter, true, false));
    book->ReleaseChapterDocument(chapter, true);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok);
}

TEST_F(BackgroundDocumentTest, OnlyTheStatusPassIsLetIntoARestrictedChapter)
{
    ChapterSketch restricted;
    restricted.m_Restricted = true;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", restricted)});
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Restricted);
    EXPECT_EQ(chapter->DescribePages(), "1 - 1") << "adding it has read it";
    EXPECT_EQ(book->LoadChapterDocument(chapter, true, false), nullptr);
    EXPECT_TRUE(book->LoadChapterDocument(chapter, false, true));
    book->ReleaseChapterDocument(chapter, false);
}

TEST_F(ForegroundDocumentTest, TheBookBorrowsTheUsersDocument)
{
    auto const book = MakeBook(2);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(1);
    EXPECT_FALSE(book->CanCloseOpenChapters());
    auto const document = OpenInFront(chapter->GetPath());
    EXPECT_TRUE(book->IsForegroundChapter(chapter));
    EXPECT_TRUE(book->CanCloseOpenChapters());
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::OpenForEdit);
    std::vector<std::pair<int, String>> open;
    book->GetForegroundChapters(open);
    ASSERT_EQ(open.size(), 1u);
    EXPECT_EQ(open[0].first, 1);
    EXPECT_EQ(open[0].second, "b");

    EXPECT_EQ(book->LoadChapterDocument(chapter, true, false), document);
    EXPECT_FALSE(document->GetCanShowProgress());
    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, true));
    EXPECT_TRUE(document->GetCanShowProgress()) << "the user's document shows its progress again";
    EXPECT_EQ(book->GetDocumentControllerForChapter(chapter, false), nullptr);
    EXPECT_EQ(book->GetDocumentControllerForChapter(chapter, true), document);
    EXPECT_TRUE(m_Application.IsPurelyForegroundController(document));
    CloseInFront(document);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok);
}

TEST_F(ForegroundDocumentTest, WhatTheUserSavesElsewhereStaysTheChaptersWhileItIsInUse)
{
    auto const book = MakeBook(1);
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(0);
    auto const document = OpenInFront(chapter->GetPath());
    ASSERT_EQ(book->LoadChapterDocument(chapter, false, false), document);
    DocumentSaveResult saved;
    document->AcquireWriterLock();
    document->SaveDocument(saved, m_Builder.GetFolder() / "elsewhere.kvdoc");
    document->ReleaseWriterLock();
    ASSERT_TRUE(saved.IsSuccess()) << saved.GetText();

    EXPECT_EQ(book->LoadChapterDocument(chapter, false, false), document) << "two would be at work for one chapter";
    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, false));
    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, false));
    EXPECT_TRUE(m_Application.IsPurelyForegroundController(document));
    EXPECT_EQ(book->GetDocumentControllerForChapter(chapter, false), nullptr);
    auto const own = book->LoadChapterDocument(chapter, false, false);
    ASSERT_TRUE(own);
    EXPECT_NE(own, document) << "the next one comes from the chapter's own file";
    EXPECT_TRUE(book->ReleaseChapterDocument(chapter, false));
    CloseInFront(document);
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(ForegroundDocumentTest, AnEmptyListOfPathsMeansAllChapters)
{
    auto const book = MakeBook(2);
    auto const document = OpenInFront(book->GetChapterAtIndex(0)->GetPath());
    EXPECT_EQ(book->GetForegroundControllers({}).size(), 1u);
    EXPECT_EQ(book->GetForegroundControllers({book->GetChapterAtIndex(1)->GetPath()}).size(), 0u);
    CloseInFront(document);
}

TEST_F(ForegroundDocumentTest, SavesWhatTheUserHasChanged)
{
    auto const book = MakeBook(1);
    auto const document = OpenInFront(book->GetChapterAtIndex(0)->GetPath());
    EXPECT_FALSE(book->CanSaveOpenChapters());
    auto const command = MakeCounted<ModifySectionCommand>(0u);
    command->SetStartNumberingAt(5);
    m_Application.EnqueueCommandAndWait(command, document, true);
    EXPECT_TRUE(book->CanSaveOpenChapters());
    book->SaveOpenChapters();
    BookBuilder::Rest();
    EXPECT_FALSE(document->IsDirty());
    CloseInFront(document);
}

TEST_F(ForegroundDocumentTest, TheBookLockHoldsOpenChaptersStillAndLetsThemGo)
{
    auto const book = MakeBook(2);
    auto const document = OpenInFront(book->GetChapterAtIndex(0)->GetPath());
    book->EngageBookLock(true);
    EXPECT_TRUE(document->IsBookLockEngaged());
    auto const command = MakeCounted<ModifySectionCommand>(0u);
    command->SetStartNumberingAt(5);
    EXPECT_FALSE(m_Application.EnqueueCommandAndWait(command, document, true)) << "the user's command";
    EXPECT_FALSE(document->IsDirty());
    book->EngageBookLock(false);
    EXPECT_FALSE(document->IsBookLockEngaged());
    CloseInFront(document);
}

TEST_F(ChapterMarshallTest, HoldsThreeAndDropsTheFirstThatCame)
{
    auto const book = MakeBook(4);
    ChapterMarshall marshall(book);
    auto const first = marshall.GetChapter(book->GetChapterAtIndex(0), false);
    marshall.GetChapter(book->GetChapterAtIndex(1), false);
    marshall.GetChapter(book->GetChapterAtIndex(2), false);
    EXPECT_EQ(marshall.GetChapter(book->GetChapterAtIndex(0), false), first);
    marshall.GetChapter(book->GetChapterAtIndex(3), false);
    EXPECT_EQ(book->GetDocumentControllerForChapter(book->GetChapterAtIndex(0), false), nullptr)
        << "first in, first out, although it was asked for last";
    EXPECT_NE(book->GetDocumentControllerForChapter(book->GetChapterAtIndex(1), false), nullptr);
    marshall.Release();
    BookBuilder::Rest();
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
}

TEST_F(ChapterMarshallTest, BringsChaptersToTheKeyChaptersFormatWhileItHoldsThem)
{
    ChapterSketch cmyk;
    cmyk.m_Format = Raster::Format::Cmyka8;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("key.kvdoc", cmyk), m_Builder.WriteChapter("b.kvdoc")});
    BookBuilder::Rest();
    Counted<BookChapter const> const other = book->GetChapterAtIndex(1);
    std::string const before = m_Builder.GetFolder().ReadFile("b.kvdoc");
    auto const own = book->LoadChapterDocument(other, true, false);
    {
        ChapterMarshall marshall(book);
        auto const document = marshall.GetChapter(other, true);
        ASSERT_TRUE(document);
        EXPECT_EQ(document->GetFormat(), Raster::Format::Cmyka8);
        EXPECT_EQ(marshall.GetChapter(book->GetChapterAtIndex(0), true)->GetFormat(), Raster::Format::Cmyka8);
    }
    BookBuilder::Rest();
    EXPECT_EQ(own->GetFormat(), Raster::Format::Rgba8) << "taken back";
    EXPECT_FALSE(own->IsDirty());
    book->ReleaseChapterDocument(other, false);
    BookBuilder::Rest();
    EXPECT_EQ(m_Builder.GetFolder().ReadFile("b.kvdoc"), before) << "output changes no file";
}

TEST_F(ChapterMarshallTest, TwoOutputsOfOneChapterTakeBackTheirOwnConversionsAndNoEdit)
{
    String const shared = m_Builder.WriteChapter("shared.kvdoc");
    ChapterSketch cmyk;
    cmyk.m_Format = Raster::Format::Cmyka8;
    ChapterSketch grey;
    grey.m_Format = Raster::Format::GreyAlpha8;
    auto const one = m_Builder.NewBook({m_Builder.WriteChapter("cmyk.kvdoc", cmyk), shared});
    auto const two = m_Builder.NewBook({m_Builder.WriteChapter("grey.kvdoc", grey), shared});
    BookBuilder::Rest();
    Counted<BookChapter const> const chapter = one->GetChapterAtIndex(1);
    auto const own = one->LoadChapterDocument(chapter, false, false);
    ASSERT_TRUE(own);
    auto const edit = MakeCounted<ModifySectionCommand>(0u);
    edit->SetStartNumberingAt(21);
    m_Application.EnqueueCommandAndWait(edit, own, false);
    {
        ChapterMarshall first(one);
        ChapterMarshall second(two);
        ASSERT_TRUE(first.GetChapter(chapter, true));
        ASSERT_TRUE(second.GetChapter(two->GetChapterAtIndex(1), true));
        EXPECT_EQ(own->GetFormat(), Raster::Format::GreyAlpha8);
    }
    BookBuilder::Rest();
    EXPECT_EQ(own->GetFormat(), Raster::Format::Rgba8);
    EXPECT_EQ(own->GetDocument()->GetSection(0)->GetStartNumberingAt(), 21u) << "the edit is nobody's to undo";
    one->ReleaseChapterDocument(chapter, false);
}

TEST_F(ChapterMarshallTest, ACopyHoldsTheSameDocumentsAndTheLastLetsThemGo)
{
    ChapterSketch cmyk;
    cmyk.m_Format = Raster::Format::Cmyka8;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("key.kvdoc", cmyk), m_Builder.WriteChapter("b.kvdoc")});
    BookBuilder::Rest();
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(1);
    ChapterMarshall copy;
    {
        ChapterMarshall first(book);
        ASSERT_TRUE(first.GetChapter(chapter, true));
        copy = first;
        ChapterMarshall const another(first);
    }
    BookBuilder::Rest();
    auto const document = copy.GetChapter(chapter, true);
    ASSERT_TRUE(document);
    EXPECT_EQ(document, book->GetDocumentControllerForChapter(chapter, false));
    EXPECT_TRUE(document->IsAbleToRunCommands());
    EXPECT_EQ(document->GetFormat(), Raster::Format::Cmyka8) << "nothing is taken back while somebody draws from it";
    copy = ChapterMarshall();
    BookBuilder::Rest();
    EXPECT_TRUE(m_Application.GetDocumentControllers().empty());
    EXPECT_EQ(document->GetFormat(), Raster::Format::Rgba8);
}

TEST_F(ChapterMarshallTest, GivesNothingForAChapterThatCannotBeOpened)
{
    auto const book = MakeBook(1);
    Kernel::FileSystem::Delete(book->GetChapterAtIndex(0)->GetPath(), 0);
    ChapterMarshall marshall(book);
    EXPECT_EQ(marshall.GetChapter(book->GetChapterAtIndex(0), true), nullptr);
}
