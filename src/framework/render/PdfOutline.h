#pragma once

#include <functional>
#include <vector>

#include "framework/render/PdfBookmark.h"

class QPDF;
class QPDFObjectHandle;

namespace Renderer::RenderTree
{

/// Makes the outline (ISO 32000-2, 12.3.3) of these entries, each parent ahead of its children; null if there are none.
/// Entries down to the level `openLevels` are shown open. `destination` gives an entry's destination, null for none.
[[nodiscard]] QPDFObjectHandle
MakeOutline(QPDF & pdf, std::vector<Kernel::Counted<PdfBookmark const>> const & bookmarks, int openLevels,
            std::function<QPDFObjectHandle(PdfBookmark const &)> const & destination);

}
