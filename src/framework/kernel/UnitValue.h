#pragma once

namespace Kernel
{

/// Units in which a user reads and writes lengths. Lengths themselves are kept in points.
class UnitValue
{
public:
    enum class UnitType
    {
        Points = 0,
        Picas = 1,
        Inches = 2,
        Millimetres = 3,
        Centimetres = 4,
        /// Of the document's resolution.
        Pixels = 5,
    };
};

}
