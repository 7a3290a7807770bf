#include "framework/render/Schema.h"

#include "framework/kernel/Assert.h"

namespace Renderer::RenderTree
{

void Schema::SetColourFormatAndProfiles(Raster::Format format, Raster::ICCManager::ICCProfileSet const & profiles)
{
    m_Format = format;
    m_Profiles = profiles;
}

PdfSchema::PdfSchema(Kernel::Counted<FileExportOptionsPDF const> options, bool * abort)
    : m_Options(std::move(options)), m_Abort(abort)
{
    KORVANE_ASSERT(m_Options);
}

}
