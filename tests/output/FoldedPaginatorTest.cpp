#include "output/PaginatorBook.h"
#include "output/PaginatorBooklet.h"

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

std::vector<PaginatorPage> Lay(Paginator const & layout, std::vector<PaginatorSource> sources, std::vector<int> chosen,
                               FitTypeEnum fit = FitTypeScale, double scale = 1)
{
    return layout.Paginate(NoPaper, sources, chosen, fit, OrientationAuto, scale, false);
}

/// The running numbers of a side by their places, "." for an empty one: "3 0".
Lines Places(std::vector<PaginatorPage> const & sides)
{
    Lines lines;
    for (PaginatorPage const & side : sides) {
        std::string cells[2] = {".", "."};
        for (PaginatorTarget const & target : side.m_Targets) {
            Kernel::Rect const place = target.m_Transform.MapBounds(target.m_PageRect);
            bool const second = place.left >= 100 || place.top >= 200;
            cells[second ? 1 : 0] = std::to_string(target.m_Index);
        }
        lines.push_back(cells[0] + " " + cells[1]);
    }
    return lines;
}

struct OrderRow
{
    char const * why;
    int pages;
    bool blankFirst;
    Lines book;
    Lines booklet;
};

TEST(FoldedPaginatorTest, PagesAreImposedSoThatTheFoldedSheetsReadInOrder)
{
    for (OrderRow const & row : {
             OrderRow{"two full sheets", 8, false, {"3 0", "1 2", "7 4", "5 6"}, {"7 0", "1 6", "5 2", "3 4"}},
             OrderRow{"blanks behind the last page", 6, false, {"3 0", "1 2", ". 4", "5 ."}, {". 0", "1 .", "5 2", "3 4"}},
             OrderRow{"one page: the sheet's back is two blanks and is dropped", 1, false, {". 0"}, {". 0"}},
             OrderRow{"a blank in front", 3, true, {"2 .", "0 1"}, {"2 .", "0 1"}},
             OrderRow{"a blank in front begins a further sheet", 4, true, {"2 .", "0 1", ". 3"}, {"0 .", ". 1", "2 3"}},
             OrderRow{"two pages on both sides of one leaf", 2, false, {". 0", "1 ."}, {". 0", "1 ."}},
             OrderRow{"a blank in front and blanks behind", 5, true, {"2 .", "0 1", ". 3", "4 ."}, {"0 .", "4 1", "2 3"}},
             OrderRow{"three sheets", 12, false, {"3 0", "1 2", "7 4", "5 6", "11 8", "9 10"},
                      {"11 0", "1 10", "9 2", "3 8", "7 4", "5 6"}},
             OrderRow{"no page", 0, false, {}, {}},
             OrderRow{"nothing but the blank", 0, true, {}, {}},
         }) {
        std::vector<PaginatorSource> const pages = Pages(row.pages);
        for (bool const vertical : {false, true}) {
            EXPECT_EQ(Places(Lay(PaginatorBook(vertical, row.blankFirst), pages, AllOf(pages))), row.book)
                << row.why << (vertical ? ", one above the other" : "");
        }
        EXPECT_EQ(Places(Lay(PaginatorBooklet(false, row.blankFirst), pages, AllOf(pages))), row.booklet) << row.why;
    }
}

TEST(FoldedPaginatorTest, ASideGoesOutWithBothPagesIfOneWasChosen)
{
    std::vector<PaginatorSource> const pages = Pages(8);
    EXPECT_EQ(Places(Lay(PaginatorBooklet(false, false), pages, {6})), (Lines{"1 6"}));
    EXPECT_EQ(Places(Lay(PaginatorBook(false, false), pages, {7, 0, 4})), (Lines{"3 0", "7 4"}));
    EXPECT_EQ(Places(Lay(PaginatorBooklet(false, true), pages, {7})), (Lines{"2 7"}))
        << "numbers are the pages' own, whatever the blank moves";
    EXPECT_TRUE(Lay(PaginatorBooklet(false, false), pages, {}).empty()) << "nothing was chosen";
    EXPECT_TRUE(Lay(PaginatorBooklet(false, false), pages, {8, -1}).empty()) << "a blank is never chosen";
}

