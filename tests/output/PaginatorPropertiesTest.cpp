// What holds for every book, on random ones.

#include "output/ExportBookCommand.h"
#include "output/PaginatorBook.h"
#include "output/PaginatorBooklet.h"
#include "output/PaginatorNUp.h"
#include "output/PaginatorSingle.h"
#include "output/PaginatorTiled.h"

#include "SheetSketch.h"

#include <gtest/gtest.h>

#include <rapidcheck/gtest.h>

#include <array>
#include <map>
#include <numeric>
#include <set>

namespace Book
{
namespace
{

using namespace Renderer;
using namespace SheetSketch;

int Between(int from, int to)
{
    return *rc::gen::inRange(from, to + 1);
}

bool Coin()
{
    return *rc::gen::arbitrary<bool>();
}

/// A chapter of up to five spreads of one or two pages, some of which are left out of output.
Kernel::Counted<BookChapter const> RandomChapter()
{
    auto const chapter = Kernel::MakeCounted<BookChapter>(String("/books/chapter.kvdoc"));
    bool const vertical = Coin();
    bool const leavesOut = Coin();
    std::vector<SpreadInfo> spreads(static_cast<std::size_t>(Between(1, 5)));
    for (SpreadInfo & spread : spreads) {
        double at = 0;
        for (int page = Between(1, 2); page > 0; --page) {
            double const size = vertical ? 200 : 100;
            spread.m_PageRects.push_back(vertical ? Kernel::Rect{0, at, 100, at + size} : Kernel::Rect{at, 0, at + size, 200});
            spread.m_PageBoxes.push_back(Bleed3);
            spread.m_NonExporting.push_back(leavesOut && Coin());
            at += size;
        }
    }
    chapter->SetSpreadInfo(spreads);
    chapter->SetIsFacingPages(Coin());
    chapter->SetIsVerticalStack(vertical);
    return chapter;
}

std::vector<Kernel::Counted<BookChapter const>> RandomChapters()
{
    std::vector<Kernel::Counted<BookChapter const>> chapters;
    for (int count = Between(1, 6); count > 0; --count) {
        chapters.push_back(RandomChapter());
    }
    return chapters;
}

class Plan : public ExportBookCommand
{
public:
    Plan(std::vector<Kernel::Counted<BookChapter const>> chapters, bool pad, bool merge, bool singlePages)
        : ExportBookCommand(std::move(chapters), "/out/book.pdf", {}, {}, false, false, false, singlePages, nullptr)
    {
        SetStrayHandling(pad, merge);
        BuildExportMap();
    }
};

RC_GTEST_PROP(ExportPlanProperties, EveryPageThatExportsLandsExactlyOnceAndInOrder, ())
{
    auto const chapters = RandomChapters();
    Plan const plan(chapters, Coin(), Coin(), Coin());
    std::vector<std::array<int, 3>> landed;
    for (ExportPageEntry const & entry : plan.GetExportMap()) {
        RC_ASSERT(entry.size() == 1 || entry.size() == 2);
        for (ExportPageRef const & ref : entry) {
            if (!ref.IsPadding()) {
                landed.push_back({ref.m_Chapter, ref.m_Spread, ref.m_Page});
            }
        }
    }
    std::vector<std::array<int, 3>> expected;
    for (std::size_t chapter = 0; chapter < chapters.size(); ++chapter) {
        auto const spreads = chapters[chapter]->GetSpreadInfo();
        for (std::size_t spread = 0; spread < spreads.size(); ++spread) {
            for (std::size_t page = 0; page < spreads[spread].m_PageRects.size(); ++page) {
                if (chapters[chapter]->AllNonExporting() || !spreads[spread].m_NonExporting[page]) {
                    expected.push_back({static_cast<int>(chapter), static_cast<int>(spread), static_cast<int>(page)});
                }
            }
        }
    }
    RC_ASSERT(landed == expected);
}

RC_GTEST_PROP(ExportPlanProperties, WeightsCountTheOutputPagesAndBlanksComeOnlyIfStraysArePadded, ())
{
    bool const pad = Coin();
    Plan plan(RandomChapters(), pad, Coin(), Coin());
    std::vector<float> weights;
    plan.GetPagesPerStage(weights);
    RC_ASSERT(std::accumulate(weights.begin(), weights.end(), 0.0F) == static_cast<float>(plan.GetExportMap().size()));
    for (ExportPageEntry const & entry : plan.GetExportMap()) {
        RC_ASSERT(pad || std::none_of(entry.begin(), entry.end(), [](auto const & ref) { return ref.IsPadding(); }));
    }
}

RC_GTEST_PROP(ExportPlanProperties, ALookUpFindsTheFirstPageOfItsSpread, ())
{
    auto const chapters = RandomChapters();
    Plan const plan(chapters, Coin(), Coin(), Coin());
    int const chapter = Between(0, static_cast<int>(chapters.size()) - 1);
    int const spread = Between(-1, 5);
    int expected = -1;
    Kernel::Point moved{1, 2};
    for (std::size_t page = 0; page < plan.GetExportMap().size() && expected == -1; ++page) {
        for (ExportPageRef const & ref : plan.GetExportMap()[page]) {
            if (expected == -1 && ref.m_Chapter == chapter && ref.m_Spread == spread) {
                expected = static_cast<int>(page) + 1;
                moved = {1 + ref.m_Offset.width, 2 + ref.m_Offset.height};
            }
        }
    }
    Kernel::Point position{1, 2};
    RC_ASSERT(plan.OutputPageFromSpreadPos(chapters[static_cast<std::size_t>(chapter)], spread, position) == expected);
    RC_ASSERT(position == moved);
}

/// The running numbers on one side of a sheet, by place; -1 for an empty one.
std::array<int, 2> Cells(std::vector<PaginatorPage> const & sides, std::size_t side)
{
    std::array<int, 2> cells{-1, -1};
    for (PaginatorTarget const & target : side < sides.size() ? sides[side].m_Targets : std::vector<PaginatorTarget>()) {
        cells[target.m_Transform.Map({target.m_PageRect.left, 0}).x >= 100 ? 1 : 0] = target.m_Index;
    }
    return cells;
}

/// Leafs through sheets that were printed on both sides and folded: the left half of a front lies behind its right half,
/// the right half of its back behind the back's left half.
std::vector<int> Leaf(std::vector<PaginatorPage> const & sides, std::size_t first, std::size_t sheets)
{
    std::vector<int> front;
    std::vector<int> behind;
    for (std::size_t sheet = first; sheet < first + sheets; ++sheet) {
        auto const outside = Cells(sides, 2 * sheet);
        auto const inside = Cells(sides, 2 * sheet + 1);
        front.insert(front.end(), {outside[1], inside[0]});
        behind.insert(behind.begin(), {inside[1], outside[0]});
    }
    front.insert(front.end(), behind.begin(), behind.end());
    return front;
}

std::vector<PaginatorPage> Fold(Paginator const & layout, int pages)
{
    std::vector<PaginatorSource> sources = Pages(pages);
    std::vector<int> chosen = AllOf(sources);
    return layout.Paginate(NoPaper, sources, chosen, FitTypeScale, OrientationAuto, 1, false);
}

RC_GTEST_PROP(FoldedPaginatorProperties, FoldedSheetsReadInOrder, ())
{
    // Full sheets, as a side of two blanks is dropped.
    int const pages = 4 * Between(1, 30);
    std::vector<int> expected(static_cast<std::size_t>(pages));
    std::iota(expected.begin(), expected.end(), 0);
    std::vector<PaginatorPage> const nested = Fold(PaginatorBooklet(false, false), pages);
    RC_ASSERT(nested.size() == static_cast<std::size_t>(pages) / 2);
    RC_ASSERT(Leaf(nested, 0, nested.size() / 2) == expected);

    std::vector<PaginatorPage> const gathered = Fold(PaginatorBook(false, false), pages);
    std::vector<int> read;
    for (std::size_t sheet = 0; sheet < gathered.size() / 2; ++sheet) {
        std::vector<int> const four = Leaf(gathered, sheet, 1);
        read.insert(read.end(), four.begin(), four.end());
    }
    RC_ASSERT(read == expected);
}

RC_GTEST_PROP(FoldedPaginatorProperties, EveryPageIsPrintedExactlyOnce, ())
{
    int const pages = Between(1, 60);
    bool const blank = Coin();
    bool const vertical = Coin();
    PaginatorBook const book(vertical, blank);
    PaginatorBooklet const booklet(vertical, blank);
    for (Paginator const * layout : {static_cast<Paginator const *>(&book), static_cast<Paginator const *>(&booklet)}) {
        std::map<int, int> seen;
        for (PaginatorPage const & side : Fold(*layout, pages)) {
            RC_ASSERT(!side.m_Targets.empty());
            for (PaginatorTarget const & target : side.m_Targets) {
                ++seen[target.m_Index];
            }
        }
        RC_ASSERT(seen.size() == static_cast<std::size_t>(pages));
        for (auto const & [index, count] : seen) {
            RC_ASSERT(count == 1);
        }
    }
}

RC_GTEST_PROP(PaginatorTiledProperties, TilesCoverThePageAndRepeatTheOverlap, ())
{
    Kernel::Rect const page{0, 0, double(Between(20, 2000)), double(Between(20, 2000))};
    double const overlap = Between(0, 15);
    Kernel::Rect const paper{0, 0, double(Between(60, 400)), double(Between(60, 400))};
    std::vector<PaginatorSource> sources = Sources({page}, Bleed3);
    std::vector<int> all;
    auto const asked = static_cast<OrientationEnum>(Between(0, 2));
    auto const tiles = PaginatorTiled(overlap).Paginate(paper, sources, all, FitTypeScale, asked, 1, true);
    std::map<double, std::set<double>> columns;
    for (PaginatorPage const & tile : tiles) {
        Kernel::Rect const & piece = tile.m_Targets[0].m_PageRect;
        RC_ASSERT(piece.Width() > 0 && piece.Height() > 0);
        RC_ASSERT(piece.Width() <= std::max(paper.Width(), paper.Height()));
        RC_ASSERT(tile.m_Targets[0].m_Transform.a == 1 && tile.m_Targets[0].m_Transform.d == 1);
        columns[piece.left].insert(piece.right);
    }
    // From left to right: each column begins `overlap` before the end of the one before, and the last ends the page.
    double end = overlap;
    for (auto const & [left, rights] : columns) {
        RC_ASSERT(rights.size() == 1u);
        RC_ASSERT(left == end - overlap);
        end = *rights.begin();
    }
    RC_ASSERT(end == page.right);
    double bottom = 0;
    for (PaginatorPage const & tile : tiles) {
        bottom = std::max(bottom, tile.m_Targets[0].m_PageRect.bottom);
    }
    RC_ASSERT(bottom == page.bottom);
}

RC_GTEST_PROP(PaginatorProperties, EveryCropMarkLiesOnACornerOfTheSheetOrOfAPage, ())
{
    std::vector<Kernel::Rect> rects;
    for (int count = Between(1, 6); count > 0; --count) {
        rects.push_back({0, 0, double(Between(10, 300)), double(Between(10, 300))});
    }
    PaginatorSingle const single;
    PaginatorTiled const tiled(5);
    PaginatorNUp const nup(Between(1, 3), Between(1, 3), Between(1, 3), Between(0, 4), Between(0, 9), 3, Between(0, 9), 2, Coin());
    PaginatorBook const book(Coin(), Coin());
    PaginatorBooklet const booklet(Coin(), Coin());
    for (Paginator const * layout : std::initializer_list<Paginator const *>{&single, &tiled, &nup, &book, &booklet}) {
        std::vector<PaginatorSource> sources = Sources(rects, Bleed3);
        std::vector<int> chosen = AllOf(sources);
        for (PaginatorPage const & sheet :
             layout->Paginate({0, 0, 120, 100}, sources, chosen, FitTypeScale, OrientationAuto, 1, Coin())) {
            std::set<std::pair<double, double>> corners;
            auto const add = [&](Kernel::Rect const & rect) {
                corners.insert({{rect.left, rect.top}, {rect.right, rect.top}, {rect.left, rect.bottom}, {rect.right, rect.bottom}});
            };
            add(sheet.m_Rect);
            for (PaginatorTarget const & target : sheet.m_Targets) {
                add(target.m_DestRect);
            }
            for (CropMarkPos const & mark : sheet.m_CropMarks) {
                RC_ASSERT(corners.contains({mark.m_X, mark.m_Y}));
            }
        }
    }
}

}
}
