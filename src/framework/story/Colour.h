#pragma once

#include <array>
#include <cstdint>

namespace Story
{

/// A colour as text attributes hold it: a space and its components, each from 0 to 1. For Lab, L is 0 to 1 for 0 to
/// 100, and a and b are 0 to 1 for -128 to 127. Unused components are 0. Drawing converts it to the output's space.
struct Colour
{
    enum class Space : std::uint8_t
    {
        Grey = 0,
        RGB = 1,
        CMYK = 2,
        Lab = 3
    };

    Space m_Space = Space::Grey;
    std::array<float, 4> m_Components{};

    [[nodiscard]] static constexpr Colour Grey(float value) { return {Space::Grey, {value, 0, 0, 0}}; }
    [[nodiscard]] static constexpr Colour RGB(float r, float g, float b) { return {Space::RGB, {r, g, b, 0}}; }
    [[nodiscard]] static constexpr Colour CMYK(float c, float m, float y, float k)
    {
        return {Space::CMYK, {c, m, y, k}};
    }

    friend bool operator==(Colour const &, Colour const &) = default;
};

}
