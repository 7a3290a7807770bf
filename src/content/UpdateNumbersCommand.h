#pragma once

#include "commands/BookCommand.h"
#include "framework/kernel/Counted.h"

#include <map>
#include <vector>

class DocumentController;

namespace Kernel
{
class Progress;
}

namespace Book
{

class BookChapter;

/// Makes the page numbers of the book's chapters run on as one sequence.
///
/// It walks all chapters in book order, keeps one running page number, opens each chapter that it has to change,
/// rewrites the start numbers of that chapter's sections and lets the document go again, which saves it. Of the chapters
/// that it does not change it reads only the one that stands just before a run of changed ones: that chapter's own
/// sections fix the number. A chapter that can't be opened is passed by, and its pages are not counted.
///
/// While it runs the book is in a number update, so that the notifications that it provokes don't start it anew.
class UpdateNumbersCommand : public BookCommand
{
    KORVANE_BOOK_COMMAND(UpdateNumbersCommand);

public:
    /// Only membership in `chapters` counts: the walk follows the book's order. `updateLists` and `updateNotes` have
    /// the chapter before a changed one read even if the changed one has a start page of its own.
    UpdateNumbersCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, bool updatePages, bool updateLists,
                         bool updateNotes);

    Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    /// A chapter notification for each chapter given, in order, then one that the book changed.
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    ProgressType GetProgressType() override;

    /// Advances `next` over the document's endnote references that number through the whole book, as their own start
    /// numbers and restarts say. The document is only read.
    static void InvestigateNotes(Kernel::Counted<DocumentController const> document, int & next);

protected:
    UpdateNumbersCommand();

    /// Reads a chapter that isn't updated and moves `pageNumber` on as if it had been.
    void InvestigateChapter(Kernel::Counted<BookChapter> chapter, int & pageNumber);

    /// Updates one chapter. True if its document has unsaved changes afterwards.
    bool UpdateChapter(Kernel::Counted<BookChapter> chapter, int & pageNumber,
                       Kernel::Counted<Kernel::Progress> progress);

private:
    /// Rewrites the chapter's section numbers in one step that can be undone; no step if nothing differs.
    void UpdateSections(BookChapter const & chapter, Kernel::Counted<DocumentController> const & document,
                        int & pageNumber);

    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    bool m_UpdatePages = false;
    bool m_UpdateLists = false;
    bool m_UpdateNotes = false;
};

}
