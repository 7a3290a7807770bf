#include "framework/raster/AffineTransform.h"

#include <algorithm>
#include <cmath>

namespace Raster
{

AffineTransform::Params AffineTransform::Params::Rotation(double radians)
{
    double const cosine = std::cos(radians);
    double const sine = std::sin(radians);
    return {cosine, sine, -sine, cosine, 0, 0};
}

Kernel::Rect AffineTransform::Params::MapBounds(Kernel::Rect const & rect) const
{
    if (rect.IsEmpty() || IsIdentity()) {
        return rect;
    }
    Kernel::Point const corners[] = {Map({rect.left, rect.top}), Map({rect.right, rect.top}),
                                     Map({rect.left, rect.bottom}), Map({rect.right, rect.bottom})};
    Kernel::Rect bounds{corners[0].x, corners[0].y, corners[0].x, corners[0].y};
    for (Kernel::Point const & corner : corners) {
        bounds.left = std::min(bounds.left, corner.x);
        bounds.top = std::min(bounds.top, corner.y);
        bounds.right = std::max(bounds.right, corner.x);
        bounds.bottom = std::max(bounds.bottom, corner.y);
    }
    return bounds;
}

AffineTransform::Params AffineTransform::Params::Inverse() const
{
    double const determinant = Determinant();
    if (determinant == 0) {
        return {};
    }
    return {d / determinant,  -b / determinant, -c / determinant,
            a / determinant, (c * f - d * e) / determinant, (b * e - a * f) / determinant};
}

}
