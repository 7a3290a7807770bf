#include "core/BookController.h"
#include "framework/commands/SaveDocumentCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/RequestPdfPasswordsNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/FileSystem.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Semaphore.h"
#include "framework/kernel/Trace.h"

#include <optional>
#include <utility>

namespace Book
{

namespace
{

/// What a load's result code says of the chapter.
void SetStatusFromLoad(Kernel::Counted<BookChapter> const & chapter, int result)
{
    if (!chapter) {
        return;
    }
    if (result == 0) {
        chapter->SetStatus(BookChapter::Status::Ok);
    } else if (result == 1 || (result >= 11 && result <= 45)) {
        chapter->SetStatus(BookChapter::Status::NotFound);
    } else if (result >= 2 && result <= 10) {
        Kernel::Trace("*** Locked ***");
        chapter->SetStatus(BookChapter::Status::Locked);
    }
}

/// Takes the source's password, if it is among those known, to its node and the record.
void UnlockNode(EmbeddedDocumentNode & node, Kernel::Counted<Kernel::DataSource const> const & source,
                RequestPdfPasswordsNotification::Passwords const & passwords,
                Kernel::Counted<BookChapter> const & chapter)
{
    auto const found = passwords.find(source);
    if (found == passwords.end()) {
        return;
    }
    node.SetPassword(found->second);
    if (chapter) {
        chapter->SetPassword(node.GetGUID(), node.GetPassword());
    }
}

}

void BookController::WaitForClose(Kernel::Counted<BookChapter const> const & chapter) const
{
    Kernel::ScopedLock const gate(chapter->GetCloseGate());
    Kernel::Semaphore closed(0);
    if (chapter->IsInClose([&closed] { closed.Signal(); })) {
        closed.Wait(0);
    }
}

Kernel::Counted<DocumentController> BookController::LoadChapterDocument(Kernel::Counted<BookChapter const> chapter,
                                                                        bool reconcile, bool allowRestricted)
{
    if (!chapter || (chapter->IsRestricted() && !allowRestricted)) {
        return nullptr;
    }
    String const path = chapter->GetPath();
    Kernel::Trace(Kernel::Format("LoadChapter:%1\n", path));
    // A document that is closing must be gone before its file is opened again.
    WaitForClose(chapter);

    if (Kernel::Counted<DocumentController> const moved = UseMovedDocument(chapter, path)) {
        return moved;
    }
    // The claim comes before any look at who has the document: it keeps an open one open until it is registered here.
    VantraController & application = VantraController::GetInstance();
    auto document = Kernel::MakeCounted<DocumentController>();
    bool isLoader = false;
    {
        // Whoever loads the file may be asking the user for a password: other books and readers go on meanwhile.
        std::optional<DomainWriterUnlockSession> unlocked;
        isLoader = application.RegisterLoadingController(
            path, document, [&] { unlocked.emplace(Kernel::Counted<DomainController>(this)); });
    }
    if (isLoader) {
        return OpenChapterDocument(chapter, document, reconcile);
    }
    if (!document) {
        return nullptr;
    }
    {
        // One step with the release that takes a document of the user's out of the table again.
        Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
        if (GetDocumentControllerForChapter(chapter, false) == document) {
            application.RegisterBackgroundController(document);
            return document;
        }
    }
    if (application.GetRegisteredDocumentControllerFromPath(path) == document) {
        return AdoptForegroundDocument(chapter, document, reconcile);
    }
    return UseDocumentLoadedElsewhere(chapter, document);
}

Kernel::Counted<DocumentController>
BookController::UseMovedDocument(Kernel::Counted<BookChapter const> const & chapter, String const & path) const
{
    VantraController & application = VantraController::GetInstance();
    Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
    Kernel::Counted<DocumentController> document = GetDocumentControllerForChapter(chapter, false);
    // In the user's hands and used, it stays open until it is counted here.
    if (!document || document->GetPath() == path || !application.IsActiveDocumentController(document) ||
        application.IsPurelyForegroundController(document)) {
        return nullptr;
    }
    application.RegisterBackgroundController(document);
    return document;
}

Kernel::Counted<DocumentController>
BookController::AdoptForegroundDocument(Kernel::Counted<BookChapter const> const & chapter,
                                        Kernel::Counted<DocumentController> document, bool reconcile)
{
    StoreAndUse(chapter, document, true);
    // Not under the lock of the table: bringing the index in step waits for commands of this and other documents.
    if (reconcile) {
        ReconcileIndex(document);
    }
    if (auto const mutableChapter = GetMutableChapter(chapter)) {
        mutableChapter->SetStatus(BookChapter::Status::OpenForEdit);
    }
    document->SetCanShowProgress(false);
    return document;
}

Kernel::Counted<DocumentController>
BookController::UseDocumentLoadedElsewhere(Kernel::Counted<BookChapter const> const & chapter,
                                           Kernel::Counted<DocumentController> document)
{
    StoreAndUse(chapter, document, false);
    if (auto const mutableChapter = GetMutableChapter(chapter)) {
        mutableChapter->SetStatus(BookChapter::Status::OpenForEdit);
    }
    document->SetCanShowProgress(false);
    return document;
}

Kernel::Counted<DocumentController>
BookController::OpenChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                                    Kernel::Counted<DocumentController> document, bool reconcile)
{
    VantraController & application = VantraController::GetInstance();
    Kernel::Counted<BookChapter> const mutableChapter = GetMutableChapter(chapter);
    String const path = chapter->GetPath();
    auto const failure = Kernel::MakeCounted<OpenDocumentFailedNotification>(path, false);
    document->SetWantBackgroundTasks(false);
    document->SetCanShowProgress(false);
    application.IncrementLoadingItems();
    if (!document->LoadDocument(path, false, false, LoadWhole, nullptr, *failure, false)) {
        application.DecrementLoadingItems();
        application.UnregisterLoadingController(path, nullptr);
        document->StopOfflining();
        SetStatusFromLoad(mutableChapter, failure->GetResult());
        return nullptr;
    }
    AskForPasswords(mutableChapter, document);
    SetStatusFromLoad(mutableChapter, failure->GetResult());
    if (mutableChapter) {
        Kernel::TimeStamp time;
        bool const isOutOfDate =
            Kernel::FileSystem::GetModifiedTime(path, time) && time != mutableChapter->GetTimeStamp();
        mutableChapter->SetStatus(isOutOfDate ? BookChapter::Status::OutOfDate : BookChapter::Status::Ok);
    }
    application.DecrementLoadingItems();
    application.UnregisterLoadingController(path, document);
    application.RegisterBackgroundController(document);
    application.AddDocumentController(document);
    document->SetWantNotifications(false);
    if (reconcile) {
        ReconcileIndex(document);
        if (mutableChapter) {
            ReconcileAnchors(mutableChapter, document);
        }
    }
    Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
    StoreChapterDocument(chapter, document, false);
    return document;
}

