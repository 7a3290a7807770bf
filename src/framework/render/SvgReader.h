#pragma once

#include <optional>
#include <vector>

#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/Picture.h"

namespace Renderer::RenderTree
{

// SVG through librsvg. Files that an SVG links to are taken from its own folder and below, nothing from elsewhere; no
// entities are fetched. `path` is the file's own path. Safe on any thread.

/// The size that the file asks for, in points, 96 of its pixels to the inch: its width and height, otherwise its view
/// box, otherwise what it draws. Nothing with a reason if the file is broken or draws nothing.
[[nodiscard]] std::optional<Kernel::Size> ReadSvgSize(std::vector<unsigned char> const & bytes, String const & path,
                                                      Raster::PictureProblem & problem);

/// The drawing as a PDF file of one page: paths as paths, text as text with its fonts. Filters become pixels there, 288
/// to the inch. The page is larger than the drawing by some factor, but has its shape. Null with a reason.
[[nodiscard]] Raster::Picture::Bytes SvgToPdf(std::vector<unsigned char> const & bytes, String const & path,
                                              Kernel::Size const & size, Raster::PictureProblem & problem);

/// The drawing in pixels, on a transparent ground. Null with a reason.
[[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> DrawSvg(std::vector<unsigned char> const & bytes,
                                                                   String const & path, int width, int height,
                                                                   Raster::PictureProblem & problem);

/// The files that an SVG may show beside what it holds itself: their ways from its own folder, each once. Only what may
/// be read, which is in that folder or below; whether there is such a file is not asked.
[[nodiscard]] std::vector<String> FindSvgLinks(std::vector<unsigned char> const & bytes);

}
