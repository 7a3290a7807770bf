#include "framework/raster/DynamicBitmap.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace Raster
{

namespace
{

template <typename T>
void Put(std::uint8_t * bytes, int index, double value)
{
    T stored;
    if constexpr (std::is_floating_point_v<T>) {
        stored = static_cast<T>(value);
    } else {
        stored = static_cast<T>(std::lround(value * std::numeric_limits<T>::max()));
    }
    std::memcpy(bytes + static_cast<std::size_t>(index) * sizeof(T), &stored, sizeof(T));
}

template <typename T>
void PutAll(std::uint8_t * bytes, std::initializer_list<double> values)
{
    int index = 0;
    for (double const value : values) {
        Put<T>(bytes, index++, value);
    }
}

/// CIE Lab (D50) of an sRGB colour, scaled to the range of the 16-bit format.
void PutLab(std::uint8_t * bytes, double red, double green, double blue, double alpha)
{
    auto const linear = [](double v) { return v <= 0.04045 ? v / 12.92 : std::pow((v + 0.055) / 1.055, 2.4); };
    double const r = linear(red);
    double const g = linear(green);
    double const b = linear(blue);
    // The sRGB primaries brought to D50 (ICC sRGB v4 matrix), over the D50 white.
    double const x = (0.4360747 * r + 0.3850649 * g + 0.1430804 * b) / 0.9642;
    double const y = 0.2225045 * r + 0.7168786 * g + 0.0606169 * b;
    double const z = (0.0139322 * r + 0.0971045 * g + 0.7141733 * b) / 0.8249;
    auto const f = [](double t) { return t > 216.0 / 24389 ? std::cbrt(t) : (24389.0 / 27 * t + 16) / 116; };
    double const lightness = 116 * f(y) - 16;
    double const a = 500 * (f(x) - f(y));
    double const bb = 200 * (f(y) - f(z));
    auto const unit = [](double value) { return std::clamp(value, 0.0, 1.0); };
    PutAll<std::uint16_t>(bytes, {unit(lightness / 100), unit((a + 128) * 257 / 65535), unit((bb + 128) * 257 / 65535),
                                  alpha});
}

}

DynamicPixel::DynamicPixel(Pixel const & pixel, Format format) : m_Format(format)
{
    double const red = pixel.m_Red / 255.0;
    double const green = pixel.m_Green / 255.0;
    double const blue = pixel.m_Blue / 255.0;
    double const alpha = pixel.m_Alpha / 255.0;
    double const grey = 0.299 * red + 0.587 * green + 0.114 * blue;
    switch (format) {
    case Format::Rgba8:
        PutAll<std::uint8_t>(m_Bytes, {red, green, blue, alpha});
        break;
    case Format::Rgba16:
        PutAll<std::uint16_t>(m_Bytes, {red, green, blue, alpha});
        break;
    case Format::GreyAlpha8:
        PutAll<std::uint8_t>(m_Bytes, {grey, alpha});
        break;
    case Format::GreyAlpha16:
        PutAll<std::uint16_t>(m_Bytes, {grey, alpha});
        break;
    case Format::Cmyka8: {
        double const black = 1 - std::max({red, green, blue});
        double const rest = 1 - black;
        auto const ink = [&](double light) { return rest > 0 ? (1 - light - black) / rest : 0.0; };
        PutAll<std::uint8_t>(m_Bytes, {ink(red), ink(green), ink(blue), black, alpha});
        break;
    }
    case Format::Laba16:
        PutLab(m_Bytes, red, green, blue, alpha);
        break;
    case Format::Alpha8:
        PutAll<std::uint8_t>(m_Bytes, {alpha});
        break;
    case Format::Alpha16:
        PutAll<std::uint16_t>(m_Bytes, {alpha});
        break;
    case Format::RgbaFloat:
        PutAll<float>(m_Bytes, {red, green, blue, alpha});
        break;
    case Format::AlphaFloat:
        PutAll<float>(m_Bytes, {alpha});
        break;
    }
}

void DynamicBase::Allocate(int width, int height, Format format)
{
    m_Width = std::max(0, width);
    m_Height = std::max(0, height);
    m_Format = format;
    m_Pixels.assign(GetRowBytes() * static_cast<std::size_t>(m_Height), 0);
}

void DynamicBase::Fill(DynamicPixel const & pixel)
{
    KORVANE_ASSERT(pixel.GetFormat() == m_Format);
    std::size_t const size = BytesPerPixel(m_Format);
    for (std::size_t offset = 0; offset < m_Pixels.size(); offset += size) {
        std::memcpy(m_Pixels.data() + offset, pixel.GetBytes(), size);
    }
}

void DynamicBuffer::Clear(bool const * abort)
{
    for (int y = 0; y < GetHeight() && !(abort && *abort); ++y) {
        std::memset(GetRow(y), 0, GetRowBytes());
    }
}

void DynamicBitmap::Create(int width, int height, Format format, MipmapMode mipmaps, HardwareCachePolicy policy)
{
    Allocate(width, height, format);
    m_Mipmaps = mipmaps;
    m_Policy = policy;
}

}
