#include "framework/document/PageShaper.h"

#include "framework/kernel/Assert.h"

PageSide PageShaper::SideOf(PageSetup const & setup, unsigned int number)
{
    return !setup.m_FacingPages ? PageSide::Single : 0 == number % 2 ? PageSide::Left : PageSide::Right;
}

String const & PageShaper::MasterOf(PageSetup const & setup, std::size_t pageOfFlow)
{
    return 0 == pageOfFlow ? setup.m_FirstMaster : setup.m_BodyMaster;
}

std::vector<std::vector<SpreadPage>> PageShaper::Shape(PageSetup const & setup,
                                                       std::vector<unsigned int> const & numbers)
{
    KORVANE_ASSERT(!numbers.empty());
    std::vector<SpreadPage> pages;
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        SpreadPage page;
        page.m_Side = SideOf(setup, numbers[i]);
        page.m_Master = MasterOf(setup, i);
        pages.push_back(std::move(page));
    }
    if (ChapterStart::RightPage == setup.m_ChapterStart && PageSide::Right == pages.back().m_Side) {
        SpreadPage blank;
        blank.m_Side = PageSide::Left;
        blank.m_Blank = true;
        pages.push_back(std::move(blank));
    }

    std::vector<std::vector<SpreadPage>> spreads;
    for (SpreadPage & page : pages) {
        // A right-hand page joins the left-hand page before it; where a section's number breaks the row, it stands
        // alone.
        bool const joins = PageSide::Right == page.m_Side && !spreads.empty() && 1 == spreads.back().size() &&
                           PageSide::Left == spreads.back().front().m_Side;
        double const x = joins && !setup.m_VerticalStack ? setup.m_PageSize.width : 0;
        double const y = joins && setup.m_VerticalStack ? setup.m_PageSize.height : 0;
        page.m_Rect = {x, y, x + setup.m_PageSize.width, y + setup.m_PageSize.height};
        page.m_Bleed = setup.m_Bleed;
        if (!joins) {
            spreads.emplace_back();
        }
        spreads.back().push_back(std::move(page));
    }
    return spreads;
}
