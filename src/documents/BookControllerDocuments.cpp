#include "core/BookController.h"
#include "framework/commands/SaveDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Path.h"

#include <algorithm>

namespace Book
{

namespace
{

/// The document that the user has open for the chapter, or null.
Kernel::Counted<DocumentController> ForegroundDocument(BookChapter const & chapter)
{
    return VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(chapter.GetPath());
}

}

Kernel::Counted<DocumentController>
BookController::GetDocumentControllerForChapter(Kernel::Counted<BookChapter const> chapter, bool preferForeground) const
{
    if (preferForeground) {
        if (auto const document = ForegroundDocument(*chapter)) {
            return document;
        }
    }
    Snapshot<ChapterDocuments> const documents = m_ChapterDocuments.Get();
    auto const found = documents->find(chapter);
    // Another book that used the same file may have been the last, and closed it.
    return found == documents->end() || found->second->IsCommandEnqueueDisabled() ? nullptr : found->second;
}

bool BookController::IsThisChapterThisDocument(Kernel::Counted<BookChapter const> chapter,
                                               Kernel::Counted<DocumentController const> document) const
{
    Kernel::Counted<DocumentController> own = GetDocumentControllerForChapter(chapter, false);
    if (!own) {
        own = ForegroundDocument(*chapter);
    }
    return own == document;
}

Kernel::Counted<BookChapter>
BookController::GetChapterFromDocumentController(Kernel::Counted<DocumentController const> document)
{
    Snapshot<ChapterDocuments> const documents = m_ChapterDocuments.Get();
    for (auto const & [chapter, held] : *documents) {
        if (held == document) {
            return GetMutableChapter(chapter);
        }
    }
    return document ? GetChapterFromPath(document->GetPath()) : nullptr;
}

Kernel::Counted<BookChapter const>
BookController::GetChapterFromDocumentController(Kernel::Counted<DocumentController const> document) const
{
    return const_cast<BookController *>(this)->GetChapterFromDocumentController(std::move(document));
}

bool BookController::IsForegroundChapter(Kernel::Counted<BookChapter const> chapter) const
{
    return static_cast<bool>(ForegroundDocument(*chapter));
}

void BookController::GetForegroundChapters(std::vector<std::pair<int, String>> & chapters) const
{
    Snapshot<ChapterList> const all = Chapters();
    for (std::size_t index = 0; index < all.size(); ++index) {
        auto const document = all[index] ? ForegroundDocument(*all[index]) : nullptr;
        if (document) {
            chapters.emplace_back(static_cast<int>(index),
                                  Kernel::Path::GetFileNameWithoutExtension(document->GetPath()));
        }
    }
}

std::vector<Kernel::Counted<DocumentController const>>
BookController::GetForegroundControllers(std::vector<String> const & paths) const
{
    std::vector<String> asked = paths;
    if (asked.empty()) {
        for (Kernel::Counted<BookChapter> const & chapter : Chapters()) {
            if (chapter) {
                asked.push_back(chapter->GetPath());
            }
        }
    }
    std::vector<Kernel::Counted<DocumentController const>> documents;
    for (String const & path : asked) {
        if (auto const document = VantraController::GetInstance().GetRegisteredDocumentControllerFromPath(path)) {
            documents.push_back(document);
        }
    }
    return documents;
}

bool BookController::CanCloseOpenChapters() const
{
    return !GetForegroundControllers({}).empty();
}

bool BookController::CanSaveOpenChapters() const
{
    auto const documents = GetForegroundControllers({});
    return std::any_of(documents.begin(), documents.end(), [](auto const & document) { return document->IsDirty(); });
}

void BookController::SaveOpenChapters() const
{
    for (Kernel::Counted<DocumentController const> const & document : GetForegroundControllers({})) {
        if (document->IsDirty()) {
            VantraController::GetInstance().EnqueueCommand(Kernel::MakeCounted<SaveDocumentCommand>(false, true),
                                                           document, false);
        }
    }
}

void BookController::OnDocumentOpen(Kernel::Counted<DocumentController const> document)
{
    Kernel::Counted<BookChapter> const chapter = GetChapterFromPath(document->GetPath());
    // Between the news of the document and this turn the chapter may have left the book.
    if (!chapter) {
        return;
    }
    chapter->SetStatus(BookChapter::Status::OpenForEdit);
    UpdateChapterStatus(chapter, document, false, false);
    ReconcileIndex(document);
    ReconcileAnchors(chapter, document);
}

}
