#pragma once

#include "output/PaginatorFolded.h"

namespace Book
{

/// Sheets that are folded one by one and gathered: four pages each.
/// Each pair of sides is the front and the back of one sheet. A choice of pages drops sides, and leaves the others as
/// they are.
class PaginatorBook final : public PaginatorFolded
{
public:
    PaginatorBook(bool vertical, bool insertBlank) : PaginatorFolded(vertical, insertBlank) {}

    using PaginatorFolded::Paginate;
    std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                        std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                        Renderer::OrientationEnum orientation, double scale,
                                        bool includeBleed) const override;
};

}
