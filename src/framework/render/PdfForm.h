#pragma once

#include "framework/render/PdfObjectCopier.h"
#include "framework/render/PdfSource.h"

namespace Renderer::RenderTree
{

/// Fills the dictionary of a stream that holds a page's content, so that it is a form XObject which shows the page in the
/// unit square, upright. `content` tells how the stream is packed. True if the page was blended as a group.
bool MakeForm(PdfSource::Page const & page, PdfSource::Content const & content, PdfObjectCopier & copier,
              QPDFObjectHandle stream);

}
