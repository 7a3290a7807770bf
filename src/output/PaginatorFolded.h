#pragma once

#include "output/Paginator.h"

namespace Book
{

/// Two pages on each sheet side, so that folded sheets read in order. Derived layouts put the pages into that order.
///
/// All cells are as large as the largest page, and each page is centred in its own. There is no creep: pages keep their
/// place however many sheets are folded together. Paper, orientation and the wish for bleed don't change the result.
class PaginatorFolded : public Paginator
{
public:
    using Paginator::Paginate;

protected:
    /// `vertical`: the two pages stand one above the other instead of side by side. `insertBlank`: a blank goes in front
    /// of the first page.
    PaginatorFolded(bool vertical, bool insertBlank) : m_Vertical(vertical), m_InsertBlank(insertBlank) {}

    /// Takes `sources` two at a time, each pair for one side. A side goes out if one of its pages has its running number
    /// in `pageIndices`; it then carries both.
    std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                        std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                        Renderer::OrientationEnum orientation, double scale,
                                        bool includeBleed) const override;

    /// The pages in reading order, with the blank in front if there is to be one.
    [[nodiscard]] std::vector<PaginatorSource> InReadingOrder(std::vector<PaginatorSource> const & sources) const;
    /// Page `index` of that list, a blank behind its end.
    [[nodiscard]] static PaginatorSource PageOrBlank(std::vector<PaginatorSource> const & pages, std::size_t index);

private:
    [[nodiscard]] PaginatorTarget MakeTarget(PaginatorSource const & source, int cell,
                                             Kernel::SizeT<double> const & size) const;

    bool m_Vertical;
    bool m_InsertBlank;
};

}