void BookController::AskForPasswords(Kernel::Counted<BookChapter> const & chapter,
                                     Kernel::Counted<DocumentController> const & document) const
{
    RequestPdfPasswordsNotification::Passwords const known;
    RequestPdfPasswordsNotification::Sources unknown;
    auto const images = document->GetProtectedImages();
    for (Kernel::JailCounted<EmbeddedDocumentNode> const & image : images) {
        auto const source = image->GetDataSource();
        if (known.contains(source)) {
            UnlockNode(*image, source, known, chapter);
        } else {
            unknown.insert(source);
        }
    }
    if (unknown.empty()) {
        return;
    }
    Kernel::Semaphore answered(0);
    Kernel::Counted<DomainController> const self(const_cast<BookController *>(this));
    auto question = Kernel::MakeCounted<RequestPdfPasswordsNotification>(
        unknown, document, [&](RequestPdfPasswordsNotification::Passwords const & passwords) {
            for (Kernel::JailCounted<EmbeddedDocumentNode> const & image : images) {
                UnlockNode(*image, image->GetDataSource(), passwords, chapter);
            }
            answered.Signal();
        });
    question->EndWith(self);
    VantraController::GetInstance().Broadcast(std::exchange(question, nullptr));
    // The user may take any time, and whoever asks the user may have to read the book.
    DomainWriterUnlockSession const unlocked(self);
    answered.Wait(0);
}

