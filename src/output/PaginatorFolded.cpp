#include "output/PaginatorFolded.h"

#include <algorithm>
#include <cmath>

namespace Book
{

namespace
{

using Transform = Raster::AffineTransform::Params;

/// The inverse of a map without rotation. One that flattens everything has none; what comes of it then is a place only.
Transform Inverse(Transform const & map)
{
    if (std::abs(map.a * map.d) <= 1e-128) {
        return {0, 0, 0, 0, -map.e, -map.f};
    }
    return map.Inverse();
}

}

std::vector<PaginatorPage> PaginatorFolded::Paginate(Kernel::RectT<double>, std::vector<PaginatorSource> & sources,
                                                     std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                     Renderer::OrientationEnum, double scale, bool) const
{
    Kernel::Size cell;
    for (PaginatorSource const & source : sources) {
        cell.width = std::max(cell.width, source.m_PageRect.Width());
        cell.height = std::max(cell.height, source.m_PageRect.Height());
    }
    std::vector<int> chosen = pageIndices;
    std::sort(chosen.begin(), chosen.end());

    std::vector<PaginatorPage> sheets;
    for (std::size_t start = 0; start < sources.size() && sheets.size() < MaximumSheets; start += 2) {
        PaginatorPage sheet;
        bool isChosen = false;
        for (std::size_t index = start; index < std::min(start + 2, sources.size()); ++index) {
            PaginatorSource const & source = sources[index];
            if (source.m_Chapter) {
                isChosen = isChosen || std::binary_search(chosen.begin(), chosen.end(), source.m_Index);
                sheet.m_Targets.push_back(MakeTarget(source, static_cast<int>(index - start), cell));
            }
        }
        if (!isChosen) {
            continue;
        }
        sheet.m_Rect = m_Vertical ? Kernel::Rect{0, 0, cell.width, 2 * cell.height}
                                  : Kernel::Rect{0, 0, 2 * cell.width, cell.height};
        sheet.m_Orientation = sheet.m_Rect.Width() > sheet.m_Rect.Height() ? Renderer::OrientationLandscape
                                                                           : Renderer::OrientationPortrait;
        sheet.m_Placement = GetPlacement(fit);
        sheet.m_Scale = GetScale(fit, scale);
        sheet.m_CropMarks = GetCropMarks(sheet.m_Rect);
        CalculateBleed(sheet);
        sheets.push_back(std::move(sheet));
    }
    return sheets;
}

PaginatorTarget PaginatorFolded::MakeTarget(PaginatorSource const & source, int cell, Kernel::Size const & size) const
{
    int const column = m_Vertical ? 0 : cell;
    int const row = m_Vertical ? cell : 0;
    Kernel::Rect const place{column * size.width, row * size.height, (column + 1) * size.width,
                             (row + 1) * size.height};
    double const width = source.m_PageRect.Width();
    double const height = source.m_PageRect.Height();
    double const left = place.left + (size.width - width) * 0.5;
    double const top = place.top + (size.height - height) * 0.5;

    PaginatorTarget target(source);
    target.m_DestRect = source.m_PageRect;
    target.m_Transform = RectToRect(source.m_PageRect, {left, top, left + width, top + height});
    Kernel::Rect const limit = Inverse(target.m_Transform).MapBounds(place);
    Edges const fold = m_Vertical ? (cell == 0 ? EdgeBottom : EdgeTop) : (cell == 0 ? EdgeRight : EdgeLeft);
    target.m_BleedRect = ClipBleedRect(ApplyBleedRect(source.m_PageRect, source.m_PageBox), limit, fold);
    return target;
}

std::vector<PaginatorSource> PaginatorFolded::InReadingOrder(std::vector<PaginatorSource> const & sources) const
{
    std::vector<PaginatorSource> pages;
    pages.reserve(sources.size() + 1);
    if (m_InsertBlank) {
        pages.emplace_back();
    }
    pages.insert(pages.end(), sources.begin(), sources.end());
    return pages;
}

PaginatorSource PaginatorFolded::PageOrBlank(std::vector<PaginatorSource> const & pages, std::size_t index)
{
    return index < pages.size() ? pages[index] : PaginatorSource();
}

}
