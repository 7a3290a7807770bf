#pragma once

#include "framework/kernel/Counted.h"
#include "framework/raster/DynamicBitmap.h"

namespace Renderer
{

/// A change that a view lays over what is rendered: a proof of one ink, for example. Each pixel is changed for itself, so
/// that it does not matter in which pieces a picture is made.
class RenderingFilter : public virtual Kernel::Countable
{
public:
    /// Changes all pixels of a finished piece.
    virtual void Apply(Raster::DynamicBitmap & piece) const = 0;
};

}
