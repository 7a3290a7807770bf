#pragma once

#include "framework/kernel/Geometry.h"

#include <vector>

namespace Book
{

/// One page placed on an output page. In a padding slot all three indices are -1.
struct ExportPageRef
{
    int m_Chapter = -1;        ///< Index in the list of chapters that are exported.
    int m_Spread = -1;         ///< Spread in that chapter.
    int m_Page = -1;           ///< Page in that spread.
    Kernel::Size m_Offset{};   ///< Added to a position on the spread gives the position on the output page.

    [[nodiscard]] bool IsPadding() const { return m_Chapter == -1; }
    friend bool operator==(ExportPageRef const &, ExportPageRef const &) = default;
};

/// The pages of one output page: one or two of them.
using ExportPageEntry = std::vector<ExportPageRef>;

/// What an output page is made of. The plan and the writers tell the forms apart by the same tests.
enum class ExportPageForm
{
    WholeSpread,  ///< The spread goes out as it stands.
    PageOfSpread, ///< One page of a spread goes out alone.
    PageThenPad,  ///< A page with a blank after it.
    PadThenPage,  ///< A blank with a page after it.
    Merged,       ///< The last page of one chapter and the first of the next.
    Nothing,      ///< Nothing is output.
};

/// The form of an entry whose first real page lies in a spread of `spreadPageCount` pages.
[[nodiscard]] ExportPageForm FormOf(ExportPageEntry const & entry, int spreadPageCount);

/// The first ref that is no padding, null if there is none.
[[nodiscard]] ExportPageRef const * FirstReal(ExportPageEntry const & entry);

}
