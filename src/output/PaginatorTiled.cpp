#include "output/PaginatorTiled.h"

#include <cmath>

namespace Book
{

namespace
{

using Place = Geometry::FitRect;

/// Toward zero. What no count can be, such as the quotient by a paper without width, is none.
int Truncated(double value)
{
    return std::abs(value) < 2147483648.0 ? static_cast<int>(value) : 0;
}

/// Tiles of `step` that it takes to cover `length`, of which each neighbour repeats `overlap`.
int TileCount(double length, double overlap, int step)
{
    return Truncated(((length - overlap) + (static_cast<double>(step) - 1)) / static_cast<double>(step));
}

/// What `count` tiles have too much for `length`.
double Surplus(double tile, int count, double overlap, double length)
{
    return count == 1 ? tile - length : tile * count - ((count - 1) * overlap + length);
}

Kernel::Rect Scaled(Kernel::Rect const & rect, double scale)
{
    return rect.IsEmpty()
               ? rect
               : Kernel::Rect{rect.left * scale, rect.top * scale, rect.right * scale, rect.bottom * scale};
}

}

std::vector<PaginatorPage> PaginatorTiled::Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                                    std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                    Renderer::OrientationEnum orientation, double scale, bool) const
{
    FilterSources(sources, pageIndices);
    bool const hasPaper = paper.Width() != 0 && paper.Height() != 0;
    std::vector<PaginatorPage> sheets;
    for (PaginatorSource const & source : sources) {
        if (sheets.size() >= MaximumSheets) {
            break;
        }
        if (hasPaper) {
            AppendTiles(sheets, source, MakeGrid(paper, source, orientation, scale), scale);
        } else {
            sheets.push_back(MakeSingleSheet(source, fit, orientation, scale));
        }
    }
    return sheets;
}

PaginatorTiled::Grid PaginatorTiled::MakeGrid(Kernel::Rect const & paper, PaginatorSource const & source,
                                              Renderer::OrientationEnum orientation, double scale) const
{
    Kernel::Rect const scaled = Scaled(source.m_PageRect, scale);
    double const width = scaled.Width();
    double const height = scaled.Height();
    int const stepX = Truncated(paper.Width() - m_Overlap);
    int const stepY = Truncated(paper.Height() - m_Overlap);
    Grid grid;
    grid.m_Columns = TileCount(width, m_Overlap, stepX);
    grid.m_Rows = TileCount(height, m_Overlap, stepY);
    int const turnedColumns = TileCount(width, m_Overlap, stepY);
    int const turnedRows = TileCount(height, m_Overlap, stepX);

    long long const upright = static_cast<long long>(grid.m_Columns) * grid.m_Rows;
    long long const turned = static_cast<long long>(turnedColumns) * turnedRows;
    bool const isWide = source.m_PageRect.Width() > source.m_PageRect.Height();
    bool const landscape =
        orientation == Renderer::OrientationLandscape ||
        (orientation == Renderer::OrientationAuto && (upright > turned || (upright == turned && isWide)));
    grid.m_Tile = paper;
    grid.m_Orientation = landscape ? Renderer::OrientationLandscape : Renderer::OrientationPortrait;
    if (landscape) {
        grid.m_Tile.right = paper.left + std::trunc(paper.Height());
        grid.m_Tile.bottom = paper.top + std::trunc(paper.Width());
        grid.m_Columns = turnedColumns;
        grid.m_Rows = turnedRows;
    }
    grid.m_HalfX = Surplus(grid.m_Tile.Width(), grid.m_Columns, m_Overlap, width) / 2;
    grid.m_HalfY = Surplus(grid.m_Tile.Height(), grid.m_Rows, m_Overlap, height) / 2;
    return grid;
}

