#pragma once

#include "framework/raster/DynamicBitmap.h"

namespace Raster
{

// Plain arithmetic between pixel formats, for where no transform between colour profiles applies. Everything passes
// through red, green, blue and alpha as floats, not premultiplied:
//
// - 8- and 16-bit channels are divided by 255 and 65535; the way back limits to 0 to 1, multiplies, and rounds.
// - Grey is 0.299 red + 0.587 green + 0.114 blue (ITU-R BT.601), and becomes red, green and blue alike.
// - CMYK takes black as the least of what red, green and blue lack, and the other inks from what then is left.
// - Lab is that of sRGB (IEC 61966-2-1) seen under D50.
// - A format of alpha alone has black for its colour.

/// `pixels` pixels of a format as four floats each.
void ToFloatPixels(Format format, void const * source, float * target, std::size_t pixels);
/// The reverse. No-numbers count as 0; only the float formats keep what lies outside of 0 to 1.
void FromFloatPixels(Format format, float const * source, void * target, std::size_t pixels);

/// All pixels of `source` in the target's format. The two have one size.
void ConvertPixels(DynamicBase const & source, DynamicBase & target);

}
