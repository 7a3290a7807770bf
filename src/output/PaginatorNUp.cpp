#include "output/PaginatorNUp.h"

#include <algorithm>

namespace Book
{

PaginatorNUp::PaginatorNUp(int columns, int rows, int repeat, int skip, double marginX, double marginY, double gapX,
                           double gapY, bool fill)
    : m_Columns(std::max(columns, 1)), m_Rows(std::max(rows, 1)), m_Repeat(std::max(repeat, 1)), m_Skip(skip),
      m_GapX(gapX), m_GapY(gapY), m_MarginX(marginX), m_MarginY(marginY), m_Fill(fill)
{
}

std::vector<PaginatorPage> PaginatorNUp::Paginate(Kernel::RectT<double>, std::vector<PaginatorSource> & sources,
                                                  std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                  Renderer::OrientationEnum orientation, double scale,
                                                  bool includeBleed) const
{
    FilterSources(sources, pageIndices);
    std::vector<PaginatorPage> sheets;
    if (sources.empty()) {
        return sheets;
    }
    Setting setting{{}, fit, orientation, scale};
    for (PaginatorSource const & source : sources) {
        Kernel::Rect const rect =
            includeBleed ? ApplyBleedRect(source.m_PageRect, source.m_PageBox) : source.m_PageRect;
        setting.m_Cell.width = std::max(setting.m_Cell.width, rect.Width());
        setting.m_Cell.height = std::max(setting.m_Cell.height, rect.Height());
    }
    double const width = m_Columns * setting.m_Cell.width;
    double const height = m_Rows * setting.m_Cell.height;
    if (orientation == Renderer::OrientationAuto) {
        setting.m_Orientation = width + GapsX() > height + GapsY() ? Renderer::OrientationLandscape
                                                                   : Renderer::OrientationPortrait;
    }

    int skip = m_Skip;
    int left = m_Repeat;
    std::size_t cursor = 0;
    bool wrapped = false;
    std::size_t cells = 0;
    while (!wrapped && sheets.size() < MaximumSheets && cells < MaximumCells) {
        PaginatorPage sheet;
        for (int row = 0; row < m_Rows; ++row) {
            for (int column = 0; column < m_Columns; ++column) {
                if ((wrapped && !m_Fill) || cells == MaximumCells) {
                    break; // All further cells stay empty.
                }
                ++cells;
                if (skip > 0) {
                    --skip;
                    continue;
                }
                Place(sheet, sources[cursor], setting, column, row);
                if (--left == 0) {
                    left = m_Repeat;
                    cursor = (cursor + 1) % sources.size();
                    wrapped = wrapped || cursor == 0;
                }
            }
            if ((wrapped && !m_Fill) || cells == MaximumCells) {
                break;
            }
        }
        sheet.m_Rect = {m_MarginX, m_MarginY, m_MarginX + GapsX() + width, m_MarginY + GapsY() + height};
        CalculateBleed(sheet);
        sheets.push_back(std::move(sheet));
    }
    return sheets;
}

void PaginatorNUp::Place(PaginatorPage & sheet, PaginatorSource const & source, Setting const & setting, int column,
                         int row) const
{
    using Fit = Geometry::FitRect;
    double const x = column * setting.m_Cell.width + column * m_GapX + m_MarginX;
    double const y = row * setting.m_Cell.height + row * m_GapY + m_MarginY;
    PaginatorTarget target(source);
    target.m_DestRect = {x, y, x + source.m_PageRect.Width(), y + source.m_PageRect.Height()};
    target.m_Transform = RectToRect(source.m_PageRect, target.m_DestRect);
    target.m_BleedRect = ApplyBleedRect(source.m_PageRect, source.m_PageBox);

    sheet.m_Orientation = setting.m_Orientation;
    sheet.m_Scale = GetScale(setting.m_Fit, setting.m_Scale);
    switch (setting.m_Fit) {
    case Renderer::FitTypeScale:
    case Renderer::FitTypeShrink:
    case Renderer::FitTypeFill:
        sheet.m_Placement = static_cast<Fit::Type>(Fit::FromOrigin | GetPlacement(setting.m_Fit) | Fit::TopLeft);
        break;
    default:
        break;
    }

    using Edge = CropMarkPos;
    std::uint32_t const left = column != 0 ? Edge::InnerLeft : Edge::Left;
    std::uint32_t const top = row != 0 ? Edge::InnerTop : Edge::Top;
    std::uint32_t const right = column == m_Columns - 1 ? Edge::Right : Edge::InnerRight;
    std::uint32_t const bottom = row == m_Rows - 1 ? Edge::Bottom : Edge::InnerBottom;
    Kernel::Rect const & dest = target.m_DestRect;
    sheet.m_CropMarks.push_back({top | left, dest.left, dest.top});
    sheet.m_CropMarks.push_back({top | right, dest.right, dest.top});
    sheet.m_CropMarks.push_back({bottom | left, dest.left, dest.bottom});
    sheet.m_CropMarks.push_back({bottom | right, dest.right, dest.bottom});
    sheet.m_Targets.push_back(std::move(target));
}

}
