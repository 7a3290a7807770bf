#pragma once

#include "commands/BookCommand.h"
#include "framework/kernel/Counted.h"

class DocumentController;

namespace Book
{

class BookChapter;

/// Brings the book's cache of one open chapter's anchors up to date after the anchors of its document have changed.
class ReconcileAnchorsCommand : public BookCommand
{
    KORVANE_BOOK_COMMAND(ReconcileAnchorsCommand);

public:
    ReconcileAnchorsCommand(Kernel::Counted<BookChapter const> chapter,
                            Kernel::Counted<DocumentController const> document);

    Kernel::LocalisedString GetDescription() const override;
    void Do() override;

protected:
    ReconcileAnchorsCommand();

private:
    Kernel::Counted<BookChapter const> m_Chapter;
    Kernel::Counted<DocumentController const> m_DocumentController;
};

}
