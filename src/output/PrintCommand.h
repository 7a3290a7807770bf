#pragma once

#include "commands/BookCommand.h"
#include "framework/document/ExportResult.h"
#include "framework/kernel/Abortable.h"
#include "framework/render/DisplayList.h"
#include "framework/render/Warning.h"
#include "output/PrintSheet.h"

#include <map>

class DocumentController;
class PagePainter;

namespace Kernel
{
class SequenceProgressReporter;
}

namespace Book
{

/// Base of the commands that render sheets which a paginator has laid.
///
/// It runs on the book's queue with the book lock engaged. Each page that a sheet shows is drawn once, chapter by
/// chapter, with at most three chapter documents open; then the sheets are made of what was kept. It changes nothing in
/// the book. Results are read by who waited for the command's end.
class PrintCommand : public BookCommand, public Kernel::Abortable
{
public:
    Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    ProgressType GetProgressType() override { return ShowProgress; }
    bool * GetProgressAbortPointer() const override { return GetAbortPointer(); }

    [[nodiscard]] ExportResult GetResult() const { return m_Result; }
    /// Why it failed, in one sentence; empty where the result says it all.
    [[nodiscard]] String const & GetError() const { return m_Error; }
    [[nodiscard]] std::vector<Renderer::RenderTree::Warning> const & GetWarnings() const { return m_Warnings; }
    /// Chapters that could not be opened: their pages are blank.
    [[nodiscard]] std::vector<Kernel::Counted<BookChapter const>> const & GetMissingChapters() const { return m_Missing; }

protected:
    /// A page as sheets need it.
    struct PrintedPage
    {
        Kernel::Counted<BookChapter const> m_Chapter;
        int m_Spread = -1;
        /// All that any sheet shows of it, in coordinates of its spread.
        Kernel::Rect m_Bounds = Kernel::Rect::Empty();
    };

    PrintCommand() = default;
    PrintCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings);

    [[nodiscard]] std::vector<PaginatorPage> const & GetSheets() const { return m_Sheets; }
    [[nodiscard]] PrintSettings const & GetSettings() const { return m_Settings; }
    [[nodiscard]] std::vector<Renderer::RenderTree::Warning> & Warnings() { return m_Warnings; }

    /// Opens the output. The pages by running number are what will be drawn.
    [[nodiscard]] virtual ExportResult Begin(std::map<int, PrintedPage> const & pages) = 0;
    /// Keeps a drawn page, in coordinates of its spread. False if that failed.
    [[nodiscard]] virtual bool TakePage(int index, PrintedPage const & page,
                                        Renderer::RenderTree::DisplayList const & content) = 0;
    /// Makes one sheet of what was taken. False if that failed.
    [[nodiscard]] virtual bool MakeSheet(PaginatorPage const & sheet) = 0;
    /// Puts the output where it belongs. Not called after a failure or an abort.
    [[nodiscard]] virtual ExportResult Finish() = 0;
    /// The one sentence for `GetError`.
    void SetError(String const & error) { m_Error = error; }

private:
    [[nodiscard]] std::map<int, PrintedPage> CollectPages() const;
    [[nodiscard]] bool DrawPages(std::map<int, PrintedPage> const & pages, Kernel::SequenceProgressReporter & reporter);
    /// Draws one page on the queue of its document, which it reads under the reader lock.
    [[nodiscard]] bool DrawPage(DocumentController & document, PagePainter & painter, int index,
                                PrintedPage const & page);
    [[nodiscard]] ExportResult Print();

    std::vector<PaginatorPage> m_Sheets;
    PrintSettings m_Settings;
    Renderer::RenderTree::DisplayList m_List;
    ExportResult m_Result = ExportResultFailed;
    String m_Error;
    std::vector<Renderer::RenderTree::Warning> m_Warnings;
    std::vector<Kernel::Counted<BookChapter const>> m_Missing;
};

}
