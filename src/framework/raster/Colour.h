#pragma once

#include <array>

#include "framework/raster/Format.h"

namespace Raster
{

/// A colour in its own space. Components are 0 to 1 (CMYK: 1 is full ink; Lab: L 0 to 100, a and b -128 to 127); those
/// that the space does not have are 0. Which profile the numbers are meant in is said by the document's profile set.
struct Colour
{
    ColourSpace m_Space = ColourSpace::Grey;
    std::array<float, 4> m_Components{};
    /// 1 is opaque.
    float m_Alpha = 1.0F;

    [[nodiscard]] static constexpr Colour Grey(float grey, float alpha = 1.0F)
    {
        return {ColourSpace::Grey, {grey, 0, 0, 0}, alpha};
    }
    [[nodiscard]] static constexpr Colour Rgb(float red, float green, float blue, float alpha = 1.0F)
    {
        return {ColourSpace::Rgb, {red, green, blue, 0}, alpha};
    }
    [[nodiscard]] static constexpr Colour Cmyk(float cyan, float magenta, float yellow, float black, float alpha = 1.0F)
    {
        return {ColourSpace::Cmyk, {cyan, magenta, yellow, black}, alpha};
    }
    [[nodiscard]] static constexpr Colour Lab(float lightness, float a, float b, float alpha = 1.0F)
    {
        return {ColourSpace::Lab, {lightness, a, b, 0}, alpha};
    }
    [[nodiscard]] static constexpr Colour Black() { return Grey(0); }
    [[nodiscard]] static constexpr Colour White() { return Grey(1); }

    friend bool operator==(Colour const &, Colour const &) = default;
};

}
