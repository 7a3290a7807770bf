#pragma once

#include "framework/kernel/Abortable.h"
#include "framework/kernel/Counted.h"
#include "framework/raster/ICCManager.h"
#include "framework/render/FileExportOptions.h"

namespace Renderer::RenderTree
{

/// What a whole output has in common, whatever document a page comes from: the colour space and profiles that colours
/// are brought into, and the resolution that effects are drawn in.
class Schema : public virtual Kernel::Countable
{
public:
    void SetColourFormatAndProfiles(Raster::Format format, Raster::ICCManager::ICCProfileSet const & profiles);
    void SetDocumentDpi(double dpi) { m_Dpi = dpi; }

    [[nodiscard]] Raster::Format GetColourFormat() const { return m_Format; }
    [[nodiscard]] Raster::ICCManager::ICCProfileSet const & GetProfiles() const { return m_Profiles; }
    [[nodiscard]] double GetDocumentDpi() const { return m_Dpi; }

private:
    Raster::Format m_Format = Raster::Format::Rgba8;
    Raster::ICCManager::ICCProfileSet m_Profiles;
    double m_Dpi = 300;
};

/// The schema of a PDF: its options besides.
class PdfSchema : public Schema
{
public:
    /// `abort` may be null; otherwise it outlives the schema, and the writer stops at the next page once it is true.
    PdfSchema(Kernel::Counted<FileExportOptionsPDF const> options, bool * abort);

    [[nodiscard]] FileExportOptionsPDF const & GetOptions() const { return *m_Options; }
    [[nodiscard]] bool IsAborted() const { return Kernel::Abortable::IsFlagSet(m_Abort); }

private:
    Kernel::Counted<FileExportOptionsPDF const> m_Options;
    bool * m_Abort;
};

}
