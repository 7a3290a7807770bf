#pragma once

#include <vector>

#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/ResamplerType.h"
#include "framework/render/DisplayList.h"
#include "framework/render/Schema.h"
#include "framework/render/Warning.h"

namespace Renderer::RenderTree
{

/// Draws a display list into a bitmap of red, green, blue and alpha in 8 bits, through cairo: for previews and pictures
/// of pages. Colours are converted to the schema's RGB profile.
class RasterSink
{
public:
    /// Greatest width or height in pixels.
    static constexpr int MaximumSide = 32000;

    explicit RasterSink(Kernel::Counted<Schema const> schema) : m_Schema(std::move(schema)) {}

    /// How placed pictures are brought to fewer and to more pixels than they have. Bilinear at first.
    void SetResamplers(enum Raster::ResamplerType down, enum Raster::ResamplerType up)
    {
        m_Down = down;
        m_Up = up;
    }

    /// A bitmap of `width` by `height` pixels that shows the list through `toPixels`, on a transparent ground. Null if a
    /// side is below 1 or above the maximum, or if there is no memory. `warnings` may be null. Safe on any thread.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap> Draw(DisplayList const & list, int width, int height,
                                                              Raster::AffineTransform::Params const & toPixels,
                                                              std::vector<Warning> * warnings) const;

private:
    Kernel::Counted<Schema const> m_Schema;
    enum Raster::ResamplerType m_Down = Raster::ResamplerBilinear;
    enum Raster::ResamplerType m_Up = Raster::ResamplerBilinear;
};

}
