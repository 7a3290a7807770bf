#pragma once

#include "output/Paginator.h"

namespace Book
{

/// Each page on a sheet of its own. Neither the paper nor the wish for bleed changes the result.
class PaginatorSingle final : public Paginator
{
public:
    using Paginator::Paginate;
    std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                        std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                        Renderer::OrientationEnum orientation, double scale,
                                        bool includeBleed) const override;
};

}
