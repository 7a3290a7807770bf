// What the collection hands in of commands on content, and its answers to the framework about content.

#include "content/ReconcileAnchorsCommand.h"
#include "content/SetMasterIndexCommand.h"
#include "content/UpdateNumbersCommand.h"
#include "commands/EngageBookLockCommand.h"
#include "core/BookChapter.h"
#include "core/BookCollection.h"
#include "core/BookController.h"
#include "framework/document/Anchors.h"
#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/story/Index.h"

namespace Book
{

void BookCollection::UpdateNumbers(Kernel::Counted<BookController const> book, ChapterList chapters, bool pages,
                                   bool lists, bool notes)
{
    EnqueueCommand(Kernel::MakeCounted<UpdateNumbersCommand>(std::move(chapters), pages, lists, notes), book);
}

void BookCollection::UpdatePageNumbers(Kernel::Counted<BookController const> book,
                                       Kernel::Counted<BookChapter const> chapter)
{
    // A number update's own changes must not start another one.
    if (book->IsInNumberUpdate() || !m_UpdatePageNumbersAutomatically) {
        return;
    }
    ChapterList chapters{chapter};
    book->GetChaptersAfter(chapters, chapter);
    EnqueueCommand(Kernel::MakeCounted<UpdateNumbersCommand>(std::move(chapters), true, false, false), book);
}

void BookCollection::UpdatePageNumbers(Kernel::Counted<BookController const> book,
                                       Kernel::Counted<DocumentController const> document)
{
    if (book->IsInNumberUpdate() || !m_UpdatePageNumbersAutomatically) {
        return;
    }
    if (Kernel::Counted<BookChapter const> const chapter = book->GetChapterFromPath(document->GetPath())) {
        UpdatePageNumbers(book, chapter);
    }
}

void BookCollection::UpdateChapterNumbers(Kernel::Counted<BookController const> book,
                                          Kernel::Counted<DocumentController const> document)
{
    if (Kernel::Counted<BookChapter const> const chapter = book->GetChapterFromPath(document->GetPath())) {
        EnqueueCommand(Kernel::MakeCounted<UpdateNumbersCommand>(ChapterList{chapter}, true, true, true), book);
    }
}

void BookCollection::UpdateAnchors(Kernel::Counted<BookController const> book,
                                   Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<BookController> const mutableBook = GetMutableBookController(book);
    Kernel::Counted<BookChapter> const chapter =
        mutableBook ? mutableBook->GetChapterFromDocumentController(document) : nullptr;
    if (chapter) {
        mutableBook->UpdateChapterAnchors(chapter, document, nullptr);
    }
}

void BookCollection::PreOutput(Kernel::Counted<BookController const> book, ChapterList chapters)
{
    // One after the other on the book's queue. Numbers come first: what the others show depends on them. Chapters hold
    // no cross-references into others, collated endnotes, tables of contents or index of the book that a command could
    // bring up to date.
    bool const isAnythingUpdated = m_UpdateNumbersBeforeOutput || m_UpdateCrossReferencesBeforeOutput ||
                                   m_UpdateEndnotesBeforeOutput || m_UpdateTocsBeforeOutput ||
                                   m_UpdateIndexBeforeOutput;
    if (!isAnythingUpdated) {
        return;
    }
    EnqueueCommand(Kernel::MakeCounted<EngageBookLockCommand>(true), book);
    if (m_UpdateNumbersBeforeOutput) {
        EnqueueCommand(Kernel::MakeCounted<UpdateNumbersCommand>(std::move(chapters), true, true, true), book);
    }
    EnqueueCommand(Kernel::MakeCounted<EngageBookLockCommand>(false), book);
}

void BookCollection::EnqueueSetMasterIndex(Kernel::Counted<BookController const> book,
                                           Kernel::Counted<DocumentController const> document)
{
    EnqueueCommand(Kernel::MakeCounted<SetMasterIndexCommand>(document->GetDocument()->GetIndex()), book);
}

void BookCollection::EnqueueReconcileAnchors(Kernel::Counted<BookController const> book,
                                             Kernel::Counted<BookChapter const> chapter,
                                             Kernel::Counted<DocumentController const> document)
{
    EnqueueCommand(Kernel::MakeCounted<ReconcileAnchorsCommand>(chapter, document), book);
}

bool BookCollection::IsAnyTocOutOfDate(Kernel::Counted<DocumentController const>)
{
    return false; // No chapter holds a table of contents of the book.
}

bool BookCollection::IsIndexOutOfDate(Kernel::Counted<DocumentController const>)
{
    return false; // No chapter holds the book's index.
}

Kernel::Counted<DomainCommand> BookCollection::MakeUpdateIndexCommand(Kernel::Counted<DocumentController const>)
{
    return nullptr;
}

Kernel::Counted<DomainCommand> BookCollection::MakeUpdateAllTocsCommand(Kernel::Counted<DocumentController const>)
{
    return nullptr;
}

bool BookCollection::GetAnchors(AnchorVisitor & visitor, Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<Anchors> const list = visitor.GetAnchors();
    if (document->AreAnchorsCurrent()) {
        for (Kernel::Counted<AnchorInstance const> const & anchor : *document->GetAnchors()) {
            list->Add(anchor);
        }
    } else {
        DocumentControllerSession const session(document);
        visitor.Visit(document->GetDocument());
    }
    Kernel::Counted<BookController const> const book = GetBookFromDocument(document);
    if (!book) {
        return false;
    }
    book->AddBlindAnchors(list, book->GetChapterFromDocumentController(document), document->GetPDFBookmarkManager());
    return true;
}

bool BookCollection::IsAnchorPointValid(Kernel::Counted<AnchorInstance const> instance,
                                        Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<BookController const> const book = GetBookFromDocument(document);
    if (!book) {
        return false;
    }
    ChapterList chapters;
    book->GetChapters(chapters);
    String const uid = instance->GetUid();
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        Snapshot<std::vector<AnchorInfo>> const anchors = chapter->GetAnchors();
        for (AnchorInfo const & info : anchors) {
            if (!(info.m_Uid == uid)) {
                continue;
            }
            Snapshot<std::vector<SpreadInfo>> const spreads = chapter->GetSpreadInfo();
            if (info.m_SpreadIndex < 0 || static_cast<std::size_t>(info.m_SpreadIndex) >= spreads.size()) {
                return false;
            }
            Kernel::Rect const & extents = spreads[static_cast<std::size_t>(info.m_SpreadIndex)].m_SpreadExtents;
            Kernel::Point const & point = info.m_TargetPoint;
            return point.x >= extents.left && point.x < extents.right && point.y >= extents.top &&
                   point.y < extents.bottom;
        }
    }
    return false;
}

AnchorInfo const * BookCollection::GetAnchorInfo(String const & uid, Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<BookController const> const book = GetBookFromDocument(document);
    return book ? book->GetAnchorInfo(uid) : nullptr;
}

bool BookCollection::IsAnchorAbove(String const & uid, Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<BookController const> const book = GetBookFromDocument(document);
    if (!book) {
        return false;
    }
    return book->IndexFromChapter(book->GetChapterContainingAnchor(uid)) <
           book->IndexFromChapter(book->GetChapterFromDocumentController(document));
}

}
