#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/StringT.h"
#include "output/PaginatorPage.h"

namespace Book
{

class BookController;

/// Decides how pages of a book fall on the sheets of a printer: which page on which sheet, at what place and scale, with
/// what bleed and crop marks. It reads chapter records only, opens no document and renders nothing: a print path takes
/// the list of sheets from here (`PrintBookCommand`).
///
/// A layout holds its settings and nothing else, so it can be used any number of times and by several threads. Its
/// arithmetic is a contract: the same records give the same doubles on every machine. No input fails; a list of sheets
/// ends at `MaximumSheets`, and with it the work.
class Paginator : public virtual Kernel::Countable
{
public:
    /// Sheet sides of one result.
    static constexpr std::size_t MaximumSheets = 100'000;
    /// Cells of all sheets of one result, filled or not.
    static constexpr std::size_t MaximumCells = 250'000;

    /// Sheets for the exporting pages of all valid chapters in the list.
    ///
    /// First brings the records of chapters that are open in front up to date, under the book's reader lock; with a null
    /// book there are no pages. Safe on any thread, also beside a command of the book: each record is read as it is at
    /// one moment.
    ///
    /// \param paper the paper, upright; layouts that don't cut pages have no use for it
    /// \param pageRange the user's choice of pages (see `ParsePrintPages`); empty for all. A choice without any page that
    ///        there is becomes the first page.
    /// \param selection not read: the choice is always made among all pages
    /// \param orientation `OrientationAuto` to choose by the pages
    /// \param scale for `FitTypeScale`
    virtual std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper,
                                                Kernel::Counted<BookController const> book,
                                                std::vector<Kernel::Counted<BookChapter const>> const & chapters,
                                                String pageRange, int selection, Renderer::FitTypeEnum fit,
                                                Renderer::OrientationEnum orientation, double scale,
                                                bool includeBleed) const;

    /// Sheets for these pages. `pageIndices` chooses among them, and may reorder and repeat; empty means all, except
    /// for folded layouts, which print what is chosen only. Both lists may be changed by the call.
    virtual std::vector<PaginatorPage> Paginate(Kernel::RectT<double> paper, std::vector<PaginatorSource> & sources,
                                                std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                                Renderer::OrientationEnum orientation, double scale,
                                                bool includeBleed) const = 0;

protected:
    /// Sides at which a bleed is cut.
    enum Edges : int
    {
        EdgeLeft = 1,
        EdgeTop = 2,
        EdgeRight = 4,
        EdgeBottom = 8,
    };

    /// `rect` with the margins `bleed` round it. The empty rectangle stays as it is.
    [[nodiscard]] Kernel::RectT<double> ApplyBleedRect(Kernel::RectT<double> const & rect,
                                                       Kernel::RectT<double> const & bleed) const;
    /// Raises each side of the sheet's bleed to the largest among its targets.
    void CalculateBleed(PaginatorPage & page) const;
    /// `rect` cut at the given sides of `limit`. The right side is never cut. The empty rectangle stays as it is.
    [[nodiscard]] Kernel::RectT<double> ClipBleedRect(Kernel::RectT<double> const & rect,
                                                      Kernel::RectT<double> const & limit, Edges edges) const;
    /// Replaces the pages by those that are chosen, in the order of the choice; nothing if it is empty. An index that
    /// stands for no page is left out.
    void FilterSources(std::vector<PaginatorSource> & sources, std::vector<int> const & pageIndices) const;

    /// The four outer corners: top left, top right, bottom left, bottom right.
    [[nodiscard]] static std::vector<CropMarkPos> GetCropMarks(Kernel::RectT<double> rect);
    /// What was asked for, or else what suits the page; a square one is upright.
    [[nodiscard]] static Renderer::OrientationEnum GetOrientation(Renderer::OrientationEnum asked,
                                                                  PaginatorSource const & source);
    [[nodiscard]] static Geometry::FitRect::Type GetPlacement(Renderer::FitTypeEnum fit);
    /// 1 where the page is fitted, so that the scale is found by the paper.
    [[nodiscard]] double GetScale(Renderer::FitTypeEnum fit, double scale) const;

    /// A sheet with one whole page in the page's own coordinates.
    [[nodiscard]] PaginatorPage MakeSingleSheet(PaginatorSource const & source, Renderer::FitTypeEnum fit,
                                                Renderer::OrientationEnum orientation, double scale) const;
    /// The map that takes one rectangle onto the other, axis by axis. The identity if one of them is empty, or if a side
    /// without length would have to get one.
    [[nodiscard]] static Raster::AffineTransform::Params RectToRect(Kernel::RectT<double> const & from,
                                                                    Kernel::RectT<double> const & to);
};

}
