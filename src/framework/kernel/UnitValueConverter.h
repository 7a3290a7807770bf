#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/UnitValue.h"

namespace Kernel
{

/// Converts between points (1/72 inch) and the other units for a document of a given resolution. Immutable.
class UnitValueConverter : public virtual Countable
{
public:
    /// `dpi` is the document's resolution in pixels to the inch, above 0.
    explicit UnitValueConverter(double dpi);

    [[nodiscard]] double GetDpi() const { return m_Dpi; }
    [[nodiscard]] double ToPoints(double value, UnitValue::UnitType unit) const;
    [[nodiscard]] double FromPoints(double points, UnitValue::UnitType unit) const;
    [[nodiscard]] double PointsToPixels(double points) const { return points * m_Dpi / 72.0; }
    [[nodiscard]] double PixelsToPoints(double pixels) const { return pixels * 72.0 / m_Dpi; }

private:
    [[nodiscard]] double PointsInUnit(UnitValue::UnitType unit) const;

    double const m_Dpi;
};

}
