#pragma once

#include "framework/document/PageSetup.h"
#include "framework/document/SpreadNode.h"

#include <vector>

/// Lays the pages of a growing document out on spreads.
///
/// Of facing pages, odd numbers lie right, even ones left, so a document that begins on an odd number begins with a
/// spread of one page, and one that ends on an even number ends with one.
class PageShaper
{
public:
    /// `numbers` are the page numbers of the pages that hold text, in order; at least one. A document whose next
    /// chapter wants a right-hand page gets a blank page behind them where it ends on one.
    [[nodiscard]] static std::vector<std::vector<SpreadPage>> Shape(PageSetup const & setup,
                                                                    std::vector<unsigned int> const & numbers);

    [[nodiscard]] static PageSide SideOf(PageSetup const & setup, unsigned int number);
    /// Name of the master of a page with text, by its place in the flow.
    [[nodiscard]] static String const & MasterOf(PageSetup const & setup, std::size_t pageOfFlow);
};
