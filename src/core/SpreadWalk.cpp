#include "core/SpreadWalk.h"

#include <algorithm>
#include <cmath>

namespace Book::SpreadWalk
{

namespace
{

/// In points: closer than any press can tell.
constexpr double Tolerance = 0.005;

bool AgreeWithinTolerance(double a, double b)
{
    return std::abs(a - b) <= Tolerance;
}

int PagesOf(const SpreadInfo & spread)
{
    return static_cast<int>(spread.m_PageRects.size());
}

bool Exports(const Spreads & spreads, Place place)
{
    return !spreads[static_cast<std::size_t>(place.m_Spread)].m_NonExporting[static_cast<std::size_t>(place.m_Page)];
}

/// Pages of the spread at `index`, 0 if the chapter has no such spread.
int PagesAt(const Spreads & spreads, int index)
{
    return index < 0 || index >= static_cast<int>(spreads.size()) ? 0
                                                                  : PagesOf(spreads[static_cast<std::size_t>(index)]);
}

Kernel::Rect At(std::vector<Kernel::Rect> const & rects, int page)
{
    return page < 0 || page >= static_cast<int>(rects.size()) ? Kernel::Rect{} : rects[static_cast<std::size_t>(page)];
}

}

int PageCount(const Spreads & spreads)
{
    int count = 0;
    for (const SpreadInfo & spread : spreads) {
        count += PagesOf(spread);
    }
    return count;
}

int ExportingPageCount(const Spreads & spreads)
{
    std::ptrdiff_t count = 0;
    for (const SpreadInfo & spread : spreads) {
        count += std::count(spread.m_NonExporting.begin(), spread.m_NonExporting.end(), false);
    }
    return static_cast<int>(count);
}

bool AllNonExporting(const Spreads & spreads)
{
    // Asked at every step of a walk, and answered by the first spreads nearly always.
    return std::all_of(spreads.begin(), spreads.end(), [](const SpreadInfo & spread) {
        return std::find(spread.m_NonExporting.begin(), spread.m_NonExporting.end(), false) ==
               spread.m_NonExporting.end();
    });
}

Place FirstExporting(const Spreads & spreads)
{
    for (int spread = 0; spread < static_cast<int>(spreads.size()); ++spread) {
        for (int page = 0; page < PagesAt(spreads, spread); ++page) {
            if (Exports(spreads, {spread, page})) {
                return {spread, page};
            }
        }
    }
    return {};
}

Place LastExporting(const Spreads & spreads)
{
    if (spreads.empty()) {
        return {};
    }
    const int lastSpread = static_cast<int>(spreads.size()) - 1;
    for (int spread = lastSpread; spread >= 0; --spread) {
        for (int page = PagesAt(spreads, spread) - 1; page >= 0; --page) {
            if (Exports(spreads, {spread, page})) {
                return {spread, page};
            }
        }
    }
    return {lastSpread, std::max(PagesAt(spreads, lastSpread) - 1, 0)};
}

Place NextExporting(const Spreads & spreads, Place from)
{
    const bool everyPage = AllNonExporting(spreads);
    Place place = from;
    for (;;) {
        ++place.m_Page;
        while (place.m_Spread < static_cast<int>(spreads.size()) && place.m_Page >= PagesAt(spreads, place.m_Spread)) {
            ++place.m_Spread;
            place.m_Page = 0;
        }
        if (place.m_Spread >= static_cast<int>(spreads.size())) {
            return {-1, -1};
        }
        if (everyPage || Exports(spreads, place)) {
            return place;
        }
    }
}

bool IsDoublePageStart(const Spreads & spreads)
{
    const Place first = FirstExporting(spreads);
    return PagesAt(spreads, first.m_Spread) == 2 && first.m_Page == 0;
}

bool HasHangingPageEnd(const Spreads & spreads)
{
    const Place last = LastExporting(spreads);
    const int pages = PagesAt(spreads, last.m_Spread);
    return pages == 1 || (pages == 2 && last.m_Page == 0);
}

bool JoinsPrevious(const Spreads & spreads, const Spreads & previous, bool isVerticalStack)
{
    if (spreads.empty() || previous.empty()) {
        return false;
    }
    const Place first = FirstExporting(spreads);
    const Place last = LastExporting(previous);
    const SpreadInfo & ours = spreads[static_cast<std::size_t>(first.m_Spread)];
    const SpreadInfo & theirs = previous[static_cast<std::size_t>(last.m_Spread)];

    Kernel::Rect const theirBleed = At(theirs.m_PageBoxes, last.m_Page);
    Kernel::Rect const ourBleed = At(ours.m_PageBoxes, first.m_Page);
    // Sizes are compared at the place that the hanging page has, which is the first one: all pages of a spread that
    // somebody joins are meant to be of its size.
    Kernel::Rect const theirPage = Kernel::RoundedOutwards(At(theirs.m_PageRects, last.m_Page), Tolerance);
    Kernel::Rect const ourPage = Kernel::RoundedOutwards(At(ours.m_PageRects, last.m_Page), Tolerance);
    if (theirPage.Width() != ourPage.Width() || theirPage.Height() != ourPage.Height()) {
        return false;
    }
    if (PagesOf(ours) == 1 && PagesOf(theirs) == 1) {
        return AgreeWithinTolerance(theirBleed.left, ourBleed.left) &&
               AgreeWithinTolerance(theirBleed.top, ourBleed.top) &&
               AgreeWithinTolerance(theirBleed.right, ourBleed.right) &&
               AgreeWithinTolerance(theirBleed.bottom, ourBleed.bottom);
    }
    if (isVerticalStack) {
        // Pages that stack are cut along one edge, so their bleeds have to be equal to the last digit; across the fold
        // below the tolerance hides nothing that could be seen.
        if (theirBleed.left != ourBleed.left || theirBleed.right != ourBleed.right) {
            return false;
        }
        const double theirEdge = first.m_Page == 0 ? theirBleed.top : theirBleed.bottom;
        const double ourEdge = last.m_Page == 0 ? ourBleed.top : ourBleed.bottom;
        return theirEdge == ourEdge;
    }
    if (!AgreeWithinTolerance(theirBleed.top, ourBleed.top) ||
        !AgreeWithinTolerance(theirBleed.bottom, ourBleed.bottom)) {
        return false;
    }
    const double theirEdge = first.m_Page == 0 ? theirBleed.left : theirBleed.right;
    const double ourEdge = last.m_Page == 0 ? ourBleed.left : ourBleed.right;
    return AgreeWithinTolerance(theirEdge, ourEdge);
}

int PaddingAfter(const Spreads & spreads, const Spreads & previous)
{
    int padding = HasHangingPageEnd(previous) ? 1 : 0;
    const Place first = FirstExporting(spreads);
    // The document's first spread counts, also when the first page that exports lies in a later one: the sides were
    // given out from there.
    if (first.m_Page != 0 || PagesAt(spreads, 0) == 1) {
        ++padding;
    }
    return padding;
}

}
