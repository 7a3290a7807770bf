#include "core/BookChapter.h"
#include "support/SpreadSketch.h"
#include "support/TemporaryFolder.h"

#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"

#include <gtest/gtest.h>

#include <fstream>
#include <limits>
#include <thread>

using Book::BookChapter;
using Book::SpreadInfo;
using Kernel::Counted;
using Kernel::MakeCounted;
using TestSupport::SketchSpreads;

namespace
{

Counted<BookChapter> ChapterWith(std::string_view sketch)
{
    auto const chapter = MakeCounted<BookChapter>(String("/books/one.kvdoc"));
    chapter->SetSpreadInfo(SketchSpreads(sketch));
    return chapter;
}

Counted<BookChapter> FacingChapter(std::string_view sketch)
{
    auto const chapter = ChapterWith(sketch);
    chapter->SetIsFacingPages(true);
    return chapter;
}

/// Every place of a chapter that the walk visits, as "spread.page ".
std::string Walk(BookChapter const & chapter)
{
    int spread = 0;
    int page = 0;
    std::string visited;
    chapter.GetFirstExportingSpreadAndPage(spread, page);
    for (int steps = 0; steps < 100 && spread >= 0; ++steps) {
        visited += std::to_string(spread) + '.' + std::to_string(page) + ' ';
        chapter.GetNextExportingSpreadAndPage(spread, page);
    }
    return spread == -1 && page == -1 ? visited : visited + "does not end";
}

std::string LastPlace(BookChapter const & chapter)
{
    int spread = -7;
    int page = -7;
    chapter.GetLastExportingSpreadAndPage(spread, page);
    return std::to_string(spread) + '.' + std::to_string(page);
}

}

TEST(BookChapterTest, IsNamedAfterItsFile)
{
    struct Row
    {
        char const * m_Path;
        char const * m_Name;
    };
    for (Row const & row : {Row{"/books/part one/intro.kvdoc", "intro"}, Row{"c:\\x\\a.b.ext", "a.b"},
                            Row{"plain", "plain"}, Row{"a.b/c", "c"}, Row{"/x\\mixed/y.z", "y"}, Row{"dir/", ""}}) {
        BookChapter const chapter((String(row.m_Path)));
        EXPECT_EQ(chapter.GetName(), row.m_Name) << row.m_Path;
        EXPECT_EQ(chapter.GetPath(), row.m_Path);
        EXPECT_TRUE(chapter.IsContinueFromPrevious());
    }
}

TEST(BookChapterTest, RestrictedHidesEveryOtherStatus)
{
    struct Row
    {
        BookChapter::Status m_Status;
        char const * m_Text;
        bool m_IsValid;
    };
    for (Row const & row : {Row{BookChapter::Status::Ok, "Status: OK", true},
                            Row{BookChapter::Status::OpenForEdit, "Status: Open for edit", true},
                            Row{BookChapter::Status::Locked, "Status: Locked", false},
                            Row{BookChapter::Status::NotFound, "Status: Not found or accessible", false},
                            Row{BookChapter::Status::OutOfDate, "Status: Out of date", true}}) {
        BookChapter chapter((String("a")));
        chapter.SetStatus(row.m_Status);
        EXPECT_EQ(chapter.GetStatus(), row.m_Status);
        EXPECT_EQ(chapter.GetStatusDescription(), row.m_Text);
        EXPECT_EQ(chapter.IsValid(), row.m_IsValid) << row.m_Text;
        chapter.SetRestricted(true);
        EXPECT_EQ(chapter.GetStatus(), BookChapter::Status::Restricted) << row.m_Text;
        EXPECT_EQ(chapter.GetStatusDescription(), "Status: Restricted");
        EXPECT_FALSE(chapter.IsValid()) << row.m_Text;
    }
    EXPECT_TRUE(BookChapter::DescribeStatus(static_cast<BookChapter::Status>(6)).Empty());
    EXPECT_TRUE(BookChapter::DescribeStatus(static_cast<BookChapter::Status>(-1)).Empty());
}

TEST(BookChapterTest, SettersTellWhetherSomethingChanged)
{
    BookChapter chapter((String("a")));
    EXPECT_FALSE(chapter.SetStatus(BookChapter::Status::Ok));
    EXPECT_TRUE(chapter.SetStatus(BookChapter::Status::Locked));
    EXPECT_TRUE(chapter.SetPages("1 - 4"));
    EXPECT_FALSE(chapter.SetPages(String("1 - ") + "4"));

    EXPECT_TRUE(chapter.SetPreflightStatus(PreflightResult::Status::Warning, "one warning"));
    EXPECT_FALSE(chapter.SetPreflightStatus(PreflightResult::Status::Error, "one warning")) << "the text is the same";
    EXPECT_EQ(chapter.GetPreflightStatus(), PreflightResult::Status::Error) << "stored all the same";
    EXPECT_FALSE(chapter.SetPreflightStatus(PreflightResult::Status::Error, "two")) << "the status is the same";
    EXPECT_EQ(chapter.GetPreflightDescription(), "two");
}

