#pragma once

#include "framework/kernel/FileOutStream.h"
#include "framework/render/FileExportOptions.h"
#include "framework/render/PdfExport.h"
#include "output/PrintCommand.h"

namespace Book
{

/// Writes sheets into one PDF file, a page for each side.
///
/// A page of the book is in the file once, as a drawing that its sheets show; so are fonts and pictures. Text stays text.
/// The target is whole or untouched: it is put in place at the very end.
class PrintBookCommand final : public PrintCommand
{
    KORVANE_BOOK_COMMAND(PrintBookCommand);

public:
    /// Of the options, marks and bleed play no part: those of the settings do. Links and bookmarks have no place on
    /// paper.
    PrintBookCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings, String target,
                     Kernel::Counted<Renderer::FileExportOptionsPDF const> options);
    ~PrintBookCommand() override;

protected:
    PrintBookCommand() = default;

    [[nodiscard]] ExportResult Begin(std::map<int, PrintedPage> const & pages) override;
    [[nodiscard]] bool TakePage(int index, PrintedPage const & page,
                                Renderer::RenderTree::DisplayList const & content) override;
    [[nodiscard]] bool MakeSheet(PaginatorPage const & sheet) override;
    [[nodiscard]] ExportResult Finish() override;

private:
    String m_Target;
    Kernel::Counted<Renderer::FileExportOptionsPDF const> m_Options;
    Kernel::Counted<Kernel::FileOutStream> m_Stream;
    std::unique_ptr<Renderer::RenderTree::PdfExport> m_Pdf;
    /// Number in the file by the page's running number.
    std::map<int, int> m_Forms;
};

}