void PaginatorTiled::AppendTiles(std::vector<PaginatorPage> & sheets, PaginatorSource const & source, Grid const & grid,
                                 double scale) const
{
    Kernel::Rect const & page = source.m_PageRect;
    double const overlap = m_Overlap / scale;
    double x = page.left;
    for (int column = 0; column < grid.m_Columns && grid.m_Rows > 0; ++column) {
        double const left = column == 0 ? grid.m_HalfX : 0;
        double right = grid.m_Tile.right;
        double x2 = x + (right - left) * scale;
        if (x2 > page.right) {
            x2 = page.right;
            right = (page.right - x) / scale + left;
        }
        double y = page.top;
        for (int row = 0; row < grid.m_Rows; ++row) {
            if (sheets.size() >= MaximumSheets) {
                return;
            }
            double const top = row == 0 ? grid.m_HalfY : 0;
            double bottom = grid.m_Tile.bottom;
            double y2 = y + (bottom - top) * scale;
            if (y2 > page.bottom) {
                y2 = page.bottom;
                bottom = (page.bottom - y) / scale + top;
            }
            sheets.push_back(
                MakeTile(source, grid, column, row, {x, y, x2, y2}, {left, top, right, bottom}, scale));
            y = y2 - overlap;
        }
        x = x2 - overlap;
    }
}

PaginatorPage PaginatorTiled::MakeTile(PaginatorSource const & source, Grid const & grid, int column, int row,
                                       Kernel::Rect const & piece, Kernel::Rect const & destination,
                                       double scale) const
{
    PaginatorTarget target(source);
    target.m_PageRect = piece;
    target.m_DestRect = destination;
    target.m_Transform = RectToRect(piece, destination);
    target.m_BleedRect = ApplyBleedRect(piece, source.m_PageBox);

    bool const isFirstColumn = column == 0;
    bool const isLastColumn = column == grid.m_Columns - 1;
    bool const isFirstRow = row == 0;
    bool const isLastRow = row == grid.m_Rows - 1;

    // Bleed goes round the whole page, so it is cut where the outer tiles join the others; a tile in the middle of three
    // keeps what lies over both of its joins.
    int placement = Place::Centre;
    if (grid.m_Columns > 1 && isFirstColumn) {
        placement = Place::MiddleRight;
        target.m_BleedRect.right = piece.right;
    } else if (grid.m_Columns > 1 && isLastColumn) {
        placement = Place::MiddleLeft;
        target.m_BleedRect.left = piece.left;
    }
    if (grid.m_Rows > 1 && isFirstRow) {
        target.m_BleedRect.bottom = piece.bottom;
        placement = placement == Place::MiddleRight  ? Place::BottomRight
                    : placement == Place::MiddleLeft ? Place::BottomLeft
                                                     : Place::BottomCentre;
    } else if (grid.m_Rows > 1 && isLastRow) {
        target.m_BleedRect.top = piece.top;
        placement = placement == Place::MiddleRight  ? Place::TopRight
                    : placement == Place::MiddleLeft ? Place::TopLeft
                                                     : Place::TopCentre;
    }

    PaginatorPage sheet;
    sheet.m_Scale = scale;
    sheet.m_Orientation = grid.m_Orientation;
    sheet.m_Placement = static_cast<Place::Type>(placement);
    if (destination.Width() != 0 && destination.Height() != 0) {
        sheet.m_Rect = destination;
    }
    using Edge = CropMarkPos;
    if (isFirstColumn && isFirstRow) {
        sheet.m_CropMarks.push_back({Edge::Top | Edge::Left, destination.left, destination.top});
    }
    if (isLastColumn && isFirstRow) {
        sheet.m_CropMarks.push_back({Edge::Top | Edge::Right, destination.right, destination.top});
    }
    if (isFirstColumn && isLastRow) {
        sheet.m_CropMarks.push_back({Edge::Bottom | Edge::Left, destination.left, destination.bottom});
    }
    if (isLastColumn && isLastRow) {
        sheet.m_CropMarks.push_back({Edge::Bottom | Edge::Right, destination.right, destination.bottom});
    }
    sheet.m_Targets.push_back(std::move(target));
    CalculateBleed(sheet);
    return sheet;
}

}
