#pragma once

#include <algorithm>
#include <limits>

namespace Kernel
{

/// A position. Document coordinates are points (1/72 inch), y down, origin at the spread's top left.
template <typename T>
struct PointT
{
    T x{};
    T y{};
    friend bool operator==(PointT const &, PointT const &) = default;
};

/// A width and a height.
template <typename T>
struct SizeT
{
    T width{};
    T height{};
    friend bool operator==(SizeT const &, SizeT const &) = default;
};

/// A rectangle in the order left, top, right, bottom. The empty rectangle, all four coordinates the lowest finite
/// value, means "nothing": every operation here leaves it alone.
template <typename T>
struct RectT
{
    T left{};
    T top{};
    T right{};
    T bottom{};

    static constexpr T EmptyCoordinate = std::numeric_limits<T>::lowest();

    [[nodiscard]] static constexpr RectT Empty()
    {
        return {EmptyCoordinate, EmptyCoordinate, EmptyCoordinate, EmptyCoordinate};
    }

    [[nodiscard]] constexpr bool IsEmpty() const { return *this == Empty(); }
    [[nodiscard]] constexpr T Width() const { return right - left; }
    [[nodiscard]] constexpr T Height() const { return bottom - top; }

    [[nodiscard]] constexpr RectT Moved(T dx, T dy) const
    {
        return IsEmpty() ? *this : RectT{left + dx, top + dy, right + dx, bottom + dy};
    }

    /// The smallest rectangle round both; an empty one adds nothing.
    [[nodiscard]] constexpr RectT United(RectT const & other) const
    {
        if (IsEmpty()) {
            return other;
        }
        if (other.IsEmpty()) {
            return *this;
        }
        return {std::min(left, other.left), std::min(top, other.top), std::max(right, other.right),
                std::max(bottom, other.bottom)};
    }

    /// What both cover, empty if they do not meet. Rectangles that only touch meet, in a rectangle without area.
    [[nodiscard]] constexpr RectT Intersected(RectT const & other) const
    {
        if (IsEmpty() || other.IsEmpty()) {
            return Empty();
        }
        RectT const common{std::max(left, other.left), std::max(top, other.top), std::min(right, other.right),
                           std::min(bottom, other.bottom)};
        return common.left > common.right || common.top > common.bottom ? Empty() : common;
    }

    friend constexpr bool operator==(RectT const &, RectT const &) = default;
};

using Point = PointT<double>;
using Size = SizeT<double>;
using Rect = RectT<double>;

/// Rounds outwards: each coordinate goes to the nearest whole number if it lies within `tolerance` of it, and otherwise
/// left and top down, right and bottom up. The empty rectangle stays as it is.
[[nodiscard]] Rect RoundedOutwards(Rect const & rect, double tolerance);

}
