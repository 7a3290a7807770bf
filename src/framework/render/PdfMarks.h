#pragma once

#include "framework/render/DisplayList.h"
#include "framework/render/PrintersMarks.h"

namespace Renderer::RenderTree
{

/// Draws the marks that the helper's options ask for round a trimmed page. They stand outside of its bleed and print on
/// every plate.
void DrawPrintersMarks(PrintersMarksHelper const & helper, Kernel::Rect const & trim, DisplayList & list);

}
