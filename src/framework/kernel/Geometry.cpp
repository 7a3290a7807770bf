#include "framework/kernel/Geometry.h"

#include <cmath>

namespace Kernel
{

namespace
{

double Rounded(double value, double tolerance, bool up)
{
    double const nearest = std::round(value);
    if (std::abs(value - nearest) <= tolerance) {
        return nearest;
    }
    return up ? std::ceil(value) : std::floor(value);
}

}

Rect RoundedOutwards(Rect const & rect, double tolerance)
{
    if (rect.IsEmpty()) {
        return rect;
    }
    return {Rounded(rect.left, tolerance, false), Rounded(rect.top, tolerance, false),
            Rounded(rect.right, tolerance, true), Rounded(rect.bottom, tolerance, true)};
}

}
