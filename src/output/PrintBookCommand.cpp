#include "output/PrintBookCommand.h"

#include "framework/commands/ExportItemCommandBase.h"
#include "framework/document/DocumentMetadata.h"
#include "framework/render/Schema.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(PrintBookCommand, "PrBC");

PrintBookCommand::PrintBookCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings, String target,
                                   Kernel::Counted<Renderer::FileExportOptionsPDF const> options)
    : PrintCommand(std::move(sheets), settings), m_Target(std::move(target)), m_Options(std::move(options))
{
}

PrintBookCommand::~PrintBookCommand() = default;

ExportResult PrintBookCommand::Begin(std::map<int, PrintedPage> const &)
{
    Kernel::Counted<BookChapter const> const key = GetBookController()->GetKeyChapter(true);
    if (!key) {
        SetError(Kernel::LocalisedString("None of the book's chapters can be opened.", "Output"));
        return ExportResultFailed;
    }
    Kernel::File::OpenUnmanagedResult result{};
    String message;
    m_Stream = Kernel::FileOutStream::Create(m_Target.c_str(), Kernel::File::ShareMode::RespectLocks, result, &message);
    if (!m_Stream) {
        SetError(message);
        return ExportResultFileNotCreated;
    }
    // The colour of the whole file is the key chapter's, as in an export.
    Kernel::Counted<Kernel::UnitValueConverter const> const converter = key->GetUnitConverter();
    auto const schema = Kernel::MakeCounted<Renderer::RenderTree::PdfSchema>(m_Options, GetAbortPointer());
    schema->SetColourFormatAndProfiles(key->GetColourFormat(), key->GetProfiles());
    if (converter) {
        schema->SetDocumentDpi(converter->GetDpi());
    }
    m_Pdf = std::make_unique<Renderer::RenderTree::PdfExport>(schema, converter);
    Kernel::Counted<DocumentMetadata const> const known = key->GetMetadata();
    Kernel::Counted<DocumentMetadata const> const metadata =
        known ? known : Kernel::MakeCounted<DocumentMetadata const>();
    if (!m_Pdf->Create(m_Target.c_str(), m_Stream, metadata->GetSubject(), metadata->GetTitle(), metadata->GetAuthor(),
                       metadata->GetTags())) {
        SetError(m_Pdf->GetError());
        return ExportResultFailed;
    }
    return ExportResultOk;
}

bool PrintBookCommand::TakePage(int index, PrintedPage const & page, Renderer::RenderTree::DisplayList const & content)
{
    int const form = m_Pdf->AddForm(content, page.m_Bounds, &Warnings());
    if (form < 0) {
        SetError(m_Pdf->GetError());
        return false;
    }
    m_Forms[index] = form;
    return true;
}

bool PrintBookCommand::MakeSheet(PaginatorPage const & sheet)
{
    PrintSheet const placed(sheet, GetSettings());
    Kernel::Rect const paper{0, 0, placed.GetPaper().width, placed.GetPaper().height};
    Renderer::RenderTree::PdfPage page;
    page.m_Boxes.m_Media = paper;
    page.m_Boxes.m_Trim = placed.GetTrim().Intersected(paper);
    for (PrintSheet::Piece const & piece : placed.GetPieces()) {
        if (auto const form = m_Forms.find(piece.m_Index); form != m_Forms.end()) {
            page.m_Forms.push_back({form->second, piece.m_ToPaper, piece.m_Shown});
        }
    }
    Renderer::RenderTree::DisplayList marks;
    placed.DrawMarks(marks, Renderer::PrintersMarksOptions().m_LineWidth);
    if (!m_Pdf->WritePage(page, marks, {}, &Warnings())) {
        SetError(m_Pdf->GetError());
        return false;
    }
    return true;
}

ExportResult PrintBookCommand::Finish()
{
    if (!m_Pdf->Close()) {
        SetError(m_Pdf->GetError());
        return ExportResultFailed;
    }
    try {
        m_Stream->Close();
    } catch (Kernel::FileIOException const & exception) {
        SetError(exception.what());
        return ExportItemCommandBase::ReasonToError(exception.GetReason());
    }
    return ExportResultOk;
}

}
