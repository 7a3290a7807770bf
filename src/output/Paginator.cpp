#include "output/Paginator.h"

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/render/PrintPages.h"

#include <algorithm>
#include <numeric>

namespace Book
{

namespace
{

using Spreads = Snapshot<std::vector<SpreadInfo>>;

std::vector<int> ChosenPages(std::vector<Kernel::Counted<BookChapter const>> const & chapters, String const & pageRange)
{
    int total = 0;
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        if (chapter && chapter->IsValid()) {
            total += chapter->GetExportingPageCount();
        }
    }
    std::vector<int> indices = ParsePrintPages(pageRange, -1, {0});
    if (indices.empty()) {
        indices.resize(static_cast<std::size_t>(total));
        std::iota(indices.begin(), indices.end(), 0);
    } else {
        std::erase_if(indices, [total](int index) { return index >= total; });
    }
    if (indices.empty()) {
        indices.push_back(0);
    }
    return indices;
}

void AppendSources(Kernel::Counted<BookChapter const> const & chapter, std::vector<PaginatorSource> & sources)
{
    Spreads const spreads = chapter->GetSpreadInfo();
    for (std::size_t index = 0; index < spreads.size(); ++index) {
        SpreadInfo const & spread = spreads[index];
        for (std::size_t page = 0; page < spread.m_PageRects.size(); ++page) {
            if (spread.m_NonExporting[page]) {
                continue;
            }
            PaginatorSource source;
            source.m_Chapter = chapter;
            source.m_Spread = static_cast<int>(index);
            source.m_PageRect = spread.m_PageRects[page];
            source.m_PageBox = spread.m_PageBoxes[page];
            source.m_Index = static_cast<int>(sources.size());
            sources.push_back(std::move(source));
        }
    }
}

/// Value and offset of one axis of a map; false if a length of nothing would have to become something.
bool MapAxis(double fromStart, double fromLength, double toStart, double toLength, double & factor, double & offset)
{
    if (fromLength == 0) {
        if (toLength != 0) {
            return false;
        }
        factor = 1;
    } else {
        factor = toLength / fromLength;
    }
    offset = toStart - factor * fromStart;
    return true;
}

}

std::vector<PaginatorPage> Paginator::Paginate(Kernel::RectT<double> paper, Kernel::Counted<BookController const> book,
                                               std::vector<Kernel::Counted<BookChapter const>> const & chapters,
                                               String pageRange, int, Renderer::FitTypeEnum fit,
                                               Renderer::OrientationEnum orientation, double scale,
                                               bool includeBleed) const
{
    std::vector<int> indices = ChosenPages(chapters, pageRange);
    std::vector<PaginatorSource> sources;
    if (book) {
        book->UpdateForegroundChapterStatus();
        for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
            if (chapter && chapter->IsValid()) {
                AppendSources(chapter, sources);
            }
        }
    }
    return Paginate(paper, sources, indices, fit, orientation, scale, includeBleed);
}

Kernel::Rect Paginator::ApplyBleedRect(Kernel::Rect const & rect, Kernel::Rect const & bleed) const
{
    return rect.IsEmpty() ? rect
                          : Kernel::Rect{rect.left - bleed.left, rect.top - bleed.top, rect.right + bleed.right,
                                         rect.bottom + bleed.bottom};
}

void Paginator::CalculateBleed(PaginatorPage & page) const
{
    Kernel::Rect & bleed = page.m_Bleed;
    for (PaginatorTarget const & target : page.m_Targets) {
        bleed.left = std::max(bleed.left, target.m_PageBox.left);
        bleed.top = std::max(bleed.top, target.m_PageBox.top);
        bleed.right = std::max(bleed.right, target.m_PageBox.right);
        bleed.bottom = std::max(bleed.bottom, target.m_PageBox.bottom);
    }
}

