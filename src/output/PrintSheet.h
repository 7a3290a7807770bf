#pragma once

#include "framework/render/DisplayList.h"
#include "framework/render/PrintPlacement.h"
#include "output/PaginatorPage.h"

namespace Book
{

/// How sheets go on paper.
struct PrintSettings
{
    /// Points, either way round; no width or height: each sheet's paper is made to measure.
    Kernel::Size m_Paper;
    /// Pages go beyond their trimmed edge by their bleed, as far as their sheet lets them.
    bool m_IncludeBleed = false;
    bool m_Marks = false;
};

/// One side of a sheet on its paper. All that it gives is in points on the paper, y down, origin at its top left.
class PrintSheet
{
public:
    /// A page, or a piece of one.
    struct Piece
    {
        /// The page's running number.
        int m_Index = -1;
        /// From coordinates of the page's spread.
        Raster::AffineTransform::Params m_ToPaper;
        Kernel::Rect m_Trim;
        /// What shows of it: with its bleed, if that is wanted.
        Kernel::Rect m_Shown;
    };

    /// Room that marks take beyond the bleed on each side.
    static constexpr double MarksRoom = 22.5;

    PrintSheet(PaginatorPage const & sheet, PrintSettings const & settings);

    [[nodiscard]] Kernel::Size const & GetPaper() const { return m_Placement.m_Paper; }
    [[nodiscard]] double GetScale() const { return m_Placement.m_Scale; }
    /// The whole content without bleed.
    [[nodiscard]] Kernel::Rect const & GetTrim() const { return m_Trim; }
    /// In the order in which they are drawn.
    [[nodiscard]] std::vector<Piece> const & GetPieces() const { return m_Pieces; }

    /// Adds the crop marks: two lines of that width at each, out from the corner and clear of the bleed. At an inner edge a line
    /// keeps to the gap between two pages, its own half of it, and is left out where there is no room.
    void DrawMarks(Renderer::RenderTree::DisplayList & list, double lineWidth) const;

    /// What a page has to be drawn of for this target, in coordinates of its spread.
    [[nodiscard]] static Kernel::Rect const & ShownPart(PaginatorTarget const & target, PrintSettings const & settings)
    {
        return settings.m_IncludeBleed ? target.m_BleedRect : target.m_PageRect;
    }

private:
    [[nodiscard]] double FreeWay(Kernel::Point const & from, double dx, double dy) const;
    void AddLine(Renderer::Path & path, Kernel::Point const & from, double dx, double dy, bool isInner) const;

    Renderer::PaperPlacement m_Placement;
    Kernel::Rect m_Trim;
    std::vector<Piece> m_Pieces;
    std::vector<CropMarkPos> m_Marks;
    /// The largest bleed, on paper; 0 if none is shown.
    double m_Bleed = 0;
};

}
