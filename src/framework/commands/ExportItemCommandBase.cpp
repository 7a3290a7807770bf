#include "framework/commands/ExportItemCommandBase.h"

#include "framework/document/DocumentControllerSession.h"
#include "framework/render/RasterSink.h"

#include <algorithm>
#include <cmath>

namespace
{

/// Longest side of a preview in pixels.
constexpr double PreviewSide = 1024;

Renderer::BleedMargins BleedOf(ExportableInterface::ExportParams const & page)
{
    return {page.m_Rect.left - page.m_BleedRect.left, page.m_Rect.top - page.m_BleedRect.top,
            page.m_BleedRect.right - page.m_Rect.right, page.m_BleedRect.bottom - page.m_Rect.bottom};
}

/// The options' marks, moved outwards where they would stand in a wide bleed.
Renderer::PrintersMarksOptions MarksClearOf(Renderer::BleedMargins const & bleed,
                                            Renderer::FileExportOptionsPDF const & options)
{
    Renderer::PrintersMarksOptions marks = options.GetPrintersMarks();
    if (options.GetIncludeBleed()) {
        marks.m_Offset = std::max({marks.m_Offset, bleed.m_Left, bleed.m_Top, bleed.m_Right, bleed.m_Bottom});
    }
    return marks;
}

}

ExportItemCommandBase::ExportItemCommandBase(bool hasReporter, bool isFinal, Kernel::Counted<Kernel::Progress> progress,
                                             bool makePreview)
    : m_Progress(std::move(progress)),
      m_HasReporter(hasReporter),
      m_IsFinal(isFinal),
      m_MakePreview(makePreview)
{
}

ExportItemCommandBase::~ExportItemCommandBase() = default;

enum ExportResult ExportItemCommandBase::ReasonToError(enum Kernel::FileIOException::Reason reason)
{
    using Reason = Kernel::FileIOException::Reason;
    switch (reason) {
    case Reason::OutOfSpace:
        return ExportResultOutOfSpace;
    case Reason::PermissionDenied:
        return ExportResultPermissionDenied;
    case Reason::AccessDenied:
        return ExportResultAccessDenied;
    default:
        return ExportResultWriteFailed;
    }
}

enum ExportResult ExportItemCommandBase::ExportPDFPage(Renderer::RenderTree::PdfExport & pdfExport,
                                                       std::vector<ExportableInterface::ExportParams> const & params,
                                                       unsigned long long index, int,
                                                       Kernel::Counted<Renderer::FileExportOptionsPDF const> options,
                                                       VisibilityInterface::VisibilityTestOptions const & visibility,
                                                       Kernel::Counted<Kernel::Progress>,
                                                       std::vector<Renderer::RenderTree::Warning> * warnings)
{
    if (IsAborted()) {
        return ExportResultAborted;
    }
    ExportableInterface::ExportParams const & page = params[static_cast<std::size_t>(index)];
    if (!m_GlyphsEnsured) {
        GetDocument()->EnsureGlyphs();
        m_GlyphsEnsured = true;
    }
    std::vector<Renderer::PdfHyperlink> links;
    {
        DocumentControllerSession const session(Kernel::NonCounted<DocumentController const>(GetDocument().Get()));
        m_Painter.Paint(page, visibility, m_List, warnings);
        if (options->GetHyperlinks()) {
            CollatePageHyperlinks(page, links);
        }
    }
    Kernel::Counted<Renderer::PrintersMarksHelper> const marks =
        Kernel::MakeCounted<Renderer::PrintersMarksHelper>(page.m_Rect, GetDocument()->GetUnitConverter());
    marks->SetOptions(MarksClearOf(BleedOf(page), *options));
    marks->SetFilename(pdfExport.GetFilename());
    marks->SetIsIncludeBleed(options->GetIncludeBleed());

    Renderer::RenderTree::PdfPage frame;
    frame.m_Boxes = marks->GetBoxes(BleedOf(page));
    frame.m_Label = page.m_Label;
    frame.m_PrintersMarks = marks;
    using Continues = Renderer::RenderTree::PdfPage::Continues;
    frame.m_ContinuesSpread = page.m_IsBesidePrevious  ? Continues::Beside
                              : page.m_IsBelowPrevious ? Continues::Below
                                                       : Continues::Nothing;
    if (!pdfExport.WritePage(frame, m_List, links, warnings)) {
        return IsAborted() ? ExportResultAborted : ExportResultFailed;
    }
    if (m_MakePreview && !m_PreviewBitmap && 0 < page.m_Rect.Width() && 0 < page.m_Rect.Height()) {
        double const scale = PreviewSide / std::max(page.m_Rect.Width(), page.m_Rect.Height());
        Kernel::Counted<Renderer::RenderTree::Schema> const schema =
            Kernel::MakeCounted<Renderer::RenderTree::Schema>();
        schema->SetColourFormatAndProfiles(Raster::Format::Rgba8, GetDocument()->GetProfiles());
        auto const toPixels = Raster::AffineTransform::Params::Translation(-page.m_Rect.left, -page.m_Rect.top)
                                  .Then(Raster::AffineTransform::Params::Scale(scale, scale));
        m_PreviewBitmap = Renderer::RenderTree::RasterSink(schema).Draw(
            m_List, std::max(1, static_cast<int>(std::lround(page.m_Rect.Width() * scale))),
            std::max(1, static_cast<int>(std::lround(page.m_Rect.Height() * scale))), toPixels, nullptr);
        m_PreviewProfile = Raster::ICCManager::GetInstance().GetDefaultProfileForFormat(Raster::Format::Rgba8);
    }
    return ExportResultOk;
}
