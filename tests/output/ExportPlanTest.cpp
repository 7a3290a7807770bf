#include "core/BookChapter.h"
#include "framework/document/AnchorInfo.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/PrintersMarks.h"
#include "output/ExportBookCommand.h"

#include <gtest/gtest.h>

namespace Book
{

void PrintTo(ExportPageRef const & ref, std::ostream * stream)
{
    *stream << '(' << ref.m_Chapter << ' ' << ref.m_Spread << ' ' << ref.m_Page << " +" << ref.m_Offset.width << ','
            << ref.m_Offset.height << ')';
}

namespace
{

constexpr double Width = 400;
constexpr double Height = 600;
ExportPageRef const Pad{};

/// A spread of pages side by side (or one below the other), each exporting unless its letter is small: "LR", "R", "lR".
SpreadInfo Spread(std::string const & pages, bool vertical)
{
    SpreadInfo spread;
    double at = 0;
    for (char const page : pages) {
        spread.m_PageRects.push_back(vertical ? Kernel::Rect{0, at, Width, at + Height}
                                              : Kernel::Rect{at, 0, at + Width, Height});
        spread.m_PageBoxes.push_back({9, 9, 9, 9});
        spread.m_NonExporting.push_back(page >= 'a');
        at += vertical ? Height : Width;
    }
    spread.m_SpreadBounds = vertical ? Kernel::Rect{0, 0, Width, at} : Kernel::Rect{0, 0, at, Height};
    spread.m_SpreadExtents = spread.m_SpreadBounds;
    return spread;
}

struct ChapterSketch
{
    std::vector<std::string> spreads;
    bool facing = true;
    bool vertical = false;
};

Kernel::Counted<BookChapter> Chapter(ChapterSketch const & sketch)
{
    auto const chapter = Kernel::MakeCounted<BookChapter>(String("/books/chapter.kvdoc"));
    std::vector<SpreadInfo> spreads;
    for (std::string const & pages : sketch.spreads) {
        spreads.push_back(Spread(pages, sketch.vertical));
    }
    chapter->SetSpreadInfo(spreads);
    chapter->SetIsFacingPages(sketch.facing);
    chapter->SetIsVerticalStack(sketch.vertical);
    return chapter;
}

/// The plan of an export, reached step by step without a book's queue.
class PlannedExport : public ExportBookCommand
{
public:
    PlannedExport(std::vector<ChapterSketch> const & sketches, bool pad, bool merge, bool singlePages)
        : PlannedExport(MakeChapters(sketches), pad, merge, singlePages)
    {
    }
    PlannedExport(std::vector<Kernel::Counted<BookChapter const>> chapters, bool pad, bool merge, bool singlePages)
        : ExportBookCommand(std::move(chapters), "/out/book.pdf",
                            Kernel::Consolidated<Renderer::FileExportOptions>(
                                Kernel::MakeCounted<Renderer::FileExportOptionsPDF const>()),
                            {}, false, false, false, singlePages, nullptr)
    {
        SetStrayHandling(pad, merge);
        BuildExportMap();
        BuildPageMaps();
    }

private:
    static std::vector<Kernel::Counted<BookChapter const>> MakeChapters(std::vector<ChapterSketch> const & sketches)
    {
        std::vector<Kernel::Counted<BookChapter const>> chapters;
        for (ChapterSketch const & sketch : sketches) {
            chapters.push_back(Chapter(sketch));
        }
        return chapters;
    }
};

struct MapCase
{
    char const * why;
    std::vector<ChapterSketch> chapters;
    bool pad;
    bool merge;
    bool singlePages;
    std::vector<ExportPageEntry> map;
    std::vector<float> weights;
};

class BuildExportMapTest : public testing::TestWithParam<MapCase>
{
};

TEST_P(BuildExportMapTest, PlacesEveryPage)
{
    MapCase const & row = GetParam();
    PlannedExport plan(row.chapters, row.pad, row.merge, row.singlePages);
    EXPECT_EQ(plan.GetExportMap(), row.map) << row.why;
    std::vector<float> weights;
    plan.GetPagesPerStage(weights);
    EXPECT_EQ(weights, row.weights) << row.why;
}

constexpr Kernel::Size None{0, 0};
constexpr Kernel::Size Right{Width, 0};
constexpr Kernel::Size Left{-Width, 0};
constexpr Kernel::Size Down{0, Height};
constexpr Kernel::Size Up{0, -Height};

INSTANTIATE_TEST_SUITE_P(
    Rows, BuildExportMapTest,
    testing::Values(
        MapCase{"spreads go out whole", {{{"R", "LR"}}}, false, true, false,
                {{{0, 0, 0, None}}, {{0, 1, 0, None}, {0, 1, 1, None}}}, {2}},
        MapCase{"single pages: each at the origin, pulled back by its own width; stray handling has no say",
                {{{"R", "LR", "L"}}, {{"R"}}}, true, true, true,
                {{{0, 0, 0, None}}, {{0, 1, 0, None}}, {{0, 1, 1, Left}}, {{0, 2, 0, None}}, {{1, 0, 0, None}}}, {4, 1}},
        MapCase{"single pages of a vertical stack are pulled up", {{{"LR"}, true, true}}, false, false, true,
                {{{0, 0, 0, None}}, {{0, 0, 1, Up}}}, {2}},
        MapCase{"a hanging page takes in the next chapter's first page", {{{"LR", "L"}}, {{"R", "LR"}}}, false, true, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{0, 1, 0, None}, {1, 0, 0, Right}}, {{1, 1, 0, None}, {1, 1, 1, None}}},
                {2, 1}},
        MapCase{"the same downwards", {{{"LR", "L"}, true, true}, {{"R"}, true, true}}, false, true, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{0, 1, 0, None}, {1, 0, 0, Down}}}, {2}},
        MapCase{"padded instead: a blank behind the one and before the other", {{{"LR", "L"}}, {{"R", "LR"}}}, true, false, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{0, 1, 0, None}, Pad}, {Pad, {1, 0, 0, Right}}, {{1, 1, 0, None}, {1, 1, 1, None}}},
                {2, 1, 1}},
        MapCase{"neither: both stay alone", {{{"LR", "L"}}, {{"R"}}}, false, false, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{0, 1, 0, None}}, {{1, 0, 0, None}}}, {2, 1}},
        MapCase{"a lone right-hand page of a spread moves to the origin", {{{"LR"}}, {{"lR"}}}, false, false, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{1, 0, 1, Left}}}, {1, 1}},
        MapCase{"a stray in a later place of its chapter is padded behind", {{{"LR"}}, {{"LR", "L"}}}, true, false, false,
                {{{0, 0, 0, None}, {0, 0, 1, None}}, {{1, 0, 0, None}, {1, 0, 1, None}}, {{1, 1, 0, None}, Pad}}, {1, 2}},
        MapCase{"the book's very first page is never padded in front", {{{"R"}}}, true, false, false, {{{0, 0, 0, None}}}, {1}},
        MapCase{"a chapter of which nothing exports goes out whole", {{{"l", "lr"}}}, false, false, false,
                {{{0, 0, 0, None}}, {{0, 1, 0, None}, {0, 1, 1, None}}}, {2}},
        MapCase{"pages that do not export have no place", {{{"R", "lr", "LR"}}}, false, false, false,
                {{{0, 0, 0, None}}, {{0, 2, 0, None}, {0, 2, 1, None}}}, {2}},
        MapCase{"a chapter that was never opened has no page", {{{}}, {{"R"}, false}}, false, true, false,
                {{{1, 0, 0, None}}}, {1}},
        MapCase{"without facing pages a spread's pages go out one by one", {{{"LR"}, false}}, false, true, false,
                {{{0, 0, 0, None}}, {{0, 0, 1, None}}}, {2}}));