TEST(BookChapterTest, AnchorsAreEitherKnownOrDirtyAndEmpty)
{
    BookChapter chapter((String("a")));
    AnchorInfo anchor;
    anchor.m_Uid = "uid";
    chapter.SetAnchorsDirty();
    EXPECT_TRUE(chapter.AreAnchorsDirty());
    chapter.SetAnchors({anchor});
    EXPECT_FALSE(chapter.AreAnchorsDirty());
    auto const before = chapter.GetAnchors();
    chapter.SetAnchorsDirty();
    EXPECT_TRUE(chapter.GetAnchors().empty());
    ASSERT_EQ(before.size(), 1u) << "a snapshot stays as it was";
    chapter.SetAnchors(*chapter.GetAnchors());
    EXPECT_FALSE(chapter.AreAnchorsDirty()) << "the record's own list also cleans";
}

TEST(BookChapterTest, LooksAtTheFilesTimeOnce)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    BookChapter chapter(path);
    EXPECT_FALSE(chapter.WouldUpdateTimeStamp()) << "a missing file reads as unchanged";
    EXPECT_FALSE(chapter.UpdateTimeStamp());
    std::ofstream(path.c_str()) << "x";
    EXPECT_TRUE(chapter.WouldUpdateTimeStamp());
    EXPECT_TRUE(chapter.UpdateTimeStamp());
    EXPECT_FALSE(chapter.WouldUpdateTimeStamp());
    EXPECT_FALSE(chapter.UpdateTimeStamp());
    Kernel::TimeStamp const time = chapter.GetTimeStamp();
    Kernel::FileSystem::Delete(path, 0);
    EXPECT_FALSE(chapter.UpdateTimeStamp());
    EXPECT_EQ(chapter.GetTimeStamp(), time);
}

TEST(BookChapterTest, WalksOverThePagesThatExport)
{
    struct Row
    {
        char const * m_Sketch;
        int m_Pages;
        int m_Exporting;
        char const * m_Walk;
        char const * m_Last;
    };
    for (Row const & row :
         {Row{"", 0, 0, "0.0 ", "0.0"}, Row{"o", 1, 1, "0.0 ", "0.0"},
          Row{"o|oo|oo", 5, 5, "0.0 1.0 1.1 2.0 2.1 ", "2.1"}, Row{"x|xo|xx|ox", 7, 2, "1.1 3.0 ", "3.0"},
          // Where nothing exports every page counts, and the last is the very last.
          Row{"x|xx", 3, 0, "0.0 1.0 1.1 ", "1.1"}}) {
        auto const chapter = ChapterWith(row.m_Sketch);
        EXPECT_EQ(chapter->GetPageCount(), row.m_Pages) << row.m_Sketch;
        EXPECT_EQ(chapter->GetExportingPageCount(), row.m_Exporting) << row.m_Sketch;
        EXPECT_EQ(chapter->AllNonExporting(), row.m_Exporting == 0) << row.m_Sketch;
        EXPECT_EQ(Walk(*chapter), row.m_Walk) << row.m_Sketch;
        EXPECT_EQ(LastPlace(*chapter), row.m_Last) << row.m_Sketch;
    }
}

TEST(BookChapterTest, TellsDoubleStartsAndHangingEnds)
{
    struct Row
    {
        char const * m_Sketch;
        bool m_IsDoubleStart;
        bool m_Hangs;
        char const * m_Why;
    };
    for (Row const & row :
         {Row{"", false, false, "nothing"}, Row{"o", false, true, "one page is alone"},
          Row{"oo", true, false, "a full double page"}, Row{"xo", false, false, "starts on the right"},
          Row{"oo|ox", true, true, "the last page that exports is a left one"},
          Row{"ooo", false, false, "a spread of three is neither"},
          Row{"o|oo", false, false, "starts alone, ends full"}}) {
        auto const chapter = ChapterWith(row.m_Sketch);
        EXPECT_EQ(chapter->IsDoublePageStart(), row.m_IsDoubleStart) << row.m_Why;
        EXPECT_EQ(chapter->HasHangingPageEnd(), row.m_Hangs) << row.m_Why;
    }
}

