#include "output/PaginatorNUp.h"
#include "output/PaginatorSingle.h"
#include "output/PaginatorTiled.h"

#include "SheetSketch.h"

#include <gtest/gtest.h>

#include <limits>

namespace Book
{
namespace
{

using namespace Renderer;
using namespace SheetSketch;
using Lines = std::vector<std::string>;
using Placement = Geometry::FitRect;

constexpr double NotANumber = std::numeric_limits<double>::quiet_NaN();
constexpr double Infinite = std::numeric_limits<double>::infinity();

/// Opens what layouts are made of.
class Helpers : public Paginator
{
public:
    using Paginator::ApplyBleedRect;
    using Paginator::ClipBleedRect;
    using Paginator::Edges;
    using Paginator::GetPlacement;
    using Paginator::GetScale;
    using Paginator::Paginate;
    using Paginator::RectToRect;

    std::vector<PaginatorPage> Paginate(Kernel::Rect, std::vector<PaginatorSource> &, std::vector<int> &, FitTypeEnum,
                                        OrientationEnum, double, bool) const override
    {
        return {};
    }
};

std::vector<PaginatorPage> Lay(Paginator const & layout, Kernel::Rect const & paper, std::vector<PaginatorSource> sources,
                               std::vector<int> chosen = {}, FitTypeEnum fit = FitTypeScale,
                               OrientationEnum orientation = OrientationAuto, double scale = 1, bool bleed = false)
{
    return layout.Paginate(paper, sources, chosen, fit, orientation, scale, bleed);
}

TEST(PaginatorTest, BleedIsCutOnThreeSidesAndNeverOnTheRight)
{
    Helpers const helpers;
    Kernel::Rect const bleed{-3, -3, 103, 203};
    Kernel::Rect const limit{0, 0, 100, 200};
    struct Row
    {
        int edges;
        Kernel::Rect expected;
    };
    for (Row const & row : {Row{0, bleed}, Row{1, {0, -3, 103, 203}}, Row{2, {-3, 0, 103, 203}}, Row{4, bleed},
                            Row{8, {-3, -3, 103, 200}}, Row{15, {0, 0, 103, 200}}}) {
        EXPECT_EQ(helpers.ClipBleedRect(bleed, limit, static_cast<Helpers::Edges>(row.edges)), row.expected) << row.edges;
    }
    Kernel::Rect const nothing = Kernel::Rect::Empty();
    EXPECT_EQ(helpers.ClipBleedRect(nothing, limit, static_cast<Helpers::Edges>(15)), nothing);
    EXPECT_EQ(helpers.ApplyBleedRect(nothing, Bleed3), nothing);
    EXPECT_EQ(helpers.ApplyBleedRect({10, 20, 30, 40}, {1, 2, 3, 4}), (Kernel::Rect{9, 18, 33, 44}));
}

TEST(PaginatorTest, OneRectangleIsMappedOntoAnotherAxisByAxis)
{
    using Map = Raster::AffineTransform::Params;
    struct Row
    {
        char const * why;
        Kernel::Rect from;
        Kernel::Rect to;
        Map expected;
    };
    for (Row const & row : {
             Row{"each axis has its own factor", {10, 20, 20, 40}, {100, 0, 150, 10}, {5, 0, 0, 0.5, 50, -10}},
             Row{"no width to no width: only moved", {10, 0, 10, 10}, {30, 0, 30, 10}, {1, 0, 0, 1, 20, 0}},
             Row{"no width to some: the identity as a whole", {10, 0, 10, 10}, {30, 5, 40, 25}, {}},
             Row{"no height to some: the same", {0, 10, 10, 10}, {30, 5, 40, 25}, {}},
             Row{"from nothing", Kernel::Rect::Empty(), {0, 0, 5, 5}, {}},
             Row{"to nothing", {0, 0, 5, 5}, Kernel::Rect::Empty(), {}},
         }) {
        EXPECT_EQ(Helpers::RectToRect(row.from, row.to), row.expected) << row.why;
    }
}

TEST(PaginatorTest, FittingDecidesPlacementAndScale)
{
    Helpers const helpers;
    struct Row
    {
        int fit;
        unsigned placement;
        double scale;
    };
    for (Row const & row : {Row{0, 0, 0.7}, Row{1, 768, 1}, Row{2, 512, 1}, Row{9, 0, 0.7}}) {
        EXPECT_EQ(Helpers::GetPlacement(static_cast<FitTypeEnum>(row.fit)), row.placement) << row.fit;
        EXPECT_EQ(helpers.GetScale(static_cast<FitTypeEnum>(row.fit), 0.7), row.scale) << row.fit;
    }
}

TEST(PaginatorSingleTest, EachPageHasASheetInItsOwnCoordinates)
{
    std::vector<PaginatorSource> const pages = Sources({{0, 0, 100, 200}, {100, 0, 400, 200}, {0, 0, 50, 50}}, Bleed3);
    EXPECT_EQ(Describe(Lay(PaginatorSingle(), NoPaper, pages, {}, FitTypeScale, OrientationAuto, 0.5),
                       Targets | Bleeds | Frame | Marks),
              (Lines{"0:(0 0 100 200)>(0 0 100 200) bleed(-3 -3 103 203) (0 0 100 200) o1 p0 x0.5 17@0,0 65@100,0 20@0,200 "
                     "68@100,200",
                     "1:(100 0 400 200)>(100 0 400 200) bleed(97 -3 403 203) (100 0 400 200) o2 p0 x0.5 17@100,0 65@400,0 "
                     "20@100,200 68@400,200",
                     "2:(0 0 50 50)>(0 0 50 50) bleed(-3 -3 53 53) (0 0 50 50) o1 p0 x0.5 17@0,0 65@50,0 20@0,50 68@50,50"}))
        << "a square page is upright";
    EXPECT_EQ(Describe(Lay(PaginatorSingle(), NoPaper, pages, {1, 1, 0}, FitTypeShrink, OrientationPortrait, 0.5), Frame),
              (Lines{"(100 0 400 200) o1 p768 x1", "(100 0 400 200) o1 p768 x1", "(0 0 100 200) o1 p768 x1"}))
        << "in the order of the choice, repeats included";
    EXPECT_EQ(Describe(Lay(PaginatorSingle(), NoPaper, pages, {0}, FitTypeFill, OrientationLandscape, 0.5), Frame),
              (Lines{"(0 0 100 200) o2 p512 x1"}));
    EXPECT_TRUE(Lay(PaginatorSingle(), NoPaper, pages, {-1, 3, 2000000000}).empty()) << "no such pages";
    EXPECT_TRUE(Lay(PaginatorSingle(), NoPaper, {}).empty());
}

TEST(PaginatorSingleTest, TheSheetHasTheLargestBleedOfEachSide)
{
    std::vector<PaginatorSource> pages = Pages(1);
    pages[0].m_PageBox = {1, -2, 3, 0};
    EXPECT_EQ(Lay(PaginatorSingle(), NoPaper, pages)[0].m_Bleed, (Kernel::Rect{1, 0, 3, 0}));
}

TEST(PaginatorTiledTest, TilesOverlapAndCoverThePage)
{
    // 300 by 200 on paper of 110 by 110 that repeats 10: tiles advance by 100, three by two of them, and what they have too
    // much, 10 each way, is divided between both ends.
    std::vector<PaginatorSource> const page = Sources({{0, 0, 300, 200}}, Bleed3);
    Kernel::Rect const paper{0, 0, 110, 110};
    EXPECT_EQ(Describe(Lay(PaginatorTiled(10), paper, page), Targets),
              (Lines{"0:(0 0 105 105)>(5 5 110 110)", "0:(0 95 105 200)>(5 0 110 105)", "0:(95 0 205 105)>(0 5 110 110)",
                     "0:(95 95 205 200)>(0 0 110 105)", "0:(195 0 300 105)>(0 5 105 110)",
                     "0:(195 95 300 200)>(0 0 105 105)"}));
    EXPECT_EQ(Describe(Lay(PaginatorTiled(10), paper, page), Bleeds | Frame | Marks),
              (Lines{"bleed(-3 -3 105 105) (5 5 110 110) o2 p128 x1 17@5,5", "bleed(-3 95 105 203) (5 0 110 105) o2 p4 x1 20@5,105",
                     "bleed(92 -3 208 105) (0 5 110 110) o2 p64 x1", "bleed(92 95 208 203) (0 0 110 105) o2 p2 x1",
                     "bleed(195 -3 303 105) (0 5 105 110) o2 p32 x1 65@105,5",
                     "bleed(195 95 303 203) (0 0 105 105) o2 p1 x1 68@105,105"}))
        << "each is pushed against its joins; the middle column keeps its bleed over both";
}

struct TileRow
{
    char const * why;
    Kernel::Rect page;
    Kernel::Rect paper;
    double overlap;
    OrientationEnum orientation;
    double scale;
    Lines expected;
};

TEST(PaginatorTiledTest, PaperScaleAndOrientationDecideTheTiles)
{
    for (TileRow const & row : {
             TileRow{"one tile: centred, all four marks", {0, 0, 100, 200}, {0, 0, 120, 240}, 10, OrientationAuto, 1,
                     {"0:(0 0 100 200)>(10 20 110 220) (10 20 110 220) o1 p0 x1 17@10,20 65@110,20 20@10,220 68@110,220"}},
             TileRow{"fewer tiles if the paper is turned", {0, 0, 200, 100}, {0, 0, 100.5, 200}, 0, OrientationAuto, 1,
                     {"0:(0 0 200 100)>(0 0 200 100) (0 0 200 100) o2 p0 x1 17@0,0 65@200,0 20@0,100 68@200,100"}},
             TileRow{"upright paper that was asked for", {0, 0, 200, 100}, {0, 0, 100, 200}, 0, OrientationPortrait, 1,
                     {"0:(0 0 100 100)>(0 50 100 150) (0 50 100 150) o1 p16 x1 17@0,50 20@0,150",
                      "0:(100 0 200 100)>(0 50 100 150) (0 50 100 150) o1 p8 x1 65@100,50 68@100,150"}},
             TileRow{"a tie: the page's own shape decides", {0, 0, 100, 100}, {0, 0, 120, 120}, 0, OrientationAuto, 1,
                     {"0:(0 0 100 100)>(10 10 110 110) (10 10 110 110) o1 p0 x1 17@10,10 65@110,10 20@10,110 68@110,110"}},
             TileRow{"one column, three rows: the middle one is not cut", {0, 0, 90, 300}, {0, 0, 90, 100}, 0,
                     OrientationPortrait, 1,
                     {"0:(0 0 90 100)>(0 0 90 100) (0 0 90 100) o1 p64 x1 17@0,0 65@90,0",
                      "0:(0 100 90 200)>(0 0 90 100) (0 0 90 100) o1 p0 x1",
                      "0:(0 200 90 300)>(0 0 90 100) (0 0 90 100) o1 p2 x1 20@0,100 68@90,100"}},
             TileRow{"a page away from its spread's origin", {100, 10, 150, 60}, {0, 0, 50, 50}, 0, OrientationAuto, 1,
                     {"0:(100 10 150 60)>(0 0 50 50) (0 0 50 50) o1 p0 x1 17@0,0 65@50,0 20@0,50 68@50,50"}},
             TileRow{"scale 2: two tiles are counted for the doubled page, and each covers twice the paper",
                     {0, 0, 90, 100}, {0, 0, 100, 200}, 0, OrientationPortrait, 2,
                     {"0:(0 0 90 100)>(10 0 55 50) (10 0 55 50) o1 p16 x2 17@10,0 20@10,50",
                      "0:(90 0 90 100)>(0 0 0 50) (0 0 0 0) o1 p8 x2 65@0,0 68@0,50"}},
             TileRow{"a tie with a wide page: the paper is turned", {0, 0, 120, 60}, {0, 0, 130, 140}, 10, OrientationAuto, 1,
                     {"0:(0 0 120 60)>(10 35 130 95) (10 35 130 95) o2 p0 x1 17@10,35 65@130,35 20@10,95 68@130,95"}},
             TileRow{"turned paper loses its fractions of a point", {0, 0, 100, 200}, {0, 0, 100.75, 200.875}, 0,
                     OrientationLandscape, 1,
                     {"0:(0 0 100 100)>(50 0 150 100) (50 0 150 100) o2 p64 x1 17@50,0 65@150,0",
                      "0:(0 100 100 200)>(50 0 150 100) (50 0 150 100) o2 p2 x1 20@50,100 68@150,100"}},
             TileRow{"an overlap of half a point: tiles are counted in whole ones", {0, 0, 199, 50}, {0, 0, 100, 100}, 0.5,
                     OrientationAuto, 1,
                     {"0:(0 0 99.75 50)>(0.25 25 100 75) (0.25 25 100 75) o2 p16 x1 17@0.25,25 20@0.25,75",
                      "0:(99.25 0 199 50)>(0 25 99.75 75) (0 25 99.75 75) o2 p8 x1 65@99.75,25 68@99.75,75"}},
             TileRow{"paper away from the origin: tiles end at its right and lower edges and begin at nothing",
                     {0, 0, 150, 150}, {10, 20, 110, 220}, 0, OrientationAuto, 1,
                     {"0:(0 0 85 150)>(25 25 110 175) (25 25 110 175) o1 p16 x1 17@25,25 20@25,175",
                      "0:(85 0 150 150)>(0 25 65 175) (0 25 65 175) o1 p8 x1 65@65,25 68@65,175"}},
             TileRow{"scale 0.5: counted for the halved page, and each tile covers half the paper; the overlap is doubled",
                     {0, 0, 400, 300}, {0, 0, 100, 120}, 20, OrientationAuto, 0.5,
                     {"0:(0 0 55 42.5)>(10 15 120 100) (10 15 120 100) o2 p128 x0.5 17@10,15",
                      "0:(0 2.5 55 52.5)>(10 0 120 100) (10 0 120 100) o2 p4 x0.5 20@10,100",
                      "0:(15 0 75 42.5)>(0 15 120 100) (0 15 120 100) o2 p32 x0.5 65@120,15",
                      "0:(15 2.5 75 52.5)>(0 0 120 100) (0 0 120 100) o2 p1 x0.5 68@120,100"}},
             TileRow{"a page that is nothing", Kernel::Rect::Empty(), {0, 0, 50, 50}, 0, OrientationAuto, 1, {}},
             TileRow{"no paper: as single pages", {0, 0, 100, 200}, {0, 0, 0, 50}, 10, OrientationAuto, 0.5,
                     {"0:(0 0 100 200)>(0 0 100 200) (0 0 100 200) o1 p0 x0.5 17@0,0 65@100,0 20@0,200 68@100,200"}},
             TileRow{"the overlap is wider than the paper: no tile gets anywhere", {0, 0, 100, 200}, {0, 0, 50, 50}, 60,
                     OrientationAuto, 1, {}},
             TileRow{"as wide as the paper", {0, 0, 100, 200}, {0, 0, 50, 50}, 50, OrientationAuto, 1, {}},
             TileRow{"a scale of nothing", {0, 0, 100, 200}, {0, 0, 50, 50}, 10, OrientationAuto, 0, {}},
             TileRow{"no number", {0, 0, NotANumber, 200}, {0, 0, 50, 50}, 10, OrientationAuto, 1, {}},
             TileRow{"paper of no number", {0, 0, 100, 200}, {0, 0, NotANumber, 50}, 10, OrientationAuto, 1, {}},
         }) {
        EXPECT_EQ(Describe(Lay(PaginatorTiled(row.overlap), row.paper, Sources({row.page}), {}, FitTypeScale,
                               row.orientation, row.scale),
                           Targets | Frame | Marks),
                  row.expected)
            << row.why;
    }
}

TEST(PaginatorTiledTest, HowManySheetsThereAreIsLimited)
{
    std::vector<PaginatorSource> const page = Sources({{0, 0, 1e6, 1e6}});
    EXPECT_EQ(Lay(PaginatorTiled(0), {0, 0, 1, 1}, page).size(), Paginator::MaximumSheets);
    EXPECT_LE(Lay(PaginatorTiled(0), {0, 0, 1, 1}, page, {}, FitTypeScale, OrientationAuto, Infinite).size(),
              Paginator::MaximumSheets);
    EXPECT_EQ(Lay(PaginatorTiled(0), Kernel::Rect::Empty(), page).size(), 1u) << "as without paper";
    EXPECT_LE(Lay(PaginatorTiled(-1e300), {0, 0, 1, 1}, page).size(), Paginator::MaximumSheets);
}

struct NUpRow
{
    char const * why;
    PaginatorNUp layout;
    int pages;
    Lines numbers;
};

TEST(PaginatorNUpTest, PagesFillTheCellsRowByRow)
{
    for (NUpRow const & row : {
             NUpRow{"the last sheet is not full", PaginatorNUp(2, 2, 1, 0, 0, 0, 0, 0, false), 5, {"0 1 2 3", "4"}},
             NUpRow{"filled up from the first page", PaginatorNUp(2, 2, 1, 0, 0, 0, 0, 0, true), 5, {"0 1 2 3", "4 0 1 2"}},
             NUpRow{"each page four times: a sheet each", PaginatorNUp(2, 2, 4, 0, 0, 0, 0, 0, false), 2, {"0 0 0 0", "1 1 1 1"}},
             NUpRow{"repeats run over the sheet's end", PaginatorNUp(2, 1, 3, 0, 0, 0, 0, 0, false), 2, {"0 0", "0 1", "1 1"}},
             NUpRow{"skipped cells", PaginatorNUp(2, 2, 1, 3, 0, 0, 0, 0, false), 2, {"0", "1"}},
             NUpRow{"more skipped than a sheet has", PaginatorNUp(2, 1, 1, 5, 0, 0, 0, 0, false), 1, {"-", "-", "0"}},
             NUpRow{"no columns and rows: one cell", PaginatorNUp(0, -3, 0, -1, 0, 0, 0, 0, false), 2, {"0", "1"}},
             NUpRow{"skipped, repeated and filled up", PaginatorNUp(2, 2, 3, 1, 0, 0, 0, 0, true), 2, {"0 0 0", "1 1 1 0"}},
             NUpRow{"skipped cells that end with a sheet", PaginatorNUp(2, 1, 1, 2, 0, 0, 0, 0, false), 1, {"-", "0"}},
             NUpRow{"pages that end with the sheet", PaginatorNUp(2, 1, 1, 0, 0, 0, 0, 0, true), 2, {"0 1"}},
             NUpRow{"no pages", PaginatorNUp(2, 2, 1, 1, 0, 0, 0, 0, true), 0, {}},
         }) {
        EXPECT_EQ(Numbers(Lay(row.layout, NoPaper, Pages(row.pages))), row.numbers) << row.why;
    }
}

TEST(PaginatorNUpTest, CellsHaveTheSizeOfTheLargestPageWithMarginsAndGapsBetween)
{
    std::vector<PaginatorSource> const pages = Sources({{0, 0, 100, 200}, {100, 0, 160, 250}, {0, 0, 10, 10}}, Bleed3);
    PaginatorNUp const layout(2, 2, 1, 1, 20, 30, 5, 7, false);
    EXPECT_EQ(Describe(Lay(layout, NoPaper, pages), Targets | Bleeds | Frame),
              (Lines{"0:(0 0 100 200)>(125 30 225 230) bleed(-3 -3 103 203) 1:(100 0 160 250)>(20 287 80 537) "
                     "bleed(97 -3 163 253) 2:(0 0 10 10)>(125 287 135 297) bleed(-3 -3 13 13) (20 30 225 537) o1 p1025 x1"}))
        << "cells of 100 by 250, one skipped, each page in the top left of its own";
    EXPECT_EQ(Describe(Lay(layout, NoPaper, pages, {}, FitTypeScale, OrientationAuto, 1, true), Frame),
              (Lines{"(20 30 237 549) o1 p1025 x1"}))
        << "with bleed the cells are 106 by 256";
    EXPECT_EQ(Describe(Lay(layout, NoPaper, pages), Marks),
              (Lines{"33@125,30 65@225,30 40@125,230 72@225,230 18@20,287 130@80,287 20@20,537 132@80,537 34@125,287 "
                     "66@135,287 36@125,297 68@135,297"}))
        << "four for each page, on its own corners";
}

TEST(PaginatorNUpTest, BleedWidensTheCellsByTheLargestMarginsAndLeavesThePagesTheirSize)
{
    std::vector<PaginatorSource> pages = Sources({{0, 0, 100, 200}, {-20, -10, 70, 210}}, {1, 2, 3, 4});
    pages[1].m_PageBox = {10, 0, 20, -30};
    // 100 + 4 by 200 + 6, and 90 + 30 by 220 - 30.
    EXPECT_EQ(Describe(Lay(PaginatorNUp(1, 2, 1, 0, 5, 6, 50, 8, false), NoPaper, pages, {1, 0, 1}, FitTypeScale,
                           OrientationLandscape, 2, true),
                       Targets | Bleeds | Frame),
              (Lines{"1:(-20 -10 70 210)>(5 6 95 226) bleed(-30 -10 90 180) 0:(0 0 100 200)>(5 220 105 420) "
                     "bleed(-1 -2 103 204) (5 6 125 426) o2 p1025 x2",
                     "1:(-20 -10 70 210)>(5 6 95 226) bleed(-30 -10 90 180) (5 6 125 426) o2 p1025 x2"}));
    EXPECT_EQ(Lay(PaginatorNUp(2, 1, 1, 0, 0, 0, 0, 0, false), NoPaper, pages)[0].m_Bleed, (Kernel::Rect{10, 2, 20, 4}));
}

TEST(PaginatorNUpTest, FittingAndShapeDecideTheFrame)
{
    PaginatorNUp const row(3, 1, 1, 0, 0, 0, 50, 999, false);
    EXPECT_EQ(Describe(Lay(row, NoPaper, Pages(3), {}, FitTypeScale, OrientationAuto, 0.5), Frame),
              (Lines{"(0 0 400 200) o2 p1025 x0.5"}))
        << "no gap where there is one row";
    EXPECT_EQ(Describe(Lay(row, NoPaper, Pages(3), {}, FitTypeShrink, OrientationPortrait, 0.5), Frame),
              (Lines{"(0 0 400 200) o1 p1793 x1"}));
    EXPECT_EQ(Describe(Lay(row, NoPaper, Pages(3), {2}, FitTypeFill), Targets | Frame),
              (Lines{"2:(0 0 100 200)>(0 0 100 200) (0 0 400 200) o2 p1537 x1"}));
    EXPECT_EQ(Describe(Lay(row, NoPaper, Pages(3), {}, static_cast<FitTypeEnum>(7), OrientationAuto, 0.5), Frame),
              (Lines{"(0 0 400 200) o2 p0 x0.5"}))
        << "a fit that there is not leaves the placement";
    EXPECT_EQ(Describe(Lay(PaginatorNUp(2, 1, 1, 2, 0, 0, 0, 0, false), NoPaper, Pages(1)), Frame)[0],
              "(0 0 200 200) o0 p0 x1")
        << "a sheet without pages has the size of the others";
    EXPECT_EQ(Describe(Lay(PaginatorNUp(2, 1, 1, 0, 0, 0, 0, 0, false), NoPaper, Pages(1)), Frame)[0],
              "(0 0 200 200) o1 p1025 x1")
        << "a square sheet is upright";
}

TEST(PaginatorNUpTest, HowMuchThereIsIsLimited)
{
    int const huge = std::numeric_limits<int>::max();
    auto const cells = [](std::vector<PaginatorPage> const & sheets) {
        std::size_t count = 0;
        for (PaginatorPage const & sheet : sheets) {
            count += sheet.m_Targets.size();
        }
        return count;
    };
    EXPECT_EQ(Lay(PaginatorNUp(1, 1, huge, 0, 0, 0, 0, 0, false), NoPaper, Pages(1)).size(), Paginator::MaximumSheets);
    EXPECT_EQ(Lay(PaginatorNUp(1, 1, 1, huge, 0, 0, 0, 0, false), NoPaper, Pages(1)).size(), Paginator::MaximumSheets);
    EXPECT_EQ(cells(Lay(PaginatorNUp(huge, huge, 1, 0, 0, 0, 0, 0, true), NoPaper, Pages(1))), Paginator::MaximumCells);
    EXPECT_EQ(cells(Lay(PaginatorNUp(huge, huge, 1, 0, NotANumber, Infinite, 0, 0, false), NoPaper, Pages(3))), 3u);
}

}
}
