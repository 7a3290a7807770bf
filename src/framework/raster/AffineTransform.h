#pragma once

#include "framework/kernel/Geometry.h"

namespace Raster
{

/// Affine maps of the plane.
class AffineTransform
{
public:
    /// x' = a x + c y + e, y' = b x + d y + f. The default is the identity.
    struct Params
    {
        double a = 1;
        double b = 0;
        double c = 0;
        double d = 1;
        double e = 0;
        double f = 0;

        [[nodiscard]] static constexpr Params Translation(double dx, double dy) { return {1, 0, 0, 1, dx, dy}; }
        [[nodiscard]] static constexpr Params Scale(double sx, double sy) { return {sx, 0, 0, sy, 0, 0}; }
        /// Clockwise on the page, whose y axis points down.
        [[nodiscard]] static Params Rotation(double radians);

        /// First this map, then `next`.
        [[nodiscard]] constexpr Params Then(Params const & next) const
        {
            return {a * next.a + b * next.c,          a * next.b + b * next.d,
                    c * next.a + d * next.c,          c * next.b + d * next.d,
                    e * next.a + f * next.c + next.e, e * next.b + f * next.d + next.f};
        }

        [[nodiscard]] constexpr Kernel::Point Map(Kernel::Point const & point) const
        {
            return {a * point.x + c * point.y + e, b * point.x + d * point.y + f};
        }

        /// The bounding box of the four mapped corners; the empty rectangle stays empty.
        [[nodiscard]] Kernel::Rect MapBounds(Kernel::Rect const & rect) const;

        [[nodiscard]] constexpr double Determinant() const { return a * d - b * c; }
        [[nodiscard]] constexpr bool IsIdentity() const { return *this == Params(); }
        /// The inverse map; the identity if there is none (determinant 0).
        [[nodiscard]] Params Inverse() const;

        friend constexpr bool operator==(Params const &, Params const &) = default;
    };
};

}