namespace
{

/// A pair of chapters that merge, "oo|o" followed by "o|oo", and one thing about them that a row changes.
struct MergeRow
{
    char const * m_Why;
    bool m_Merges;
    std::function<void(std::vector<SpreadInfo> & ours, std::vector<SpreadInfo> & theirs)> m_Change;
    char const * m_Ours = "o|oo";
    char const * m_Theirs = "oo|o";
};

bool Merges(MergeRow const & row, bool verticalStack)
{
    auto ours = SketchSpreads(row.m_Ours);
    auto theirs = SketchSpreads(row.m_Theirs);
    if (row.m_Change) {
        row.m_Change(ours, theirs);
    }
    auto const chapter = FacingChapter("o");
    auto const previous = FacingChapter("o");
    chapter->SetSpreadInfo(ours);
    previous->SetSpreadInfo(theirs);
    chapter->SetIsVerticalStack(verticalStack);
    previous->SetIsVerticalStack(verticalStack);
    return chapter->CanMergeWithPrevious(previous);
}

}

TEST(CanMergeWithPreviousTest, NeedsTwoChaptersOfFacingPagesThatStackAlike)
{
    auto const chapter = FacingChapter("o|oo");
    auto const previous = FacingChapter("oo|o");
    EXPECT_TRUE(chapter->CanMergeWithPrevious(previous));
    EXPECT_FALSE(chapter->CanMergeWithPrevious(nullptr));
    previous->SetIsVerticalStack(true);
    EXPECT_FALSE(chapter->CanMergeWithPrevious(previous));
    previous->SetIsVerticalStack(false);
    previous->SetIsFacingPages(false);
    EXPECT_FALSE(chapter->CanMergeWithPrevious(previous));
    previous->SetIsFacingPages(true);
    chapter->SetIsFacingPages(false);
    EXPECT_FALSE(chapter->CanMergeWithPrevious(previous));
}

TEST(CanMergeWithPreviousTest, ComparesSizesAndTheEdgesThatMeet)
{
    using Spreads = std::vector<SpreadInfo>;
    MergeRow const rows[] = {
        {"two single pages alike", true, {}},
        {"a double start stands by itself", false, {}, "oo"},
        {"the chapter before is full", false, {}, "o|oo", "oo"},
        {"sizes agree after snapping", true, [](Spreads & ours, Spreads &) { ours[0].m_PageRects[0].right = 100.004; }},
        {"just out of tolerance it is another size", false,
         [](Spreads & ours, Spreads &) { ours[0].m_PageRects[0].right = 100.006; }},
        {"another height", false, [](Spreads &, Spreads & theirs) { theirs[1].m_PageRects[0].bottom = 201; }},
        {"single pages: every bleed margin counts", false,
         [](Spreads & ours, Spreads &) { ours[0].m_PageBoxes[0].right = 9; }},
        {"single pages: margins within tolerance", true,
         [](Spreads & ours, Spreads &) {
             ours[0].m_PageBoxes[0] = {0.005, -0.005, 0.005, 0.004};
         }},
        // Our page is the second of its spread: the right margin of theirs meets the left one of ours.
        {"right page joins: inner margins that meet agree", true,
         [](Spreads & ours, Spreads & theirs) {
             ours[0].m_PageBoxes[1] = {3, 0, 8, 0};
             theirs[1].m_PageBoxes[0] = {7, 0, 3, 0};
         },
         "xo"},
        {"right page joins: inner margins differ", false,
         [](Spreads & ours, Spreads & theirs) {
             ours[0].m_PageBoxes[1] = {3, 0, 8, 0};
             theirs[1].m_PageBoxes[0] = {3, 0, 8, 0};
         },
         "xo"},
        {"top margins differ", false, [](Spreads & ours, Spreads &) { ours[0].m_PageBoxes[1].top = 1; }, "xo"},
        {"sizes are compared at the place of the hanging page", true,
         [](Spreads & ours, Spreads &) {
             ours[0].m_PageRects[1] = {100, 0, 500, 500};
         },
         "xo"},
    };
    for (MergeRow const & row : rows) {
        EXPECT_EQ(Merges(row, false), row.m_Merges) << row.m_Why;
    }
}

TEST(CanMergeWithPreviousTest, StackedPagesHaveToAgreeExactly)
{
    using Spreads = std::vector<SpreadInfo>;
    MergeRow const rows[] = {
        {"lower page joins: margins that meet agree", true,
         [](Spreads & ours, Spreads & theirs) {
             ours[0].m_PageBoxes[1] = {1, 3, 2, 8};
             theirs[1].m_PageBoxes[0] = {1, 7, 2, 3};
         },
         "xo"},
        {"sides within tolerance are not enough", false,
         [](Spreads & ours, Spreads &) { ours[0].m_PageBoxes[1].left = 0.001; }, "xo"},
        {"nor are margins that meet", false, [](Spreads & ours, Spreads &) { ours[0].m_PageBoxes[1].top = 0.001; },
         "xo"},
        {"two single pages keep the tolerance", true,
         [](Spreads & ours, Spreads &) { ours[0].m_PageBoxes[0].left = 0.001; }},
    };
    for (MergeRow const & row : rows) {
        EXPECT_EQ(Merges(row, true), row.m_Merges) << row.m_Why;
    }
}

