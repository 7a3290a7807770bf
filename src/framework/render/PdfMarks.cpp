#include "framework/render/PdfMarks.h"

namespace Renderer::RenderTree
{

namespace
{

void DrawCropMarks(PrintersMarksOptions const & options, Kernel::Rect const & trim, Path & path)
{
    double const near = options.m_Offset;
    double const far = options.m_Offset + options.m_Length;
    for (double const x : {trim.left, trim.right}) {
        path.MoveTo(x, trim.top - near);
        path.LineTo(x, trim.top - far);
        path.MoveTo(x, trim.bottom + near);
        path.LineTo(x, trim.bottom + far);
    }
    for (double const y : {trim.top, trim.bottom}) {
        path.MoveTo(trim.left - near, y);
        path.LineTo(trim.left - far, y);
        path.MoveTo(trim.right + near, y);
        path.LineTo(trim.right + far, y);
    }
}

void DrawRegistrationMark(Kernel::Point const & centre, double radius, Path & path)
{
    path.AddEllipse({centre.x - radius / 2, centre.y - radius / 2, centre.x + radius / 2, centre.y + radius / 2});
    path.MoveTo(centre.x - radius, centre.y);
    path.LineTo(centre.x + radius, centre.y);
    path.MoveTo(centre.x, centre.y - radius);
    path.LineTo(centre.x, centre.y + radius);
}

}

void DrawPrintersMarks(PrintersMarksHelper const & helper, Kernel::Rect const & trim, DisplayList & list)
{
    PrintersMarksOptions const & options = helper.GetOptions();
    if (!options.HasAny()) {
        return;
    }
    Path path;
    if (options.m_CropMarks) {
        DrawCropMarks(options, trim, path);
    }
    if (options.m_RegistrationMarks) {
        double const x = (trim.left + trim.right) / 2;
        double const y = (trim.top + trim.bottom) / 2;
        double const radius = options.m_Length / 2;
        double const away = options.m_Offset + radius;
        for (Kernel::Point const & centre : {Kernel::Point{x, trim.top - away}, {x, trim.bottom + away},
                                             {trim.left - away, y}, {trim.right + away, y}}) {
            DrawRegistrationMark(centre, radius, path);
        }
    }
    Mark mark;
    mark.m_Role = Role::Artifact;
    list.BeginMark(mark);
    list.StrokePath(std::move(path), Raster::Colour::Cmyk(1, 1, 1, 1), Stroke{options.m_LineWidth, {}, {}, 10, {}, 0});
    list.EndMark();
}

}
