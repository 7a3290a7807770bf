#include "content/ReconcileAnchorsCommand.h"

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/document/DocumentController.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(ReconcileAnchorsCommand, "RcAC");

ReconcileAnchorsCommand::ReconcileAnchorsCommand() = default;

ReconcileAnchorsCommand::ReconcileAnchorsCommand(Kernel::Counted<BookChapter const> chapter,
                                                 Kernel::Counted<DocumentController const> document)
    : m_Chapter(std::move(chapter)), m_DocumentController(std::move(document))
{
}

Kernel::LocalisedString ReconcileAnchorsCommand::GetDescription() const
{
    return Kernel::LocalisedString("Reconcile Anchors", "Book Command");
}

void ReconcileAnchorsCommand::Do()
{
    GetBookController()->UpdateAnchors(m_Chapter, m_DocumentController);
}

}
