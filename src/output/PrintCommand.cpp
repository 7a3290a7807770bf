#include "output/PrintCommand.h"

#include "documents/ChapterMarshall.h"
#include "framework/commands/DocumentCommandBase.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/PagePainter.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DomainCommandProgress.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/SequenceProgressReporter.h"
#include "output/BookLockSession.h"

#include <algorithm>
#include <functional>

namespace Book
{

namespace
{

/// Lets pages be drawn on the queue of their document, with the writer lock given up.
class DrawPagesCommand final : public PassingDocumentCommand
{
public:
    explicit DrawPagesCommand(std::function<void(DocumentController &)> draw) : m_Draw(std::move(draw)) {}

    Kernel::LocalisedString GetDescription() const override
    {
        return Kernel::LocalisedString("Draw Pages", "Book Commands");
    }
    void Do() override
    {
        DomainWriterUnlockSession const unlocked(Kernel::Counted<DomainController>(GetDocument().Get()));
        GetDocument()->EnsureGlyphs();
        m_Draw(*GetDocument());
    }
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}

private:
    std::function<void(DocumentController &)> m_Draw;
};

}

PrintCommand::PrintCommand(std::vector<PaginatorPage> sheets, PrintSettings const & settings)
    : m_Sheets(std::move(sheets)), m_Settings(settings)
{
}

Kernel::LocalisedString PrintCommand::GetDescription() const
{
    return Kernel::LocalisedString("Print Book", "Book Commands");
}

void PrintCommand::Do()
{
    BookLockSession const lock(GetBookController());
    m_Result = Print();
    if (IsAborted()) {
        m_Result = ExportResultAborted;
    }
}

ExportResult PrintCommand::Print()
{
    std::map<int, PrintedPage> const pages = CollectPages();
    if (ExportResult const begun = Begin(pages); begun != ExportResultOk) {
        return begun;
    }
    auto const progress = Kernel::MakeCounted<DomainCommandProgress>(
        GetDescription().ToString(), Kernel::Counted<DomainController>(GetBookController()), this);
    // Placing a page is nothing beside drawing it.
    auto const reporter =
        Kernel::MakeCounted<Kernel::SequenceProgressReporter>(static_cast<unsigned long long>(pages.size()));
    progress->SetReporter(reporter);
    if (!DrawPages(pages, *reporter)) {
        return ExportResultFailed;
    }
    for (PaginatorPage const & sheet : m_Sheets) {
        if (IsAborted() || !MakeSheet(sheet)) {
            return ExportResultFailed;
        }
    }
    return Finish();
}

std::map<int, PrintCommand::PrintedPage> PrintCommand::CollectPages() const
{
    std::map<int, PrintedPage> pages;
    for (PaginatorPage const & sheet : m_Sheets) {
        for (PaginatorTarget const & target : sheet.m_Targets) {
            PrintedPage & page = pages[target.m_Index];
            page.m_Chapter = target.m_Chapter;
            page.m_Spread = target.m_Spread;
            page.m_Bounds = page.m_Bounds.United(PrintSheet::ShownPart(target, m_Settings));
        }
    }
    std::erase_if(pages, [](auto const & page) {
        Kernel::Rect const & bounds = page.second.m_Bounds;
        return bounds.IsEmpty() || !(bounds.Width() > 0) || !(bounds.Height() > 0);
    });
    return pages;
}

bool PrintCommand::DrawPages(std::map<int, PrintedPage> const & pages, Kernel::SequenceProgressReporter & reporter)
{
    ChapterMarshall marshall(GetBookController());
    PagePainter painter;
    unsigned long long done = 0;
    bool isGood = true;
    for (auto first = pages.begin(); first != pages.end() && isGood && !IsAborted();) {
        Kernel::Counted<BookChapter const> const & chapter = first->second.m_Chapter;
        auto const last =
            std::find_if(first, pages.end(), [&](auto const & page) { return page.second.m_Chapter != chapter; });
        Kernel::Counted<DocumentController const> const document = marshall.GetChapter(chapter, true);
        if (!document) {
            m_Missing.push_back(chapter);
            first = last;
            continue;
        }
        auto const draw = [&](DocumentController & drawn) {
            for (; first != last && isGood && !IsAborted(); ++first) {
                reporter.BeginItemAtIndex(done++);
                isGood = DrawPage(drawn, painter, first->first, first->second);
                reporter.ItemComplete();
            }
        };
        VantraController::GetInstance().EnqueueCommandAndWait(Kernel::MakeCounted<DrawPagesCommand>(draw), document,
                                                              false);
        first = last;
    }
    return isGood && !IsAborted();
}

bool PrintCommand::DrawPage(DocumentController & document, PagePainter & painter, int index, PrintedPage const & page)
{
    std::size_t const before = m_Warnings.size();
    ExportableInterface::ExportParams params;
    params.m_Rect = page.m_Bounds;
    params.m_BleedRect = page.m_Bounds;
    params.m_Clips = {page.m_Bounds};
    {
        DocumentControllerSession const session{Kernel::NonCounted<DocumentController const>(&document)};
        Kernel::JailCounted<SpreadNode> const spread = document.GetDocument()->GetSpreadAtIndex(page.m_Spread);
        if (!spread) {
            return true; // The document has fewer spreads than its record: somebody changed it since sheets were laid.
        }
        params.m_Nodes = {spread};
        painter.Paint(params, {true, true, true, false, false, false}, m_List, &m_Warnings);
    }
    bool const taken = TakePage(index, page, m_List);
    // Pages are told by their running number, as they are chosen, wherever sheets show them.
    std::for_each(m_Warnings.begin() + static_cast<std::ptrdiff_t>(before), m_Warnings.end(),
                  [index](auto & warning) { warning.m_Page = index + 1; });
    return taken;
}

}
