#include "app/PrintLayout.h"

#include "app/ChapterNames.h"
#include "framework/render/PrintPages.h"
#include "import/Text.h"
#include "output/PaginatorBook.h"
#include "output/PaginatorBooklet.h"
#include "output/PaginatorNUp.h"
#include "output/PaginatorSingle.h"
#include "output/PaginatorTiled.h"

#include <algorithm>
#include <sstream>

namespace App
{

using Import::Text;

namespace
{

using Kind = PrintLayout::Kind;
using ChapterList = BookSession::ChapterList;

Renderer::FitTypeEnum FitOf(PrintLayout const & layout)
{
    bool const shrinks = layout.m_Paper && !layout.m_Scale && layout.m_Kind != Kind::Tiled;
    return layout.m_Fit.value_or(shrinks ? Renderer::FitTypeShrink : Renderer::FitTypeScale);
}

/// The chapters that the user named, in book order; false if one is not in the book.
bool ChooseChapters(BookSession const & session, PrintLayout const & layout, ChapterList & chosen,
                    Import::MessageList & messages)
{
    ChapterList const all = session.GetChapters();
    std::vector<ChapterLabel> labels;
    for (auto const & chapter : all) {
        labels.push_back({chapter->GetName().ToStd(), chapter->GetPath().ToStd()});
    }
    std::error_code error;
    std::vector<bool> isChosen(all.size(), layout.m_Chapters.empty());
    std::istringstream parts(layout.m_Chapters);
    for (std::string part; std::getline(parts, part, ',');) {
        part.erase(0, part.find_first_not_of(' '));
        part.erase(part.find_last_not_of(' ') + 1);
        String unread;
        std::vector<int> indices;
        if (part.find('-') != std::string::npos && CheckPrintPages(part, unread)) {
            indices = ParsePrintPages(part, static_cast<int>(all.size()), {0});
        } else {
            FoundChapter const found = FindChapter(labels, part, std::filesystem::current_path(error));
            if (found.m_Index < 0) {
                messages.Error("chapter-unknown", {}, found.m_Problem);
                return false;
            }
            indices = {found.m_Index};
        }
        for (int const index : indices) {
            if (index >= static_cast<int>(all.size())) {
                messages.Error("chapter-unknown", {},
                               Text("The book has %1 chapters, so \"%2\" is not among them.", "Program", all.size(), part));
                return false;
            }
            isChosen[static_cast<std::size_t>(index)] = true;
        }
    }
    for (std::size_t index = 0; index < all.size(); ++index) {
        if (isChosen[index]) {
            chosen.push_back(all[index]);
        }
    }
    return true;
}

/// The largest page that exports, bleed included if it is to show.
Kernel::Size LargestPage(ChapterList const & chapters, bool includeBleed)
{
    Kernel::Size largest;
    for (auto const & chapter : chapters) {
        auto const spreads = chapter->GetSpreadInfo();
        for (Book::SpreadInfo const & spread : spreads) {
            for (std::size_t page = 0; page < spread.m_PageRects.size(); ++page) {
                if (!spread.m_NonExporting[page]) {
                    Kernel::Rect const & rect = spread.m_PageRects[page];
                    Kernel::Rect const bleed = includeBleed ? spread.m_PageBoxes[page] : Kernel::Rect{};
                    largest.width = std::max(largest.width, rect.Width() + bleed.left + bleed.right);
                    largest.height = std::max(largest.height, rect.Height() + bleed.top + bleed.bottom);
                }
            }
        }
    }
    return largest;
}

/// Tiles of pages that are enlarged or reduced: cut in the size that they have on paper, and told in their own.
class EnlargedTiles final : public Book::Paginator
{
public:
    EnlargedTiles(double overlap, double scale) : m_Tiles(overlap), m_Scale(scale) {}

    using Book::Paginator::Paginate;
    std::vector<Book::PaginatorPage> Paginate(Kernel::Rect paper, std::vector<Book::PaginatorSource> & sources,
                                              std::vector<int> & pageIndices, Renderer::FitTypeEnum fit,
                                              Renderer::OrientationEnum orientation, double,
                                              bool includeBleed) const override
    {
        std::vector<Book::PaginatorSource> enlarged = sources;
        for (Book::PaginatorSource & source : enlarged) {
            source.m_PageRect = Times(source.m_PageRect, m_Scale);
            source.m_PageBox = Times(source.m_PageBox, m_Scale);
        }
        std::vector<Book::PaginatorPage> sheets =
            m_Tiles.Paginate(paper, enlarged, pageIndices, fit, orientation, 1, includeBleed);
        for (Book::PaginatorPage & sheet : sheets) {
            for (Book::PaginatorTarget & target : sheet.m_Targets) {
                target.m_PageRect = Times(target.m_PageRect, 1 / m_Scale);
                target.m_PageBox = Times(target.m_PageBox, 1 / m_Scale);
                target.m_BleedRect = Times(target.m_BleedRect, 1 / m_Scale);
                target.m_Transform = Raster::AffineTransform::Params::Scale(m_Scale, m_Scale).Then(target.m_Transform);
            }
        }
        return sheets;
    }

private:
    static Kernel::Rect Times(Kernel::Rect const & rect, double factor)
    {
        return rect.IsEmpty()
                   ? rect
                   : Kernel::Rect{rect.left * factor, rect.top * factor, rect.right * factor, rect.bottom * factor};
    }

