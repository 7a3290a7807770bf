#include "commands/BookCommand.h"
#include "commands/PreflightChaptersCommand.h"
#include "commands/UpdateChapterCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "framework/document/DocumentController.h"

namespace Book
{

void BookCollection::EnqueueCommand(Kernel::Counted<BookCommand> command, Kernel::Counted<BookController const> book)
{
    auto const mutableBook = GetMutableBookController(book);
    if (!mutableBook) {
        return;
    }
    mutableBook->DomainController::EnqueueCommand(std::move(command));
    MarkRecent(book);
}

void BookCollection::EnqueueCommandAndWait(Kernel::Counted<BookCommand> command,
                                           Kernel::Counted<BookController const> book)
{
    auto const mutableBook = GetMutableBookController(book);
    if (!mutableBook) {
        return;
    }
    MarkRecent(book);
    // Not a semaphore: the queue's own wait knows who is blocked on whom, and comes back when the command is refused.
    mutableBook->DomainController::EnqueueCommandAndWait(std::move(command));
}

bool BookCollection::HandleCommand(Kernel::Counted<DocumentController const> document,
                                   Kernel::Counted<DomainCommand> command)
{
    auto const book = GetBookFromDocument(std::move(document));
    auto const bookCommand = Kernel::CountedCast<BookCommand>(command);
    if (!book || !bookCommand) {
        return false;
    }
    EnqueueCommand(bookCommand, book);
    return true;
}

void BookCollection::UpdateChapterPreflight(Kernel::Counted<BookController const> book,
                                            Kernel::Counted<DocumentController const> document)
{
    if (auto const chapter = book->GetChapterFromPath(document->GetPath())) {
        EnqueueCommand(Kernel::MakeCounted<PreflightChaptersCommand>(ChapterList{chapter}, false), book);
    }
}

bool BookCollection::UpdateChapter(Kernel::Counted<BookController const> book,
                                   Kernel::Counted<DocumentController const> document)
{
    auto const mutableBook = GetMutableBookController(book);
    if (!mutableBook) {
        return false;
    }
    mutableBook->AcquireWriterLock();
    bool changed = false;
    if (auto const chapter = mutableBook->GetChapterFromPath(document->GetPath())) {
        changed = mutableBook->UpdateChapterStatus(chapter, document, true, false);
        if (!changed) {
            EnqueueCommand(Kernel::MakeCounted<UpdateChapterCommand>(chapter), book);
        }
    }
    mutableBook->ReleaseWriterLock();
    return changed;
}

void BookCollection::SetPageNumberOptions(Kernel::Counted<BookController const> book,
                                          Kernel::Counted<BookChapter const> chapter, bool continueFromPrevious,
                                          int startPage)
{
    EnqueueCommand(Kernel::MakeCounted<UpdateChapterSettingsCommand>(chapter, continueFromPrevious, startPage), book);
    if (m_UpdatePageNumbersAutomatically) {
        UpdatePageNumbers(std::move(book), std::move(chapter));
    }
}

}
