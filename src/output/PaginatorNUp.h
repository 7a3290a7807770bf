#pragma once

#include "output/Paginator.h"

namespace Book
{

/// Many pages on one sheet, in a grid of equal cells that is filled row by row.
///
/// A cell is as large as the largest page, its bleed included if that is wanted. A page keeps its own size and sits in
/// its cell's top left.
class PaginatorNUp final : public Paginator
{
public:
    /// Columns, rows and `repeat` below 1 count as 1. `repeat`: cells in a row for each page. `skip`: cells left empty
    /// at the start. Margins in points, before the first cell; gaps between cells. `fill`: when the pages run out, begin
    /// again with the first until the sheet is full.
    PaginatorNUp(int columns, int rows, int repeat, int skip, double marginX, double marginY, double gapX, double gapY,
                 bool fill);

    using Paginator::Paginate;
    /// No page, no sheet.
    std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                        std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                        Renderer::OrientationEnum orientation, double scale,
                                        bool includeBleed) const override;

private:
    /// What all sheets of one result have in common.
    struct Setting
    {
        Kernel::SizeT<double> m_Cell;
        Renderer::FitTypeEnum m_Fit;
        Renderer::OrientationEnum m_Orientation;
        double m_Scale;
    };

    [[nodiscard]] double GapsX() const { return m_Columns >= 2 ? (m_Columns - 1) * m_GapX : 0; }
    [[nodiscard]] double GapsY() const { return m_Rows >= 2 ? (m_Rows - 1) * m_GapY : 0; }
    void Place(PaginatorPage & sheet, PaginatorSource const & source, Setting const & setting, int column,
               int row) const;

    int m_Columns;
    int m_Rows;
    int m_Repeat;
    int m_Skip;
    double m_GapX;
    double m_GapY;
    double m_MarginX;
    double m_MarginY;
    bool m_Fill;
};

}
