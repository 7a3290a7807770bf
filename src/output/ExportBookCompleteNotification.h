#pragma once

#include "core/BookNotification.h"
#include "framework/document/ExportCompleteNotification.h"
#include "framework/document/ExportResult.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/LocalisedString.h"

#include <vector>

namespace Raster
{
class DynamicBitmap;
class ICCProfile;
}

namespace Book
{

/// An export of a book has ended. It has one record for each file, good or bad.
class ExportBookCompleteNotification : public BookNotification
{
public:
    using Rec = ExportCompleteNotification::Rec;

    /// No records yet, of an export.
    ExportBookCompleteNotification(Kernel::Counted<BookController const> const & book, String const & filename,
                                   bool isTemp, Kernel::Counted<Raster::DynamicBitmap> previewBitmap,
                                   Kernel::Consolidated<Raster::ICCProfile> previewProfile);

    /// One record at once. `isSave` says that it was a save, which changes the title text; the two lists may be null.
    ExportBookCompleteNotification(Kernel::Counted<BookController const> const & book, bool isSave, bool isTemp,
                                   String const & filename, Kernel::Counted<Renderer::FileExportOptions const> options,
                                   ExportResult result, bool reportWarnings,
                                   std::vector<Kernel::LocalisedString> const * messages,
                                   std::vector<Renderer::RenderTree::Warning> const * warnings,
                                   Kernel::Counted<Raster::DynamicBitmap> previewBitmap,
                                   Kernel::Consolidated<Raster::ICCProfile> previewProfile);

    /// Appends a record; the two lists may be null.
    void AddResult(bool isSave, String const & path, Kernel::Counted<Renderer::FileExportOptions const> options,
                   ExportResult result, std::vector<Kernel::LocalisedString> const * messages,
                   std::vector<Renderer::RenderTree::Warning> const * warnings);

    [[nodiscard]] std::vector<Rec> const & GetRecs() const { return m_Recs; }

    /// Appends to `message` a text for each record that failed with a cause, with a blank line between two, and gives the
    /// title for them. False, with `title` left as it was, if there is nothing to tell: an abort and a failure without a
    /// cause have no text.
    bool GetErrorStrings(String & message, String & title) const;

    bool RequiredForPreviewing() const override { return false; }
    /// It was a throw-away export for a preview.
    virtual bool IsTemp() const { return m_IsTemp; }
    [[nodiscard]] bool ReportWarnings() const { return m_ReportWarnings; }
    [[nodiscard]] String GetOriginalFilename() const { return m_OriginalFilename; }
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap> GetPreviewBitmap() const { return m_PreviewBitmap; }
    [[nodiscard]] Kernel::Consolidated<Raster::ICCProfile> GetPreviewProfile() const { return m_PreviewProfile; }

private:
    std::vector<Rec> m_Recs;
    bool m_IsSave = false;
    bool m_IsTemp = false;
    bool m_ReportWarnings = false;
    String m_OriginalFilename;
    Kernel::Counted<Raster::DynamicBitmap> m_PreviewBitmap;
    Kernel::Consolidated<Raster::ICCProfile> m_PreviewProfile;
};

}
