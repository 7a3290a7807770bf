#pragma once

#include "framework/render/PdfFont.h"
#include "framework/render/PdfObjects.h"

namespace Renderer::RenderTree
{

/// Cuts the fonts down, on two threads, and makes their objects, in their order; null for those that are not embedded.
/// Throws what the compressor's jobs throw.
[[nodiscard]] std::vector<QPDFObjectHandle> MakeFonts(PdfObjects & objects,
                                                      std::vector<std::unique_ptr<PdfFont>> const & fonts,
                                                      PdfCompressor & compressor);

}
