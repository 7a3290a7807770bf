#include "output/ExportBookCompleteNotification.h"

#include "core/BookController.h"
#include "framework/kernel/Format.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/ICCProfile.h"
#include "framework/render/FileExportOptions.h"

namespace Book
{

namespace
{

/// Text of a failure with its cause, the path as %1; empty for a result that has none.
Kernel::LocalisedString TextOf(ExportResult result)
{
    switch (result) {
    case ExportResultAccessDenied:
        return Kernel::LocalisedString("Access was denied:\n%1\n", "Export errors");
    case ExportResultPermissionDenied:
        return Kernel::LocalisedString("Permission was denied:\n%1\n", "Export errors");
    case ExportResultOutOfSpace:
        return Kernel::LocalisedString("The destination device is out of space:\n%1\n", "Export errors");
    case ExportResultWriteFailed:
        return Kernel::LocalisedString("Failed to write to the file:\n%1\n", "Export errors");
    case ExportResultChangesNotAllowed:
        return Kernel::LocalisedString("Changes to the file are not allowed:\n%1\n", "Export errors");
    case ExportResultFolderNotCreated:
        return Kernel::LocalisedString("The output folder could not be created:\n%1\n", "Export errors");
    case ExportResultFileNotCreated:
        return Kernel::LocalisedString("The file could not be created:\n%1\n", "Export errors");
    case ExportResultMetadataFailed:
        return Kernel::LocalisedString("Metadata could not be embedded:\n%1\n", "Export errors");
    default:
        return {};
    }
}

}

ExportBookCompleteNotification::ExportBookCompleteNotification(Kernel::Counted<BookController const> const & book,
                                                               String const & filename, bool isTemp,
                                                               Kernel::Counted<Raster::DynamicBitmap> previewBitmap,
                                                               Kernel::Consolidated<Raster::ICCProfile> previewProfile)
    : BookNotification(book),
      m_IsTemp(isTemp),
      m_OriginalFilename(filename),
      m_PreviewBitmap(std::move(previewBitmap)),
      m_PreviewProfile(std::move(previewProfile))
{
}

ExportBookCompleteNotification::ExportBookCompleteNotification(
    Kernel::Counted<BookController const> const & book, bool isSave, bool isTemp, String const & filename,
    Kernel::Counted<Renderer::FileExportOptions const> options, ExportResult result, bool reportWarnings,
    std::vector<Kernel::LocalisedString> const * messages, std::vector<Renderer::RenderTree::Warning> const * warnings,
    Kernel::Counted<Raster::DynamicBitmap> previewBitmap, Kernel::Consolidated<Raster::ICCProfile> previewProfile)
    : ExportBookCompleteNotification(book, filename, isTemp, std::move(previewBitmap), std::move(previewProfile))
{
    m_IsSave = isSave;
    m_ReportWarnings = reportWarnings;
    AddResult(isSave, filename, std::move(options), result, messages, warnings);
}

void ExportBookCompleteNotification::AddResult(bool isSave, String const & path,
                                               Kernel::Counted<Renderer::FileExportOptions const> options,
                                               ExportResult result,
                                               std::vector<Kernel::LocalisedString> const * messages,
                                               std::vector<Renderer::RenderTree::Warning> const * warnings)
{
    Rec record;
    record.m_Path = path;
    record.m_Options = std::move(options);
    if (messages) {
        record.m_Messages = *messages;
    }
    if (warnings) {
        record.m_Warnings = *warnings;
    }
    record.m_Result = result;
    record.m_IsSave = isSave;
    m_Recs.push_back(std::move(record));
}

bool ExportBookCompleteNotification::GetErrorStrings(String & message, String & title) const
{
    for (Rec const & record : m_Recs) {
        String const text = TextOf(record.m_Result).ToString();
        if (text.Empty()) {
            continue;
        }
        if (!message.Empty()) {
            message += "\n";
        }
        message += Kernel::Format(text, record.m_Path);
    }
    if (message.Empty()) {
        return false;
    }
    title = (m_IsSave ? Kernel::LocalisedString("Errors occurred while saving", "Export errors")
                      : Kernel::LocalisedString("Errors occurred while exporting", "Export errors"))
                .ToString();
    return true;
}

}
