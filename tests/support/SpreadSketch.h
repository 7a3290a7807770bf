#pragma once

#include "core/SpreadInfo.h"

#include <string_view>
#include <vector>

namespace TestSupport
{

/// Spreads from a sketch: spreads are separated by '|', each character is a page of 100 by 200 points, 'x' one that is
/// left out of output. "o|oo|ox" is a single page, a double page, and a double page whose second page is left out.
inline std::vector<Book::SpreadInfo> SketchSpreads(std::string_view sketch)
{
    std::vector<Book::SpreadInfo> spreads;
    bool startsSpread = true;
    for (char const c : sketch) {
        if (c == '|') {
            startsSpread = true;
            continue;
        }
        if (startsSpread) {
            spreads.emplace_back();
            startsSpread = false;
        }
        Book::SpreadInfo & spread = spreads.back();
        double const left = 100.0 * static_cast<double>(spread.m_PageRects.size());
        spread.m_PageRects.push_back({left, 0, left + 100, 200});
        spread.m_PageBoxes.push_back({});
        spread.m_NonExporting.push_back(c == 'x');
    }
    return spreads;
}

}
