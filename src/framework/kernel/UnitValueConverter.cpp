#include "framework/kernel/UnitValueConverter.h"

#include "framework/kernel/Assert.h"

namespace Kernel
{

UnitValueConverter::UnitValueConverter(double dpi) : m_Dpi(dpi)
{
    KORVANE_ASSERT(0.0 < dpi);
}

double UnitValueConverter::PointsInUnit(UnitValue::UnitType unit) const
{
    switch (unit) {
    case UnitValue::UnitType::Points:
        return 1.0;
    case UnitValue::UnitType::Picas:
        return 12.0;
    case UnitValue::UnitType::Inches:
        return 72.0;
    case UnitValue::UnitType::Millimetres:
        return 72.0 / 25.4;
    case UnitValue::UnitType::Centimetres:
        return 72.0 / 2.54;
    case UnitValue::UnitType::Pixels:
        return 72.0 / m_Dpi;
    }
    return 1.0;
}

double UnitValueConverter::ToPoints(double value, UnitValue::UnitType unit) const
{
    return value * PointsInUnit(unit);
}

double UnitValueConverter::FromPoints(double points, UnitValue::UnitType unit) const
{
    return points / PointsInUnit(unit);
}

}
