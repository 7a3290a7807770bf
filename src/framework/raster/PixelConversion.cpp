#include "framework/raster/PixelConversion.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

namespace Raster
{

namespace
{

/// Limited to 0 to 1; a no-number is 0.
double Unit(double value)
{
    return value > 0 ? std::min(value, 1.0) : 0.0;
}

template <typename T>
T Stored(double value)
{
    if constexpr (std::is_floating_point_v<T>) {
        return static_cast<T>(value);
    } else {
        return static_cast<T>(Unit(value) * std::numeric_limits<T>::max() + 0.5);
    }
}

template <typename T>
double Loaded(T value)
{
    if constexpr (std::is_floating_point_v<T>) {
        return static_cast<double>(value);
    } else {
        return static_cast<double>(value) / std::numeric_limits<T>::max();
    }
}

/// The sRGB primaries under D50 (Bradford-adapted), to X, Y and Z; the rows' sums are the white.
constexpr double ToXyz[3][3] = {{0.4360747, 0.3850649, 0.1430804},
                                {0.2225045, 0.7168786, 0.0606169},
                                {0.0139322, 0.0971045, 0.7141733}};
constexpr double FromXyz[3][3] = {{3.1338561, -1.6168667, -0.4906146},
                                  {-0.9787684, 1.9161415, 0.0334540},
                                  {0.0719453, -0.2289914, 1.4052427}};
/// CIE 15: where the cube root gives way to a line.
constexpr double LabEdge = 216.0 / 24389;
constexpr double LabSlope = 24389.0 / 27;
/// 16 bits hold a and b with 257 steps to the unit, 0 at 128 units.
constexpr double LabUnits = 65535.0 / 257;

double WhiteOf(int row)
{
    return ToXyz[row][0] + ToXyz[row][1] + ToXyz[row][2];
}

/// Lightness, a and b, each from 0 to 1 over the range that 16 bits hold.
void RgbToLab(double const (&rgb)[3], double (&lab)[3])
{
    double linear[3];
    for (int i = 0; i < 3; ++i) {
        double const v = Unit(rgb[i]);
        linear[i] = v <= 0.04045 ? v / 12.92 : std::pow((v + 0.055) / 1.055, 2.4);
    }
    double f[3];
    for (int i = 0; i < 3; ++i) {
        double const t = (ToXyz[i][0] * linear[0] + ToXyz[i][1] * linear[1] + ToXyz[i][2] * linear[2]) / WhiteOf(i);
        f[i] = t > LabEdge ? std::cbrt(t) : (LabSlope * t + 16) / 116;
    }
    lab[0] = (116 * f[1] - 16) / 100;
    lab[1] = (500 * (f[0] - f[1]) + 128) / LabUnits;
    lab[2] = (200 * (f[1] - f[2]) + 128) / LabUnits;
}

void LabToRgb(double const (&lab)[3], double (&rgb)[3])
{
    double f[3];
    f[1] = (lab[0] * 100 + 16) / 116;
    f[0] = f[1] + (lab[1] * LabUnits - 128) / 500;
    f[2] = f[1] - (lab[2] * LabUnits - 128) / 200;
    double xyz[3];
    for (int i = 0; i < 3; ++i) {
        double const cube = f[i] * f[i] * f[i];
        xyz[i] = (cube > LabEdge ? cube : (116 * f[i] - 16) / LabSlope) * WhiteOf(i);
    }
    for (int i = 0; i < 3; ++i) {
        double const v = FromXyz[i][0] * xyz[0] + FromXyz[i][1] * xyz[1] + FromXyz[i][2] * xyz[2];
        rgb[i] = v <= 0.0031308 ? v * 12.92 : 1.055 * std::pow(v, 1 / 2.4) - 0.055;
    }
}

/// Colour channels of one pixel, each from 0 to 1, as red, green and blue.
void ColourToRgb(ColourSpace space, double const (&channels)[4], double (&rgb)[3])
{
    switch (space) {
    case ColourSpace::None:
        std::fill(std::begin(rgb), std::end(rgb), 0.0);
        break;
    case ColourSpace::Grey:
        std::fill(std::begin(rgb), std::end(rgb), channels[0]);
        break;
    case ColourSpace::Rgb:
        std::copy_n(channels, 3, rgb);
        break;
    case ColourSpace::Cmyk:
        for (int i = 0; i < 3; ++i) {
            rgb[i] = 1 - std::min(1.0, channels[i] * (1 - channels[3]) + channels[3]);
        }
        break;
    case ColourSpace::Lab:
        LabToRgb({channels[0], channels[1], channels[2]}, rgb);
        break;
    }
}

void RgbToColour(ColourSpace space, double const (&rgb)[3], double (&channels)[4])
{
    switch (space) {
    case ColourSpace::None:
        break;
    case ColourSpace::Grey:
        channels[0] = 0.299 * rgb[0] + 0.587 * rgb[1] + 0.114 * rgb[2];
        break;
    case ColourSpace::Rgb:
        std::copy_n(rgb, 3, channels);
        break;
    case ColourSpace::Cmyk: {
        double const light[3] = {Unit(rgb[0]), Unit(rgb[1]), Unit(rgb[2])};
        double const black = std::min({1 - light[0], 1 - light[1], 1 - light[2]});
        for (int i = 0; i < 3; ++i) {
            channels[i] = black < 1 ? (1 - light[i] - black) / (1 - black) : 0;
        }
        channels[3] = black;
        break;
    }
    case ColourSpace::Lab: {
        double lab[3];
        RgbToLab(rgb, lab);
        std::copy_n(lab, 3, channels);
        break;
    }
    }
}

template <typename T>
void LoadPixels(ColourSpace space, void const * source, float * target, std::size_t pixels)
{
    std::size_t const colours = static_cast<std::size_t>(ChannelCount(space));
    auto const * bytes = static_cast<std::uint8_t const *>(source);
    for (; pixels > 0; --pixels, target += 4, bytes += (colours + 1) * sizeof(T)) {
        T stored[5];
        std::memcpy(stored, bytes, (colours + 1) * sizeof(T));
        double channels[4] = {};
        for (std::size_t i = 0; i < colours; ++i) {
            channels[i] = Loaded(stored[i]);
        }
        double rgb[3];
        ColourToRgb(space, channels, rgb);
        for (int i = 0; i < 3; ++i) {
            target[i] = static_cast<float>(rgb[i]);
        }
        target[3] = static_cast<float>(Loaded(stored[colours]));
    }
}

template <typename T>
void StorePixels(ColourSpace space, float const * source, void * target, std::size_t pixels)
{
    std::size_t const colours = static_cast<std::size_t>(ChannelCount(space));
    auto * bytes = static_cast<std::uint8_t *>(target);
    for (; pixels > 0; --pixels, source += 4, bytes += (colours + 1) * sizeof(T)) {
        double channels[4] = {};
        RgbToColour(space, {static_cast<double>(source[0]), static_cast<double>(source[1]),
                            static_cast<double>(source[2])},
                    channels);
        T stored[5];
        for (std::size_t i = 0; i < colours; ++i) {
            stored[i] = Stored<T>(channels[i]);
        }
        stored[colours] = Stored<T>(static_cast<double>(source[3]));
        std::memcpy(bytes, stored, (colours + 1) * sizeof(T));
    }
}

}

void ToFloatPixels(Format format, void const * source, float * target, std::size_t pixels)
{
    switch (BytesPerChannel(format)) {
    case 1:
        LoadPixels<std::uint8_t>(SpaceOfFormat(format), source, target, pixels);
        break;
    case 2:
        LoadPixels<std::uint16_t>(SpaceOfFormat(format), source, target, pixels);
        break;
    default:
        LoadPixels<float>(SpaceOfFormat(format), source, target, pixels);
        break;
    }
}

void FromFloatPixels(Format format, float const * source, void * target, std::size_t pixels)
{
    switch (BytesPerChannel(format)) {
    case 1:
        StorePixels<std::uint8_t>(SpaceOfFormat(format), source, target, pixels);
        break;
    case 2:
        StorePixels<std::uint16_t>(SpaceOfFormat(format), source, target, pixels);
        break;
    default:
        StorePixels<float>(SpaceOfFormat(format), source, target, pixels);
        break;
    }
}

void ConvertPixels(DynamicBase const & source, DynamicBase & target)
{
    KORVANE_ASSERT(source.GetWidth() == target.GetWidth() && source.GetHeight() == target.GetHeight());
    std::size_t const width = static_cast<std::size_t>(source.GetWidth());
    std::vector<float> row(width * 4);
    for (int y = 0; y < source.GetHeight(); ++y) {
        if (source.GetFormat() == target.GetFormat()) {
            std::copy_n(source.GetRow(y), source.GetRowBytes(), target.GetRow(y));
        } else {
            ToFloatPixels(source.GetFormat(), source.GetRow(y), row.data(), width);
            FromFloatPixels(target.GetFormat(), row.data(), target.GetRow(y), width);
        }
    }
}

}
