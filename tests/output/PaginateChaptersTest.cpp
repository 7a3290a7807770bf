// From chapter records to sheets, on real books.

#include "commands/UpdateChaptersCommand.h"
#include "content/UpdateNumbersCommand.h"
#include "core/BookCollection.h"
#include "output/PaginatorBooklet.h"
#include "output/PaginatorSingle.h"
#include "support/BookBuilder.h"

#include "SheetSketch.h"

#include <gtest/gtest.h>

#include <atomic>
#include <cstdio>
#include <thread>

namespace Book
{
namespace
{

using Lines = std::vector<std::string>;

class PaginateChaptersTest : public testing::Test
{
protected:
    static std::vector<Kernel::Counted<BookChapter const>> ChaptersOf(Kernel::Counted<BookController> const & book)
    {
        std::vector<Kernel::Counted<BookChapter const>> chapters;
        book->GetChapters(chapters);
        return chapters;
    }

    /// The running numbers on single sheets.
    static Lines Single(Kernel::Counted<BookController> const & book, char const * range)
    {
        return SheetSketch::Numbers(PaginatorSingle().Paginate({}, book, ChaptersOf(book), range, -1, Renderer::FitTypeScale,
                                                               Renderer::OrientationAuto, 1, false));
    }

    BookBuilder m_Builder;
};

TEST_F(PaginateChaptersTest, PagesOfAllChaptersAreNumberedThroughAndChosenByNumber)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("one.kvdoc", {.m_Pages = 3}),
                                         m_Builder.WriteChapter("two.kvdoc", {.m_Pages = 2})});
    EXPECT_EQ(Single(book, ""), (Lines{"0", "1", "2", "3", "4"}));
    EXPECT_EQ(Single(book, "5,2-3,2"), (Lines{"4", "1", "2", "1"})) << "in the order of the choice";
    EXPECT_EQ(Single(book, "4-9999999999"), (Lines{"3", "4"}));
    EXPECT_EQ(Single(book, "6-8, 9999999999-"), (Lines{"0"})) << "no such pages: the first one";
    EXPECT_EQ(Single(book, "chapter two"), (Lines{"0", "1", "2", "3", "4"})) << "nothing that can be read";
    EXPECT_TRUE(PaginatorSingle()
                    .Paginate({}, nullptr, ChaptersOf(book), "", -1, Renderer::FitTypeScale, Renderer::OrientationAuto, 1, false)
                    .empty());

    std::vector<PaginatorPage> const sheets = PaginatorSingle().Paginate(
        {}, book, {book->GetChapterAtIndex(1), nullptr}, "", -1, Renderer::FitTypeScale, Renderer::OrientationAuto, 1, false);
    ASSERT_EQ(SheetSketch::Numbers(sheets), (Lines{"0", "1"})) << "numbers count in what is printed, not in the book";
    EXPECT_EQ(sheets[1].m_Targets[0].m_Chapter, book->GetChapterAtIndex(1));
    int spread = 0;
    int page = 0;
    book->GetChapterAtIndex(1)->GetNextExportingSpreadAndPage(spread, page);
    SpreadInfo const info = book->GetChapterAtIndex(1)->GetSpreadInfo()[static_cast<std::size_t>(spread)];
    EXPECT_EQ(sheets[1].m_Targets[0].m_Spread, spread);
    EXPECT_EQ(sheets[1].m_Rect, info.m_PageRects[static_cast<std::size_t>(page)]);
    EXPECT_EQ(sheets[1].m_Targets[0].m_PageBox, info.m_PageBoxes[static_cast<std::size_t>(page)]);
}

TEST_F(PaginateChaptersTest, PagesThatDontExportAndChaptersThatCannotBeOpenedAreLeftOut)
{
    DocumentSection::Values hidden;
    hidden.m_IncludeOnExport = false;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("one.kvdoc", {.m_Pages = 2}),
                                         m_Builder.WriteChapter("hidden.kvdoc", {.m_Pages = 2, .m_Section = hidden}),
                                         m_Builder.WriteChapter("gone.kvdoc", {.m_Pages = 2}),
                                         m_Builder.WriteChapter("last.kvdoc", {.m_Pages = 1})});
    BookBuilder::Rest(); // A pass that still has the file open would not miss it.
    std::remove(book->GetChapterAtIndex(2)->GetPath().c_str());
    BookBuilder::Run(book, Kernel::MakeCounted<UpdateChaptersCommand>(false));
    std::vector<Kernel::Counted<BookChapter const>> const chapters = ChaptersOf(book);
    auto const sheets = PaginatorSingle().Paginate({}, book, chapters, "", -1, Renderer::FitTypeScale,
                                                   Renderer::OrientationAuto, 1, false);
    ASSERT_EQ(sheets.size(), 3u);
    EXPECT_EQ(sheets[2].m_Targets[0].m_Chapter, chapters[3]);

    EXPECT_TRUE(PaginatorSingle()
                    .Paginate({}, book, {chapters[1]}, "", -1, Renderer::FitTypeScale, Renderer::OrientationAuto, 1, false)
                    .empty())
        << "nothing exports";
}

TEST_F(PaginateChaptersTest, SheetsAreLaidWhileACommandOfTheBookRuns)
{
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("one.kvdoc", {.m_Pages = 5}),
                                         m_Builder.WriteChapter("two.kvdoc", {.m_Pages = 3})});
    std::vector<Kernel::Counted<BookChapter const>> const chapters = ChaptersOf(book);
    std::atomic<bool> isDone = false;
    std::atomic<int> odd = 0;
    std::thread printing([&] {
        do {
            auto const sheets = PaginatorBooklet(false, false)
                                    .Paginate({}, book, chapters, "", -1, Renderer::FitTypeShrink,
                                              Renderer::OrientationAuto, 1, false);
            odd += sheets.size() == 4 ? 0 : 1;
        } while (!isDone);
    });
    for (int round = 0; round < 5; ++round) {
        BookBuilder::Run(book, Kernel::MakeCounted<UpdateNumbersCommand>(chapters, true, true, true));
        BookBuilder::Run(book, Kernel::MakeCounted<UpdateChaptersCommand>(false));
    }
    isDone = true;
    printing.join();
    EXPECT_EQ(odd, 0) << "eight pages on four sides, at every moment";
}

}
}
