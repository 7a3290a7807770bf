// The book's cache of its chapters' anchors: filled while a chapter is open, asked while it is closed.

#include "core/BookChapter.h"
#include "core/BookController.h"
#include "framework/commands/SetPDFBookmarkManagerCommand.h"
#include "framework/commands/StoryCommands.h"
#include "framework/commands/ComposeTextCommand.h"
#include "framework/document/UpdateCrossReferencesCommandHelper.h"
#include "framework/document/AnchorInfo.h"
#include "framework/document/Anchors.h"
#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Uuid.h"
#include "framework/story/AnchorData.h"

#include <algorithm>

namespace Book
{

namespace
{

Kernel::Counted<Anchors> FindAnchors(Kernel::Counted<DocumentController const> const & document)
{
    DocumentControllerSession const session(document);
    AnchorVisitor visitor(false);
    visitor.Visit(document->GetDocument());
    return visitor.GetAnchors();
}

/// What a book's bookmarks begin with: those of the first chapter that is looked at.
Kernel::Counted<PDFBookmarkManager const> BookmarksFrom(Kernel::Counted<DocumentController const> const & document)
{
    Kernel::Counted<PDFBookmarkManager const> const own = document->GetPDFBookmarkManager();
    return own ? own->Clone() : Kernel::MakeCounted<PDFBookmarkManager>();
}

AnchorInfo const * FindInfo(std::vector<AnchorInfo> const & anchors, String const & uid)
{
    auto const found =
        std::find_if(anchors.begin(), anchors.end(), [&](AnchorInfo const & info) { return info.m_Uid == uid; });
    return found == anchors.end() ? nullptr : &*found;
}

AnchorInfo InfoOf(Kernel::Counted<AnchorInstance const> const & anchor, BookChapter const & chapter, int chapterIndex,
                  Kernel::Counted<DocumentController const> const & document)
{
    AnchorInfo info;
    info.m_Uid = anchor->GetAnchor()->GetUid();
    info.m_Name = anchor->GetName();
    info.m_IsPDFBookmark = anchor->IsPDFBookmark();
    info.m_IsTOCEntry = anchor->GetAnchor()->IsTOCEntry();
    info.m_ChapterName = chapter.GetName();
    info.m_ChapterIndex = chapterIndex;
    if (Kernel::JailCounted<SpreadNode> const spread = anchor->GetSpreadAndTargetPoint(info.m_TargetPoint)) {
        info.m_SpreadIndex = spread->GetNodeIndex();
    }
    UpdateCrossReferencesCommandHelper::FillAnchorInfo(info, anchor, document);
    return info;
}

}

void BookController::UpdateChapterAnchors(Kernel::Counted<BookChapter> chapter,
                                          Kernel::Counted<DocumentController const> document,
                                          Kernel::Counted<Anchors> anchors)
{
    if (!anchors) {
        anchors = FindAnchors(document);
    }
    int const index = IndexFromChapter(chapter);
    bool const isLaidOut = !document->IsTextDirty() && document->GetWantBackgroundTasks();
    if (anchors->size() == 0 || isLaidOut) {
        UpdateChapterAnchors(chapter, document, anchors, index);
        return;
    }
    // The target points can't be trusted until the text is laid out.
    if (!document->IsAbleToRunCommands()) {
        chapter->SetAnchorsDirty();
        return;
    }
    Kernel::Counted<DocumentCommand> const compose = Kernel::MakeCounted<ComposeTextCommand>(false, nullptr);
    compose->SetCompletionCallback(
        [book = Kernel::Counted<BookController>(this), chapter, document, anchors, index] {
            book->UpdateChapterAnchors(chapter, document, anchors, index);
        });
    VantraController::GetInstance().EnqueueCommand(compose, document, false);
}

void BookController::UpdateChapterAnchors(Kernel::Counted<BookChapter> chapter,
                                          Kernel::Counted<DocumentController const> document,
                                          Kernel::Counted<Anchors> anchors, int chapterIndex)
{
    DocumentControllerSession const session(document);
    std::vector<AnchorInfo> infos;
    infos.reserve(static_cast<std::size_t>(anchors->size()));
    for (Kernel::Counted<AnchorInstance const> const & anchor : *anchors) {
        infos.push_back(InfoOf(anchor, *chapter, chapterIndex, document));
    }
    chapter->SetAnchors(infos);
}

void BookController::UpdateAnchors(Kernel::Counted<BookChapter const> chapter,
                                   Kernel::Counted<DocumentController const> document)
{
    if (!m_PDFBookmarks.Get()) {
        m_PDFBookmarks.Set(BookmarksFrom(document));
    }
    if (Kernel::Counted<BookChapter> const mutableChapter = GetMutableChapter(chapter)) {
        UpdateChapterAnchors(mutableChapter, document, nullptr);
    }
    MarkChanged();
}

void BookController::UpdateAnchorsForForegroundChapters()
{
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & chapter : chapters) {
        if (!chapter) {
            continue;
        }
        if (Kernel::Counted<DocumentController> const document =
                VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter->GetPath())) {
            UpdateChapterAnchors(chapter, document, nullptr);
        }
    }
}

