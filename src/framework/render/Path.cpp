#include "framework/render/Path.h"

namespace Renderer
{

void Path::CurveTo(double x1, double y1, double x2, double y2, double x, double y)
{
    m_Verbs.push_back(Verb::Curve);
    m_Points.push_back({x1, y1});
    m_Points.push_back({x2, y2});
    m_Points.push_back({x, y});
}

void Path::AddRect(Kernel::Rect const & rect)
{
    MoveTo(rect.left, rect.top);
    LineTo(rect.right, rect.top);
    LineTo(rect.right, rect.bottom);
    LineTo(rect.left, rect.bottom);
    Close();
}

void Path::AddEllipse(Kernel::Rect const & bounds)
{
    // A quarter of a circle by one cubic curve: 4/3 (sqrt(2) - 1), off by less than 3 in 10,000.
    double const handle = 0.5522847498307936;
    double const x = (bounds.left + bounds.right) / 2;
    double const y = (bounds.top + bounds.bottom) / 2;
    double const dx = bounds.Width() / 2 * handle;
    double const dy = bounds.Height() / 2 * handle;
    MoveTo(bounds.right, y);
    CurveTo(bounds.right, y + dy, x + dx, bounds.bottom, x, bounds.bottom);
    CurveTo(x - dx, bounds.bottom, bounds.left, y + dy, bounds.left, y);
    CurveTo(bounds.left, y - dy, x - dx, bounds.top, x, bounds.top);
    CurveTo(x + dx, bounds.top, bounds.right, y - dy, bounds.right, y);
    Close();
}

}
