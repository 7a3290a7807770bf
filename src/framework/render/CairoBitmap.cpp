#include "framework/render/CairoBitmap.h"

#include <algorithm>
#include <cstring>

namespace Renderer::RenderTree
{

Kernel::Counted<Raster::DynamicBitmap> Unpremultiplied(cairo_surface_t * surface)
{
    cairo_surface_flush(surface);
    int const width = cairo_image_surface_get_width(surface);
    int const height = cairo_image_surface_get_height(surface);
    unsigned char const * const data = cairo_image_surface_get_data(surface);
    std::size_t const stride = static_cast<std::size_t>(cairo_image_surface_get_stride(surface));
    Kernel::Counted<Raster::DynamicBitmap> bitmap = Kernel::MakeCounted<Raster::DynamicBitmap>();
    bitmap->Create(width, height, Raster::Format::Rgba8, Raster::MipmapMode::OnDemand,
                   Raster::HardwareCachePolicy::Default);
    for (int y = 0; y < height; ++y) {
        std::uint8_t * target = bitmap->GetRow(y);
        for (int x = 0; x < width; ++x, target += 4) {
            std::uint32_t value = 0;
            std::memcpy(&value, data + static_cast<std::size_t>(y) * stride + static_cast<std::size_t>(x) * 4, 4);
            std::uint32_t const alpha = value >> 24;
            for (int channel = 0; channel < 3 && alpha > 0; ++channel) {
                std::uint32_t const colour = value >> (16 - 8 * channel) & 0xFF;
                target[channel] = static_cast<std::uint8_t>(std::min(255U, (colour * 255 + alpha / 2) / alpha));
            }
            target[3] = static_cast<std::uint8_t>(alpha);
        }
    }
    return bitmap;
}

}
