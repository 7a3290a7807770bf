#include "framework/document/ExportConfig.h"

ExportConfig::ExportConfig(Kernel::Consolidated<Renderer::FileExportOptions> options, String name,
                           Kernel::Consolidated<Raster::ICCProfile> profile)
    : m_Options(std::move(options)),
      m_Name(std::move(name)),
      m_Profile(std::move(profile))
{
}

ExportConfig::~ExportConfig() = default;

Kernel::Consolidated<ExportConfig>
ExportConfig::CreateDefault(Kernel::Consolidated<Renderer::FileExportOptions> const & options, String const & name,
                            Kernel::Consolidated<Raster::ICCProfile> const & profile)
{
    return Kernel::Counted<ExportConfig const>(Kernel::MakeCounted<ExportConfig>(options, name, profile));
}
