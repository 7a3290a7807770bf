#include "framework/raster/Format.h"

namespace Raster
{

bool IsFormat(int value)
{
    return (value >= 0 && value <= 7) || value == 9 || value == 10;
}

std::size_t BytesPerChannel(Format format)
{
    switch (format) {
    case Format::Rgba8:
    case Format::GreyAlpha8:
    case Format::Cmyka8:
    case Format::Alpha8:
        return 1;
    case Format::Rgba16:
    case Format::GreyAlpha16:
    case Format::Laba16:
    case Format::Alpha16:
        return 2;
    case Format::RgbaFloat:
    case Format::AlphaFloat:
        return 4;
    }
    return 1;
}

ColourSpace SpaceOfFormat(Format format)
{
    switch (format) {
    case Format::Rgba8:
    case Format::Rgba16:
    case Format::RgbaFloat:
        return ColourSpace::Rgb;
    case Format::GreyAlpha8:
    case Format::GreyAlpha16:
        return ColourSpace::Grey;
    case Format::Cmyka8:
        return ColourSpace::Cmyk;
    case Format::Laba16:
        return ColourSpace::Lab;
    case Format::Alpha8:
    case Format::Alpha16:
    case Format::AlphaFloat:
        return ColourSpace::None;
    }
    return ColourSpace::None;
}

int ChannelCount(ColourSpace space)
{
    switch (space) {
    case ColourSpace::None:
        return 0;
    case ColourSpace::Grey:
        return 1;
    case ColourSpace::Rgb:
    case ColourSpace::Lab:
        return 3;
    case ColourSpace::Cmyk:
        return 4;
    }
    return 0;
}

int ChannelCount(Format format)
{
    return ChannelCount(SpaceOfFormat(format)) + 1;
}

std::size_t BytesPerPixel(Format format)
{
    return static_cast<std::size_t>(ChannelCount(format)) * BytesPerChannel(format);
}

}