void BookController::EnsureChapterAnchors(Kernel::Counted<BookChapter const> chapter) const
{
    if (!chapter->AreAnchorsDirty()) {
        return;
    }
    // A question fills the cache that it reads: the one place where asking opens a document.
    auto const self = Kernel::Counted<BookController>(const_cast<BookController *>(this));
    if (Kernel::Counted<DocumentController> document = self->LoadChapterDocument(chapter, true, false)) {
        if (Kernel::Counted<BookChapter> const mutableChapter = self->GetMutableChapter(chapter)) {
            self->UpdateChapterAnchors(mutableChapter, document, nullptr);
        }
        document = nullptr;
        ReleaseChapterDocument(chapter, false);
    }
}

AnchorInfo const * BookController::GetAnchorInfo(String const & uid) const
{
    // What the answer points into lives on to the end of the turn; on a thread without one, until it asks again.
    static thread_local Snapshot<std::vector<AnchorInfo>> answered;
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & chapter : chapters) {
        if (!chapter) {
            continue;
        }
        EnsureChapterAnchors(chapter);
        Snapshot<std::vector<AnchorInfo>> const anchors = chapter->GetAnchors();
        if (AnchorInfo const * const info = FindInfo(*anchors, uid)) {
            anchors.KeepForTurn();
            answered = anchors;
            return info;
        }
    }
    return nullptr;
}

Kernel::Counted<BookChapter const> BookController::GetChapterContainingAnchor(String const & uid) const
{
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & chapter : chapters) {
        if (!chapter) {
            continue;
        }
        EnsureChapterAnchors(chapter);
        if (FindInfo(*chapter->GetAnchors(), uid)) {
            return chapter;
        }
    }
    return nullptr;
}

void BookController::AddBlindAnchors(Kernel::Counted<Anchors> anchors, Kernel::Counted<BookChapter const> chapter,
                                     Kernel::Counted<PDFBookmarkManager const> manager) const
{
    int index = -1;
    Snapshot<ChapterList> const chapters = Chapters();
    for (Kernel::Counted<BookChapter> const & other : chapters) {
        ++index;
        if (!other || other == chapter) {
            continue;
        }
        EnsureChapterAnchors(other);
        Snapshot<std::vector<AnchorInfo>> const known = other->GetAnchors();
        for (AnchorInfo const & info : known) {
            Kernel::Counted<Story::AnchorData> data;
            if (manager) {
                data = manager->GetDataFromUid(info.m_Uid);
            }
            if (!data) {
                data = Kernel::MakeCounted<Story::AnchorData>(info.m_Name, info.m_IsPDFBookmark, info.m_IsTOCEntry,
                                                              info.m_Uid);
            }
            anchors->Add(data, index);
        }
    }
}

void BookController::ReconcileAnchors(Kernel::Counted<BookChapter> chapter,
                                      Kernel::Counted<DocumentController const> document)
{
    SetInReconcileAnchors(true);
    Kernel::Counted<Anchors> const anchors = FindAnchors(document);
    for (Kernel::Counted<AnchorInstance const> const & anchor : *anchors) {
        if (anchor->GetAnchor()->GetUid().Empty()) {
            VantraController::GetInstance().EnqueueCommandAndWait(
                Kernel::MakeCounted<Commands::SetAnchorDataGUIDCommand>(anchor->GetAnchor(), Kernel::Uuid().ToString()),
                document, false);
        }
    }
    if (chapter) {
        UpdateChapterAnchors(chapter, document, anchors);
    }
    if (!m_PDFBookmarks.Get()) {
        m_PDFBookmarks.Set(BookmarksFrom(document));
    }
    if (m_PDFBookmarks.Get()->IsLogicallyDifferent(document->GetPDFBookmarkManager())) {
        Kernel::Counted<PDFBookmarkManager> const clone = m_PDFBookmarks.Get()->Clone();
        clone->Reconcile(anchors);
        VantraController::GetInstance().EnqueueCommandAndWait(
            Kernel::MakeCounted<SetPDFBookmarkManagerCommand>(clone), document, false);
    }
    SetInReconcileAnchors(false);
}

}