Kernel::Rect Paginator::ClipBleedRect(Kernel::Rect const & rect, Kernel::Rect const & limit, Edges edges) const
{
    Kernel::Rect clipped = rect;
    if (rect.IsEmpty()) {
        return clipped;
    }
    if (edges & EdgeLeft) {
        clipped.left = std::max(rect.left, limit.left);
    }
    if (edges & EdgeTop) {
        clipped.top = std::max(rect.top, limit.top);
    }
    // The right edge keeps its bleed: the left-hand page of a folded sheet prints over the fold.
    if (edges & EdgeBottom) {
        clipped.bottom = std::min(rect.bottom, limit.bottom);
    }
    return clipped;
}

void Paginator::FilterSources(std::vector<PaginatorSource> & sources, std::vector<int> const & pageIndices) const
{
    if (pageIndices.empty()) {
        return;
    }
    std::vector<PaginatorSource> chosen;
    chosen.reserve(pageIndices.size());
    for (int const index : pageIndices) {
        if (index >= 0 && static_cast<std::size_t>(index) < sources.size()) {
            chosen.push_back(sources[static_cast<std::size_t>(index)]);
        }
    }
    sources = std::move(chosen);
}

std::vector<CropMarkPos> Paginator::GetCropMarks(Kernel::RectT<double> rect)
{
    using Edge = CropMarkPos;
    return {{Edge::Top | Edge::Left, rect.left, rect.top},
            {Edge::Top | Edge::Right, rect.right, rect.top},
            {Edge::Bottom | Edge::Left, rect.left, rect.bottom},
            {Edge::Bottom | Edge::Right, rect.right, rect.bottom}};
}

Renderer::OrientationEnum Paginator::GetOrientation(Renderer::OrientationEnum asked, PaginatorSource const & source)
{
    if (asked != Renderer::OrientationAuto) {
        return asked;
    }
    return source.m_PageRect.Width() > source.m_PageRect.Height() ? Renderer::OrientationLandscape
                                                                  : Renderer::OrientationPortrait;
}

Geometry::FitRect::Type Paginator::GetPlacement(Renderer::FitTypeEnum fit)
{
    switch (fit) {
    case Renderer::FitTypeShrink:
        return Geometry::FitRect::Shrink;
    case Renderer::FitTypeFill:
        return Geometry::FitRect::Fill;
    default:
        return Geometry::FitRect::Centre;
    }
}

double Paginator::GetScale(Renderer::FitTypeEnum fit, double scale) const
{
    return fit == Renderer::FitTypeShrink || fit == Renderer::FitTypeFill ? 1.0 : scale;
}

PaginatorPage Paginator::MakeSingleSheet(PaginatorSource const & source, Renderer::FitTypeEnum fit,
                                         Renderer::OrientationEnum orientation, double scale) const
{
    PaginatorTarget target(source);
    target.m_DestRect = source.m_PageRect;
    target.m_BleedRect = ApplyBleedRect(source.m_PageRect, source.m_PageBox);

    PaginatorPage sheet;
    sheet.m_Targets.push_back(std::move(target));
    sheet.m_Rect = source.m_PageRect;
    sheet.m_Orientation = GetOrientation(orientation, source);
    sheet.m_Placement = GetPlacement(fit);
    sheet.m_Scale = GetScale(fit, scale);
    sheet.m_CropMarks = GetCropMarks(sheet.m_Rect);
    CalculateBleed(sheet);
    return sheet;
}

Raster::AffineTransform::Params Paginator::RectToRect(Kernel::Rect const & from, Kernel::Rect const & to)
{
    if (from.IsEmpty() || to.IsEmpty()) {
        return {};
    }
    double scaleX = 1;
    double scaleY = 1;
    double moveX = 0;
    double moveY = 0;
    if (!MapAxis(from.left, from.Width(), to.left, to.Width(), scaleX, moveX) ||
        !MapAxis(from.top, from.Height(), to.top, to.Height(), scaleY, moveY)) {
        return {};
    }
    return {scaleX, 0, 0, scaleY, moveX, moveY};
}

}
