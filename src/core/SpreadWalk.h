#pragma once

#include "core/SpreadInfo.h"

#include <vector>

namespace Book
{

/// Questions about a chapter's pages that need nothing but its remembered spreads. `BookChapter` and the record's
/// published facts answer theirs with them.
///
/// An exporting page is one whose `m_NonExporting` bit is clear. A place is the pair of spread and page within it. A
/// stray is a page that has the other place of its spread free: a last page that hangs, or a first page that sits where
/// the chapter before could have put its last one.
namespace SpreadWalk
{

using Spreads = std::vector<SpreadInfo>;

/// A place in a chapter. {-1, -1} is behind the end.
struct Place
{
    int m_Spread = 0;
    int m_Page = 0;
    friend bool operator==(const Place &, const Place &) = default;
};

[[nodiscard]] int PageCount(const Spreads & spreads);
[[nodiscard]] int ExportingPageCount(const Spreads & spreads);
/// Also true without any spread.
[[nodiscard]] bool AllNonExporting(const Spreads & spreads);

/// {0, 0} if nothing exports: the walk falls back to the start.
[[nodiscard]] Place FirstExporting(const Spreads & spreads);
/// The very last page if nothing exports; {0, 0} without spreads.
[[nodiscard]] Place LastExporting(const Spreads & spreads);
/// The next exporting page behind `from`, {-1, -1} behind the last. In a chapter in which nothing exports it is simply
/// the next page, so that whoever walks such a chapter still gets every page.
[[nodiscard]] Place NextExporting(const Spreads & spreads, Place from);

/// The first exporting page opens a spread of two pages.
[[nodiscard]] bool IsDoublePageStart(const Spreads & spreads);
/// The last exporting page leaves the right-hand or lower place of its spread free.
[[nodiscard]] bool HasHangingPageEnd(const Spreads & spreads);

/// Whether the first exporting page fits beside the hanging last exporting page of `previous`: same page size, and
/// bleed margins that agree where the two pages meet. Both chapters are taken to be laid out in facing pages that stack
/// in the same direction, `this` not to open a spread of two and `previous` to hang.
[[nodiscard]] bool JoinsPrevious(const Spreads & spreads, const Spreads & previous, bool isVerticalStack);

/// Blank pages, 0 to 2, that bring the chapter's pages to their own sides behind `previous`.
[[nodiscard]] int PaddingAfter(const Spreads & spreads, const Spreads & previous);

}

}
