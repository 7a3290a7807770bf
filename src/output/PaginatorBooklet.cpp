#include "output/PaginatorBooklet.h"

namespace Book
{

std::vector<PaginatorPage> PaginatorBooklet::Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                                      std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                      Renderer::OrientationEnum orientation, double scale,
                                                      bool includeBleed) const
{
    std::vector<PaginatorSource> const pages = InReadingOrder(sources);
    std::vector<PaginatorSource> imposed;
    std::size_t const count = (pages.size() + 3) / 4 * 4;
    for (std::size_t sheet = 0; sheet < count / 4; ++sheet) {
        std::size_t const back = count - 2 * sheet;
        std::size_t const front = 2 * sheet;
        for (std::size_t const page : {back - 1, front, front + 1, back - 2}) {
            imposed.push_back(PageOrBlank(pages, page));
        }
    }
    return PaginatorFolded::Paginate(paper, imposed, pageIndices, fit, orientation, scale, includeBleed);
}

}