TEST(ExportPlanTest, MarksSitAroundWhatIsOnTheOutputPage)
{
    auto const rects = [](PlannedExport const & plan) {
        std::vector<Kernel::Rect> found;
        for (int page = 1; plan.GetPrintersMarksForTarget(page); ++page) {
            found.push_back(plan.GetPrintersMarksForTarget(page)->GetRect());
        }
        return found;
    };
    Kernel::Rect const page{0, 0, Width, Height};
    Kernel::Rect const spread{0, 0, 2 * Width, Height};

    PlannedExport const single({{{"R", "LR"}}}, false, false, true);
    EXPECT_EQ(rects(single), (std::vector{page, page, page})) << "a page of a spread is marked at the origin";
    EXPECT_EQ(single.GetPrintersMarksForTarget(0), nullptr);

    PlannedExport const merged({{{"LR", "L"}}, {{"R"}}}, false, true, false);
    EXPECT_EQ(rects(merged), (std::vector{spread, spread}));

    PlannedExport const padded({{{"LR", "L"}}, {{"R"}}}, true, false, false);
    // The blank behind a page is united with the chapter before, of which the first chapter has none.
    EXPECT_EQ(rects(padded), (std::vector{spread, Kernel::Rect{0, 0, 2 * Width, Height}, spread}));
}

TEST(ExportPlanTest, AnchorsLandOnTheFirstOutputPageOfTheirSpreadMovedByItsOffset)
{
    Kernel::Counted<BookChapter> const first = Chapter({{"LR", "L"}});
    Kernel::Counted<BookChapter> const second = Chapter({{"R", "lr"}});
    auto const anchor = [](char const * uid, int spread, Kernel::Point point) {
        AnchorInfo info;
        info.m_Uid = uid;
        info.m_SpreadIndex = spread;
        info.m_TargetPoint = point;
        return info;
    };
    first->SetAnchors({anchor("a", 1, {10, 20}), anchor("twice", 0, {1, 1})});
    second->SetAnchors({anchor("b", 0, {30, 40}), anchor("hidden", 1, {5, 5}), anchor("twice", 0, {2, 2})});
    PlannedExport plan({first, second}, false, true, false);
    plan.CollateAnchors(first);
    plan.CollateAnchors(second);

    struct Row
    {
        char const * uid;
        int page;
        Kernel::Point position;
    };
    for (Row const & row : {Row{"a", 2, {10, 20}}, Row{"b", 2, {30 + Width, 40}}, Row{"hidden", -1, {5, 5}},
                            Row{"twice", 2, {2 + Width, 2}}}) {
        ExportBookCommand::AnchorTarget const * const target = plan.GetAnchorTarget(row.uid);
        ASSERT_NE(target, nullptr) << row.uid;
        EXPECT_EQ(target->m_Page, row.page) << row.uid;
        EXPECT_EQ(target->m_Position, row.position) << row.uid;
    }
    EXPECT_EQ(plan.GetAnchorTarget("nowhere"), nullptr);
    EXPECT_EQ(plan.GetChapterOffset(1), 1);
    EXPECT_EQ(plan.GetChapterFirstPageOffset(1), Right);
    EXPECT_EQ(plan.GetChapterOffset(7), -1);
}

TEST(ExportPlanTest, AnAbortedPlanStops)
{
    PlannedExport plan({{{"R", "LR"}}}, false, false, false);
    plan.Abort();
    plan.BuildPageMaps();
    EXPECT_EQ(plan.GetPrintersMarksForTarget(1), nullptr);
}

}

}
