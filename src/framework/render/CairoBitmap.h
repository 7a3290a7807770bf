#pragma once

#include <cairo.h>
#include <memory>

#include "framework/raster/DynamicBitmap.h"

namespace Renderer::RenderTree
{

struct CairoDeleter
{
    void operator()(cairo_t * context) const { cairo_destroy(context); }
    void operator()(cairo_surface_t * surface) const { cairo_surface_destroy(surface); }
    void operator()(cairo_pattern_t * pattern) const { cairo_pattern_destroy(pattern); }
};
using ContextPtr = std::unique_ptr<cairo_t, CairoDeleter>;
using SurfacePtr = std::unique_ptr<cairo_surface_t, CairoDeleter>;
using PatternPtr = std::unique_ptr<cairo_pattern_t, CairoDeleter>;

/// An image surface's pixels (32 bits, colours multiplied by alpha) as Rgba8.
[[nodiscard]] Kernel::Counted<Raster::DynamicBitmap> Unpremultiplied(cairo_surface_t * surface);

}
