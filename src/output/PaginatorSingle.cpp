#include "output/PaginatorSingle.h"

namespace Book
{

std::vector<PaginatorPage> PaginatorSingle::Paginate(Kernel::RectT<double>, std::vector<PaginatorSource> & sources,
                                                     std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                     Renderer::OrientationEnum orientation, double scale, bool) const
{
    FilterSources(sources, pageIndices);
    std::vector<PaginatorPage> sheets;
    for (PaginatorSource const & source : sources) {
        if (sheets.size() == MaximumSheets) {
            break;
        }
        sheets.push_back(MakeSingleSheet(source, fit, orientation, scale));
    }
    return sheets;
}

}
