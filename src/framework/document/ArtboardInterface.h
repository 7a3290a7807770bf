#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Geometry.h"

/// The pages of a spread. Page indices count within the spread, from 0; an index out of range gives the empty
/// rectangle.
class ArtboardInterface : public virtual Kernel::Countable
{
public:
    [[nodiscard]] virtual int GetPageCount() const = 0;
    /// The page's trimmed area on the spread.
    [[nodiscard]] virtual Kernel::RectT<double> GetPageRect(int page) const = 0;
    /// The page's four bleed margins, in the order left, top, right, bottom.
    [[nodiscard]] virtual Kernel::RectT<double> GetPageBleed(int page) const = 0;
    /// The page rectangle, widened by its bleed margins if `includeBleed`.
    [[nodiscard]] virtual Kernel::RectT<double> GetPageExtents(int page, bool includeBleed) const = 0;
};