    Book::PaginatorTiled m_Tiles;
    double m_Scale;
};

/// A grid whose margins and gaps have their size on paper. The paginator knows them in the size of the pages, so they
/// are divided by the scale that fits the cells into what they leave of the paper.
Kernel::Counted<Book::Paginator> MakeGrid(PrintLayout const & layout, ChapterList const & chapters,
                                          Renderer::OrientationEnum & orientation, Import::MessageList & messages)
{
    Kernel::Size const page = LargestPage(chapters, false);
    Kernel::Size const cell = LargestPage(chapters, layout.m_IncludeBleed);
    // The first cells' bleed and marks lie in the margins.
    double const room = layout.m_Marks && layout.m_Paper ? Book::PrintSheet::MarksRoom : 0;
    Kernel::Size const margins = layout.m_Margins.value_or(
        Kernel::Size{room + (cell.width - page.width) / 2, room + (cell.height - page.height) / 2});
    double scale = layout.m_Scale.value_or(1);
    double const cellsX = layout.m_Columns * cell.width;
    double const cellsY = layout.m_Rows * cell.height;
    if (FitOf(layout) != Renderer::FitTypeScale && cellsX > 0 && cellsY > 0) {
        double const takenX = 2 * margins.width + (layout.m_Columns - 1) * layout.m_Gaps.width;
        double const takenY = 2 * margins.height + (layout.m_Rows - 1) * layout.m_Gaps.height;
        double const shorter = std::min(layout.m_Paper->width, layout.m_Paper->height);
        double const longer = std::max(layout.m_Paper->width, layout.m_Paper->height);
        double const upright = std::min((shorter - takenX) / cellsX, (longer - takenY) / cellsY);
        double const across = std::min((longer - takenX) / cellsX, (shorter - takenY) / cellsY);
        if (orientation == Renderer::OrientationAuto) {
            orientation = across > upright ? Renderer::OrientationLandscape : Renderer::OrientationPortrait;
        }
        scale = orientation == Renderer::OrientationLandscape ? across : upright;
        if (!(scale > 0)) {
            messages.Error("print-layout", {}, Text("Margins and gaps leave no room on the paper for pages.", "Program"));
            return nullptr;
        }
        scale = FitOf(layout) == Renderer::FitTypeShrink ? std::min(scale, 1.0) : scale;
    }
    return Kernel::MakeCounted<Book::PaginatorNUp>(layout.m_Columns, layout.m_Rows, layout.m_Repeat, layout.m_Skip,
                                                   margins.width / scale, margins.height / scale,
                                                   layout.m_Gaps.width / scale, layout.m_Gaps.height / scale,
                                                   layout.m_Fill);
}

}

Book::PrintSettings PrintLayout::GetSettings() const
{
    return {m_Paper.value_or(Kernel::Size{}), m_IncludeBleed, m_Marks};
}

std::vector<Book::PaginatorPage> LaySheets(BookSession const & session, PrintLayout const & layout,
                                           Import::MessageList & messages)
{
    ChapterList chapters;
    if (!ChooseChapters(session, layout, chapters, messages)) {
        return {};
    }
    std::erase_if(chapters, [](auto const & chapter) { return !chapter->IsValid(); });
    int total = 0;
    for (auto const & chapter : chapters) {
        total += chapter->GetExportingPageCount();
    }
    if (total == 0) {
        messages.Error("print-empty", {}, Text("There are no pages to print: none of the chapters has one.", "Program"));
        return {};
    }
    std::vector<int> const chosen = ParsePrintPages(layout.m_Pages, total, {0});
    if (!layout.m_Pages.empty() &&
        std::none_of(chosen.begin(), chosen.end(), [total](int index) { return index < total; })) {
        messages.Error("print-pages", {},
                       Text("There are %1 pages, so \"%2\" chooses none of them.", "Program", total, layout.m_Pages));
        return {};
    }

    Kernel::Size const paper = layout.m_Paper.value_or(Kernel::Size{});
    Kernel::Rect const sheet{0, 0, std::min(paper.width, paper.height), std::max(paper.width, paper.height)};
    Renderer::OrientationEnum orientation = layout.m_Orientation;
    Kernel::Counted<Book::Paginator> paginator;
    switch (layout.m_Kind) {
    case Kind::Single:
        paginator = Kernel::MakeCounted<Book::PaginatorSingle>();
        break;
    case Kind::Tiled:
        paginator = Kernel::MakeCounted<EnlargedTiles>(layout.m_Overlap, layout.m_Scale.value_or(1));
        break;
    case Kind::NUp:
        paginator = MakeGrid(layout, chapters, orientation, messages);
        break;
    case Kind::Book:
        paginator = Kernel::MakeCounted<Book::PaginatorBook>(layout.m_Vertical, layout.m_BlankFirst);
        break;
    case Kind::Booklet:
        paginator = Kernel::MakeCounted<Book::PaginatorBooklet>(layout.m_Vertical, layout.m_BlankFirst);
        break;
    }
    if (!paginator) {
        return {};
    }
    std::vector<Book::PaginatorPage> sheets =
        paginator->Paginate(sheet, session.GetBook(), chapters, String(layout.m_Pages), -1, FitOf(layout), orientation,
                            layout.m_Scale.value_or(1), layout.m_IncludeBleed);
    std::size_t cells = 0;
    for (Book::PaginatorPage & page : sheets) {
        cells += page.m_Targets.size();
        if (layout.m_Kind != Kind::Tiled && layout.m_Orientation != Renderer::OrientationAuto) {
            page.m_Orientation = layout.m_Orientation;
        }
    }
    if (sheets.size() >= Book::Paginator::MaximumSheets || cells >= Book::Paginator::MaximumCells) {
        messages.Error("print-size", {},
                       Text("That would take more than %1 sheets or %2 pages on them; choose fewer pages, or larger tiles.",
                            "Program", Book::Paginator::MaximumSheets, Book::Paginator::MaximumCells));
        return {};
    }
    if (cells == 0) {
        messages.Error("print-layout", {}, Text("Not one page finds a place on sheets of this paper.", "Program"));
        return {};
    }
    return sheets;
}

}
