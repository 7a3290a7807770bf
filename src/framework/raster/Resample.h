#pragma once

#include "framework/raster/AffineTransform.h"
#include "framework/raster/DynamicBitmap.h"

namespace Raster
{

/// Draws a bitmap over what a buffer holds. `toSource` leads from places in the buffer to places in the bitmap, both
/// counted in pixels from the top left corner; what lies beside the bitmap is transparent.
///
/// Where the bitmap has more pixels than the buffer, each pixel gets the mean of the area that it covers; where it has
/// fewer, colours run linearly from one pixel's middle to the next. Colours weigh by their alpha, so that edges mix with
/// what lies beneath and not with the colour of transparent pixels. A bitmap of another format is brought into the
/// buffer's by plain arithmetic first. A transform without an inverse draws nothing.
void Resample(DynamicBitmap const & bitmap, AffineTransform::Params const & toSource, DynamicBase & buffer);

/// The bitmap in fewer pixels. Neither side may be larger than the bitmap's. The format stays.
[[nodiscard]] Kernel::Counted<DynamicBitmap> Reduce(DynamicBitmap const & bitmap, int width, int height);

}
