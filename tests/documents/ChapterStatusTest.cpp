#include "commands/PreflightChaptersCommand.h"
#include "commands/UpdateChapterCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Trace.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/raster/ICCProfile.h"
#include "framework/story/Story.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class ChapterStatusTest : public testing::Test
{
protected:
    ChapterStatusTest() { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    ~ChapterStatusTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    /// A chapter whose first section starts at `start`; customised unless it starts at 1.
    static ChapterSketch Sketch(int pages, unsigned int start = 1)
    {
        ChapterSketch sketch;
        sketch.m_Pages = pages;
        sketch.m_Section.m_StartNumberingAt = start;
        sketch.m_Section.m_RestartPageNumbering = start != 1;
        return sketch;
    }

    BookBuilder m_Builder;
};

}

TEST_F(ChapterStatusTest, TheRecordKnowsThePagesOfTheClosedDocument)
{
    ChapterSketch sketch = Sketch(4, 5);
    sketch.m_Title = "The title";
    sketch.m_Anchors = {"here", "there"};
    sketch.m_BookEndnotes = 2;
    auto const book =
        m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", sketch), m_Builder.WriteChapter("b.kvdoc", Sketch(2))});
    auto const chapter = book->GetChapterAtIndex(0);
    EXPECT_EQ(chapter->GetStatus(), BookChapter::Status::Ok);
    EXPECT_EQ(chapter->DescribePages(), "5 - 8");
    EXPECT_EQ(chapter->GetPageCount(), 4);
    EXPECT_EQ(chapter->GetExportingPageCount(), 4);
    EXPECT_TRUE(chapter->IsFacingPages());
    // Page 5 is a right-hand page and stands alone, then come pairs.
    std::string shape;
    for (SpreadInfo const & spread : chapter->GetSpreadInfo()) {
        shape += std::to_string(spread.m_PageRects.size());
        EXPECT_EQ(spread.m_PageBoxes.size(), spread.m_PageRects.size());
        EXPECT_EQ(spread.m_NonExporting.size(), spread.m_PageRects.size());
    }
    EXPECT_EQ(shape, "121");
    EXPECT_EQ(chapter->GetMetadata()->GetTitle(), "The title");
    EXPECT_EQ(chapter->GetAnchors().size(), 2u);
    EXPECT_FALSE(chapter->AreAnchorsDirty());
    EXPECT_EQ(chapter->GetEndnoteSequenceStart(), 1);
    EXPECT_EQ(book->GetChapterAtIndex(1)->GetEndnoteSequenceStart(), chapter->GetEndnoteSequenceEnd());
    EXPECT_FALSE(chapter->WouldUpdateTimeStamp());
}

TEST_F(ChapterStatusTest, TheFirstChapterAndCustomisedOnesBringTheirStart)
{
    struct Row
    {
        char const * m_Why;
        unsigned int m_First;
        unsigned int m_Second;
        char const * m_Starts;
        int m_SecondCached;
    };
    for (Row const & row : {Row{"the first one always starts by itself", 1, 1, "1 0", 1},
                            Row{"a customised later one does", 3, 9, "3 9", 9}}) {
        auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", Sketch(1, row.m_First)),
                                             m_Builder.WriteChapter("b.kvdoc", Sketch(1, row.m_Second))});
        EXPECT_EQ(BookBuilder::Starts(*book), row.m_Starts) << row.m_Why;
        EXPECT_EQ(book->GetChapterAtIndex(1)->GetCachedStartPage(), row.m_SecondCached) << row.m_Why;
        m_Builder.CloseBook(book);
        BookBuilder::Rest();
    }
}

TEST_F(ChapterStatusTest, PagesLeftOutOfOutputDoNotCountInTheRange)
{
    ChapterSketch sketch = Sketch(3);
    sketch.m_Section.m_IncludeOnExport = false;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", sketch)});
    auto const chapter = book->GetChapterAtIndex(0);
    EXPECT_TRUE(chapter->AllNonExporting());
    EXPECT_EQ(chapter->DescribePages(), "1 - 3") << "where nothing exports, the range is that of all pages";
}

