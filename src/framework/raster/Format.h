#pragma once

#include <cstddef>

namespace Raster
{

/// Pixel formats. The numbers are written in files: never change one.
/// Alpha is always the last channel and is not premultiplied. CMYK 0 is no ink. Float channels are 32 bits wide and may
/// lie outside of 0 to 1. Lab 16: L 0..65535 is 0..100, a and b 0..65535 are -128..127.996.
enum class Format : int
{
    Rgba8 = 0,
    Rgba16 = 1,
    GreyAlpha8 = 2,
    GreyAlpha16 = 3,
    Cmyka8 = 4,
    Laba16 = 5,
    Alpha8 = 6,
    Alpha16 = 7,
    RgbaFloat = 9,
    AlphaFloat = 10,
};

/// What the colour channels of a format, a colour or a profile mean.
enum class ColourSpace : int
{
    /// Coverage only.
    None = 0,
    Grey = 1,
    Rgb = 2,
    Cmyk = 3,
    Lab = 4,
};

/// True for the numbers above; 8 and everything else is no format.
[[nodiscard]] bool IsFormat(int value);

/// All channels, alpha included.
[[nodiscard]] int ChannelCount(Format format);
/// 1, 2 or 4.
[[nodiscard]] std::size_t BytesPerChannel(Format format);
[[nodiscard]] std::size_t BytesPerPixel(Format format);
[[nodiscard]] ColourSpace SpaceOfFormat(Format format);

/// Colour channels of a space, without alpha.
[[nodiscard]] int ChannelCount(ColourSpace space);

}