TEST(GetPrePagePaddingCountTest, BringsPagesToTheirOwnSides)
{
    struct Row
    {
        char const * m_Ours;
        char const * m_Theirs;
        int m_Count;
        char const * m_Why;
    };
    for (Row const & row :
         {Row{"oo", "oo", 0, "full spreads follow each other"},
          Row{"oo", "oo|o", 1, "the hanging page gets its partner"},
          Row{"o|oo", "oo", 1, "a single first page comes on its own side"}, Row{"o|oo", "oo|o", 2, "both"},
          Row{"xo|oo", "oo", 1, "starts on the second page"}, Row{"o|xo", "oo", 1, "the first spread counts once"},
          // The first page that exports is the first of spread 1, and spread 0 has one page.
          Row{"x|oo", "oo", 1, "the document's first spread decides"}, Row{"", "oo|o", 1, "no pages"}}) {
        auto const chapter = FacingChapter(row.m_Ours);
        auto const previous = FacingChapter(row.m_Theirs);
        EXPECT_EQ(chapter->GetPrePagePaddingCount(previous, true, false), row.m_Count) << row.m_Why;
        EXPECT_EQ(chapter->GetPrePagePaddingCount(previous, false, false), 0) << row.m_Why;
        EXPECT_EQ(chapter->GetPrePagePaddingCount(nullptr, true, true), 0) << row.m_Why;
    }
    EXPECT_EQ(FacingChapter("o|oo")->GetPrePagePaddingCount(FacingChapter("oo|o"), true, true), 0) << "merging wins";
    EXPECT_EQ(FacingChapter("oo")->GetPrePagePaddingCount(FacingChapter("oo|o"), true, true), 1) << "it cannot merge";
}

TEST(BookChapterCloseTest, KeepsOnlyTheLastWaiterOfAClose)
{
    BookChapter const chapter((String("a")));
    std::string ran;
    EXPECT_FALSE(chapter.IsInClose([&] { ran += "early "; }));
    chapter.SetInClose(true);
    EXPECT_TRUE(chapter.IsInClose([&] { ran += "first "; }));
    EXPECT_TRUE(chapter.IsInClose([&] { ran += "second "; }));
    EXPECT_EQ(ran, "");
    chapter.SetInClose(false);
    EXPECT_EQ(ran, "second ");
    chapter.SetInClose(true);
    chapter.SetInClose(false);
    EXPECT_EQ(ran, "second ") << "it ran once";
}

TEST(BookChapterUpdateTest, ReadersSeeAllOfAnUpdateOrNothing)
{
    auto const chapter = MakeCounted<BookChapter>(String("a"));
    chapter->SetPages("0");
    std::atomic<bool> stop{false};
    std::atomic<int> torn{0};
    std::thread reader([&] {
        while (!stop) {
            // One snapshot can't be had through two getters, so this looks for the other sign of a torn update: pages
            // that have moved on while the start page, which is read later, has not.
            int const pages = std::stoi(chapter->DescribePages().ToStd());
            if (chapter->GetCachedStartPage() < pages) {
                ++torn;
            }
        }
    });
    for (int round = 1; round <= 2000; ++round) {
        BookChapter::UpdateSession const session(*chapter);
        chapter->SetPages(Kernel::ToString(round));
        chapter->SetSpreadInfo(SketchSpreads("oo"));
        chapter->SetCachedStartPage(round);
        ASSERT_EQ(chapter->GetCachedStartPage(), round) << "the writer sees its own sets";
    }
    stop = true;
    reader.join();
    EXPECT_EQ(torn, 0);
}

TEST(BookChapterUpdateTest, IsFoundByItsPathWhichOthersSeeChangeAtTheEndOfTheUpdate)
{
    auto const chapter = MakeCounted<BookChapter>(String("/x/a.kvdoc"));
    EXPECT_TRUE(chapter->HasPath("/x/a.kvdoc"));
    EXPECT_FALSE(chapter->HasPath("/x/A.kvdoc"));
    {
        BookChapter::UpdateSession const session(*chapter);
        chapter->SetPath("/x/b.kvdoc");
        EXPECT_TRUE(chapter->HasPath("/x/b.kvdoc"));
        std::thread([&] { EXPECT_TRUE(chapter->HasPath("/x/a.kvdoc")); }).join();
    }
    EXPECT_FALSE(chapter->HasPath("/x/a.kvdoc"));
}