void BookController::StoreAndUse(Kernel::Counted<BookChapter const> const & chapter,
                                 Kernel::Counted<DocumentController> const & document, bool adopted) const
{
    // One step: a release that comes between would take the document out of the table, and its use could not be ended.
    Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
    StoreChapterDocument(chapter, document, adopted);
    VantraController::GetInstance().RegisterBackgroundController(document);
}

void BookController::StoreChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                                          Kernel::Counted<DocumentController> document, bool adopted) const
{
    ChapterDocuments documents = *m_ChapterDocuments.Get();
    // What another book was the last to use, and closed, would otherwise stay in memory here.
    std::erase_if(documents, [](auto const & entry) { return entry.second->IsCommandEnqueueDisabled(); });
    documents.insert_or_assign(chapter, std::move(document));
    m_ChapterDocuments.Set(Snapshot(std::move(documents)));
    if (adopted) {
        m_AdoptedChapters.insert_or_assign(chapter, true);
    }
}

bool BookController::ReleaseChapterDocument(Kernel::Counted<BookChapter const> chapter, bool updateTimeStamp) const
{
    if (!chapter) {
        return false;
    }
    Kernel::Trace(Kernel::Format("Release Chapter:%1\n", chapter->GetPath()));
    Kernel::Counted<DocumentController> const document = GetDocumentControllerForChapter(chapter, false);
    if (!document) {
        return false;
    }
    VantraController & application = VantraController::GetInstance();
    bool keepUnsaved = false;
    if (application.UnregisterBackgroundController(document, keepUnsaved)) {
        if (document->IsDirty() && !keepUnsaved) {
            auto const save = Kernel::MakeCounted<SaveDocumentCommand>(false, false);
            save->m_ShowProgress = false;
            save->m_KeepOnFailure = true;
            application.EnqueueCommandAndWait(save, document, false);
        }
        Kernel::Counted<BookChapter> const mutableChapter = GetMutableChapter(chapter);
        if (updateTimeStamp && mutableChapter) {
            mutableChapter->UpdateTimeStamp();
            mutableChapter->SetStatus(BookChapter::Status::Ok);
        }
        CloseChapterDocument(chapter, document);
    } else {
        Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
        if (application.IsPurelyForegroundController(document) && m_AdoptedChapters.erase(chapter) > 0) {
            ForgetChapterDocument(chapter);
            document->SetCanShowProgress(true);
        }
    }
    return true;
}

void BookController::ForgetChapterDocument(Kernel::Counted<BookChapter const> const & chapter) const
{
    ChapterDocuments documents = *m_ChapterDocuments.Get();
    documents.erase(chapter);
    m_ChapterDocuments.Set(Snapshot(std::move(documents)));
}

void BookController::CloseChapterDocument(Kernel::Counted<BookChapter const> const & chapter,
                                          Kernel::Counted<DocumentController> const & document) const
{
    // One step for whoever looks: the document is out of the table, and the chapter closes.
    Kernel::ScopedLock const lock(m_ChapterDocumentsLock);
    ForgetChapterDocument(chapter);
    chapter->SetInClose(true);
    auto const close = Kernel::MakeCounted<CloseDocumentCommand>(document, nullptr, false, false);
    close->SetCompletionCallback([document, chapter] {
        document->ShutDownArchive();
        chapter->SetInClose(false);
    });
    VantraController::GetInstance().EnqueueCommand(close);
}

}
