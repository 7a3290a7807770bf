#include "output/PaginatorBook.h"

namespace Book
{

std::vector<PaginatorPage> PaginatorBook::Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                                   std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                   Renderer::OrientationEnum orientation, double scale,
                                                   bool includeBleed) const
{
    std::vector<PaginatorSource> const pages = InReadingOrder(sources);
    std::vector<PaginatorSource> imposed;
    for (std::size_t first = 0; first < pages.size(); first += 4) {
        for (std::size_t const step : {3, 0, 1, 2}) {
            imposed.push_back(PageOrBlank(pages, first + step));
        }
    }
    return PaginatorFolded::Paginate(paper, imposed, pageIndices, fit, orientation, scale, includeBleed);
}

}