TEST(FoldedPaginatorTest, EachPageIsCentredInACellOfTheLargest)
{
    // A small page of a later place on its spread, beside a large one.
    std::vector<PaginatorSource> const pages = Sources({{100, 0, 160, 120}, {0, 0, 100, 200}}, Bleed3);
    EXPECT_EQ(Describe(Lay(PaginatorBook(false, true), pages, AllOf(pages), FitTypeFill, 0.5),
                       Targets | Bleeds | Frame | Marks),
              (Lines{"0:(100 0 160 120)>(20 40 80 160) bleed(97 -3 163 123) 1:(0 0 100 200)>(100 0 200 200) "
                     "bleed(0 -3 103 203) (0 0 200 200) o1 p512 x1 17@0,0 65@200,0 20@0,200 68@200,200"}))
        << "the right-hand page is cut at the fold, the left-hand one goes over it; a square sheet is upright";
    PaginatorPage const sheet = Lay(PaginatorBook(false, true), pages, AllOf(pages), FitTypeScale, 0.5)[0];
    EXPECT_EQ(sheet.m_Targets[0].m_DestRect, sheet.m_Targets[0].m_PageRect) << "in coordinates of the spread";
    EXPECT_EQ(sheet.m_Scale, 0.5);
    EXPECT_EQ(sheet.m_Bleed, Bleed3);
}

TEST(FoldedPaginatorTest, StackedPagesAreBothCutAtTheFold)
{
    std::vector<PaginatorSource> const pages = Sources({{0, 0, 100, 40}, {0, 0, 100, 40}, {0, 0, 100, 40}}, Bleed3);
    EXPECT_EQ(Describe(Lay(PaginatorBook(true, true), pages, {0}), Targets | Bleeds | Frame),
              (Lines{"0:(0 0 100 40)>(0 0 100 40) bleed(-3 -3 103 40) 1:(0 0 100 40)>(0 40 100 80) bleed(-3 0 103 43) "
                     "(0 0 100 80) o2 p0 x1"}));
}

TEST(FoldedPaginatorTest, TheBleedOfASmallPageReachesThroughItsCellToTheFold)
{
    // 60 by 120 in a cell of 100 by 200, away from the origin of its spread: 20 and 40 lie between page and cell.
    Kernel::Rect const small{200, 10, 260, 130};
    std::vector<PaginatorSource> const pages = Sources({small, {0, 0, 100, 200}, small}, {50, 50, 50, 50});
    EXPECT_EQ(Describe(Lay(PaginatorBook(false, false), pages, {0, 2}), Targets | Bleeds),
              (Lines{"0:(200 10 260 130)>(120 40 180 160) bleed(180 -40 310 180)",
                     "1:(0 0 100 200)>(0 0 100 200) bleed(-50 -50 150 250) 2:(200 10 260 130)>(120 40 180 160) "
                     "bleed(180 -40 310 180)"}));
    EXPECT_EQ(Describe(Lay(PaginatorBook(true, true), pages, {0, 2}), Targets | Bleeds),
              (Lines{"2:(200 10 260 130)>(20 40 80 160) bleed(150 -40 310 170)",
                     "0:(200 10 260 130)>(20 40 80 160) bleed(150 -40 310 170) 1:(0 0 100 200)>(0 200 100 400) "
                     "bleed(-50 0 150 250)"}));
}

TEST(FoldedPaginatorTest, PagesWithoutSizeDoNoHarm)
{
    double const nothing = std::numeric_limits<double>::quiet_NaN();
    std::vector<PaginatorSource> const pages =
        Sources({{5, 5, 5, 5}, Kernel::Rect::Empty(), {0, 0, nothing, nothing}, {0, 0, 1e-200, 1e-200}}, Bleed3);
    EXPECT_EQ(Lay(PaginatorBook(false, false), pages, AllOf(pages)).size(), 2u);
    std::vector<PaginatorPage> const sides = Lay(PaginatorBook(false, false), {pages[1], pages[1]}, {1});
    ASSERT_EQ(sides.size(), 2u);
    EXPECT_TRUE(sides[0].m_Targets[0].m_BleedRect.IsEmpty()) << "nothing stays nothing";
    EXPECT_EQ(sides[0].m_Targets[0].m_Transform, Raster::AffineTransform::Params());
}

}
}
