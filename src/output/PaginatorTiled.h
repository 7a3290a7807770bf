#pragma once

#include "output/Paginator.h"

namespace Book
{

/// Cuts pages that are larger than the paper into tiles, each of which repeats a strip of its neighbour for gluing.
///
/// Tiles go column by column. Each is pushed against the join with its neighbour, crop marks sit on the outer corners
/// of the whole page only, and a page that leaves paper over is centred on the tiles.
///
/// The scale enlarges the page where tiles are counted, and the paper where they are cut; the two meet only at 1. Who
/// wants a page larger or smaller divides the paper and the overlap by the scale, cuts at 1, and prints the sheets
/// scaled.
class PaginatorTiled final : public Paginator
{
public:
    /// `overlap` in points on the paper.
    explicit PaginatorTiled(double overlap) : m_Overlap(overlap) {}

    using Paginator::Paginate;
    /// A paper without width or height gives each page a sheet of its own.
    std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                        std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                        Renderer::OrientationEnum orientation, double scale,
                                        bool includeBleed) const override;

private:
    /// How the tiles of one page lie.
    struct Grid
    {
        int m_Columns = 0;
        int m_Rows = 0;
        Renderer::OrientationEnum m_Orientation = Renderer::OrientationPortrait;
        Kernel::RectT<double> m_Tile;
        /// Half of what the tiles have too much.
        double m_HalfX = 0;
        double m_HalfY = 0;
    };

    [[nodiscard]] Grid MakeGrid(Kernel::RectT<double> const & paper, PaginatorSource const & source,
                                Renderer::OrientationEnum orientation, double scale) const;
    void AppendTiles(std::vector<PaginatorPage> & sheets, PaginatorSource const & source, Grid const & grid,
                     double scale) const;
    /// The sheet of tile (`column`, `row`): `piece` of the page goes to `destination`.
    [[nodiscard]] PaginatorPage MakeTile(PaginatorSource const & source, Grid const & grid, int column, int row,
                                         Kernel::RectT<double> const & piece,
                                         Kernel::RectT<double> const & destination, double scale) const;

    double m_Overlap;
};

}
