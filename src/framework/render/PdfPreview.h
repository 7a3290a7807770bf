#pragma once

#include "framework/raster/Picture.h"

namespace Renderer::RenderTree
{

class PdfSource;

/// A page of a PDF file in pixels, on a transparent ground, in sRGB. Drawn by the program `pdftocairo`, which gets a file
/// of that one page and nothing else, through memory, and has a limit of time and memory: whatever a broken or hostile
/// file does to it, it does not do here. Null with a reason; `Unsupported` if the program is not installed.
[[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> DrawPdfPage(PdfSource & source, int page, int width,
                                                                       int height, Raster::PictureProblem & problem);

/// The program is there to be had.
[[nodiscard]] bool CanDrawPdfPages();

}
