#pragma once

#include "framework/kernel/Countable.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/StringT.h"
#include "framework/raster/ICCProfile.h"
#include "framework/render/FileExportOptions.h"

/// How one exportable is written. An immutable value.
class ExportConfig : public virtual Kernel::Countable
{
public:
    ExportConfig(Kernel::Consolidated<Renderer::FileExportOptions> options, String name,
                 Kernel::Consolidated<Raster::ICCProfile> profile);
    ~ExportConfig() override;

    [[nodiscard]] static Kernel::Consolidated<ExportConfig>
    CreateDefault(Kernel::Consolidated<Renderer::FileExportOptions> const & options, String const & name,
                  Kernel::Consolidated<Raster::ICCProfile> const & profile);

    [[nodiscard]] Kernel::Consolidated<Renderer::FileExportOptions> const & GetOptions() const { return m_Options; }
    [[nodiscard]] String const & GetName() const { return m_Name; }
    /// Null: the profile of the document.
    [[nodiscard]] Kernel::Consolidated<Raster::ICCProfile> const & GetProfile() const { return m_Profile; }

private:
    Kernel::Consolidated<Renderer::FileExportOptions> m_Options;
    String m_Name;
    Kernel::Consolidated<Raster::ICCProfile> m_Profile;
};
