#pragma once

#include "framework/commands/DocumentCommandBase.h"
#include "framework/document/ExportableInterface.h"
#include "framework/document/ExportResult.h"
#include "framework/document/PagePainter.h"
#include "framework/kernel/Abortable.h"
#include "framework/kernel/FileIOException.h"
#include "framework/kernel/Progress.h"
#include "framework/render/PdfExport.h"
#include "framework/render/PdfHyperlink.h"

/// Base of the commands that write pages of a document to a file. It changes nothing in the document.
///
/// A derived command gives up the document's writer lock while it writes; pages are read under the reader lock here,
/// one at a time.
class ExportItemCommandBase : public PassingDocumentCommand, public Kernel::Abortable
{
public:
    /// \param hasReporter somebody follows the progress
    /// \param isFinal it is no throw-away export for a preview: its progress shows in the front end
    /// \param progress used in place of the command's own; may be null
    /// \param makePreview a bitmap of the first page is kept
    ExportItemCommandBase(bool hasReporter, bool isFinal, Kernel::Counted<Kernel::Progress> progress, bool makePreview);
    ~ExportItemCommandBase() override;

    void SetCustomProgress(Kernel::Counted<Kernel::Progress> progress) { m_Progress = std::move(progress); }
    /// Null if none was asked for, or before the first page.
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap> GetPreviewBitmap() const { return m_PreviewBitmap; }
    [[nodiscard]] Kernel::Consolidated<Raster::ICCProfile> GetPreviewProfile() const { return m_PreviewProfile; }

    /// What a failed write means to the user.
    [[nodiscard]] static enum ExportResult ReasonToError(enum Kernel::FileIOException::Reason reason);

    [[nodiscard]] ProgressType GetProgressType() override
    {
        return m_HasReporter && m_IsFinal ? ShowProgress : NoProgress;
    }
    [[nodiscard]] bool * GetProgressAbortPointer() const override { return GetAbortPointer(); }

protected:
    /// Writes page `index` of the list, with its links if the options want them. `copy` counts output files of one
    /// export and is 0 for a single file. `warnings` may be null; `progress` too. The result is `ExportResultOk`,
    /// `ExportResultAborted` or `ExportResultFailed`.
    enum ExportResult ExportPDFPage(Renderer::RenderTree::PdfExport & pdfExport,
                                    std::vector<ExportableInterface::ExportParams> const & params,
                                    unsigned long long index, int copy,
                                    Kernel::Counted<Renderer::FileExportOptionsPDF const> options,
                                    VisibilityInterface::VisibilityTestOptions const & visibility,
                                    Kernel::Counted<Kernel::Progress> progress,
                                    std::vector<Renderer::RenderTree::Warning> * warnings);

    [[nodiscard]] Kernel::Counted<Kernel::Progress> const & GetProgress() const { return m_Progress; }

    /// Appends the links of one page, in the page's coordinates. Called for each page that is written, under the
    /// document's reader lock.
    virtual void CollatePageHyperlinks(ExportableInterface::ExportParams const & page,
                                       std::vector<Renderer::PdfHyperlink> & links) = 0;

private:
    PagePainter m_Painter;
    Renderer::RenderTree::DisplayList m_List;
    Kernel::Counted<Kernel::Progress> m_Progress;
    Kernel::Counted<Raster::DynamicBitmap> m_PreviewBitmap;
    Kernel::Consolidated<Raster::ICCProfile> m_PreviewProfile;
    bool m_GlyphsEnsured = false;
    bool const m_HasReporter;
    bool const m_IsFinal;
    bool const m_MakePreview;
};
