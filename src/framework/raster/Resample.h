#pragma once

#include "framework/raster/DynamicBitmap.h"

namespace Raster
{

/// The bitmap in fewer pixels: each is the mean of the area that it covers, weighted by alpha. Neither side may be
/// larger than the bitmap's. The format stays.
[[nodiscard]] Kernel::Counted<DynamicBitmap> Reduce(DynamicBitmap const & bitmap, int width, int height);

}