TEST_F(ChapterStatusTest, AFullPassFindsWhatHappenedToTheFiles)
{
    auto const book =
        m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", Sketch(2)), m_Builder.WriteChapter("b.kvdoc")});
    BookBuilder::Rest();
    book->SetIsDirty(false);
    m_Builder.WriteChapter("a.kvdoc", Sketch(5));
    Kernel::FileSystem::Delete(book->GetChapterAtIndex(1)->GetPath(), 0);

    NotificationRecorder recorder;
    book->UpdateChapters();
    auto const changes = recorder.All<ChapterChangedNotification>();
    ASSERT_EQ(changes.size(), 1u) << "one pass, however it was asked for";
    EXPECT_EQ(changes[0]->GetChapters().size(), 2u);
    EXPECT_EQ(book->GetChapterAtIndex(0)->DescribePages(), "1 - 5");
    EXPECT_EQ(book->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::OutOfDate) << "a pass does not clear it";
    EXPECT_EQ(book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(book->GetChapterAtIndex(1)->DescribePages(), "");
    EXPECT_EQ(book->GetChapterAtIndex(1)->GetPageCount(), 1) << "the old pages are still known";
    EXPECT_TRUE(book->IsDirty());

    book->SetIsDirty(false);
    book->UpdateChapters();
    BookBuilder::Rest();
    EXPECT_FALSE(book->IsDirty()) << "a pass that finds nothing new leaves the book alone";
}

TEST_F(ChapterStatusTest, ManyCallsCostOnePassAndTheForegroundPassOpensNothing)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
    Kernel::ManualClock clock(Kernel::TimeStamp(1'000'000'000));
    BookBuilder::Rest();
    Kernel::Clock::Set(&clock);
    NotificationRecorder recorder;
    for (int call = 0; call < 5; ++call) {
        book->UpdateChapters();
    }
    EXPECT_EQ(recorder.All<ChapterChangedNotification>().size(), 1u);

    OpenDocumentFailedNotification failure(book->GetChapterAtIndex(0)->GetPath(), true);
    auto const document =
        VantraController::GetInstance().OpenDocument(book->GetChapterAtIndex(0)->GetPath(), failure);
    ASSERT_TRUE(document);
    BookBuilder::Rest();
    auto const command = MakeCounted<ModifySectionCommand>(0u);
    command->SetStartNumberingAt(9);
    VantraController::GetInstance().EnqueueCommandAndWait(command, document, false);
    Kernel::FileSystem::Delete(book->GetChapterAtIndex(1)->GetPath(), 0);
    int loads = 0;
    Kernel::SetTraceTarget([&loads](String const & line) { loads += line.View().starts_with("LoadChapter:") ? 1 : 0; });
    for (int call = 0; call < 5; ++call) {
        book->UpdateForegroundChapters();
    }
    BookBuilder::Rest();
    Kernel::SetTraceTarget({});
    EXPECT_EQ(loads, 0);
    EXPECT_EQ(book->GetChapterAtIndex(0)->DescribePages(), "9 - 9") << "read from the open document, unsaved";
    EXPECT_EQ(book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::Ok) << "nobody has looked";
    VantraController::GetInstance().EnqueueCommandAndWait(
        MakeCounted<CloseDocumentCommand>(document, nullptr, false, true));
    BookBuilder::Rest();
    Kernel::Clock::Set(nullptr);
}

TEST_F(ChapterStatusTest, OneChapterIsUpdatedByItsCommand)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
    m_Builder.WriteChapter("b.kvdoc", Sketch(3));
    NotificationRecorder recorder;
    Counted<BookChapter const> const chapter = book->GetChapterAtIndex(1);
    BookBuilder::Run(book, MakeCounted<UpdateChapterCommand>(chapter));
    EXPECT_EQ(chapter->DescribePages(), "1 - 3");
    auto const changes = recorder.All<ChapterChangedNotification>();
    ASSERT_EQ(changes.size(), 1u);
    EXPECT_EQ(changes[0]->GetChapters(), (std::vector<Counted<BookChapter const>>{chapter}));
}

TEST_F(ChapterStatusTest, PreflightFillsItsColumn)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
    BookController::ConstChapterList chapters;
    book->GetChapters(chapters);
    Kernel::FileSystem::Delete(chapters[1]->GetPath(), 0);
    NotificationRecorder recorder;
    BookBuilder::Run(book, MakeCounted<PreflightChaptersCommand>(chapters, false));
    EXPECT_EQ(chapters[0]->GetPreflightStatus(), PreflightResult::Status::NotRun) << "nobody has run it";
    BookBuilder::Run(book, MakeCounted<PreflightChaptersCommand>(chapters, true));
    EXPECT_NE(chapters[0]->GetPreflightStatus(), PreflightResult::Status::NotRun);
    EXPECT_NE(chapters[0]->GetPreflightDescription(), "Preflight not run");
    EXPECT_EQ(chapters[1]->GetPreflightStatus(), PreflightResult::Status::NotRun);
    EXPECT_EQ(chapters[1]->GetPreflightDescription(), "Preflight not run");
    EXPECT_EQ(recorder.All<ChapterChangedNotification>().size(), 4u) << "one for each chapter and command";
    EXPECT_FALSE(PreflightChaptersCommand::IsInPreflight());
}
