#include "framework/raster/DynamicBitmap.h"

#include "framework/kernel/Assert.h"
#include "framework/raster/PixelConversion.h"

#include <algorithm>
#include <cstring>

namespace Raster
{

DynamicPixel::DynamicPixel(Pixel const & pixel, Format format) : m_Format(format)
{
    float const colour[] = {static_cast<float>(pixel.m_Red) / 255, static_cast<float>(pixel.m_Green) / 255,
                            static_cast<float>(pixel.m_Blue) / 255, static_cast<float>(pixel.m_Alpha) / 255};
    FromFloatPixels(format, colour, m_Bytes, 1);
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
