#pragma once

#include "framework/render/PdfFile.h"
#include "framework/render/PdfObjects.h"

namespace Renderer::RenderTree
{

/// The page labels (ISO 32000-2, 12.4.2); nothing if no page has one.
void MakePageLabels(PdfFile const & file, QPDFObjectHandle & catalogue);
/// What the document's own colours mean (ISO 32000-2, 14.11.5).
void MakeOutputIntent(PdfObjects & objects, PdfSchema const & schema, QPDFObjectHandle & catalogue);
/// The document information, the metadata, the language and how a reader is to show the file.
void MakeInformation(PdfObjects & objects, PdfInfo const & info, QPDFObjectHandle & catalogue);

}
