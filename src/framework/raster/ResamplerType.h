#pragma once

namespace Raster
{

/// How a bitmap is brought to another size, from the quickest to the best.
enum ResamplerType
{
    /// The pixel that lies nearest.
    ResamplerNearest = 0,
    /// Linear between neighbours; when shrinking, the mean of what falls into a pixel.
    ResamplerBilinear = 1,
    /// Cubic (Catmull-Rom) between neighbours; sharper, may overshoot.
    ResamplerBicubic = 2,
    /// Windowed sinc of three lobes.
    ResamplerLanczos3 = 3
};

}
