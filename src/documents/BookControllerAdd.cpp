#include "core/BookController.h"
#include "core/BookNotification.h"
#include "framework/commands/UpgradeDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/Path.h"

namespace Book
{

void BookController::AddChapters(std::deque<String> paths, Kernel::Counted<BookChapter const> before)
{
    m_AddChapterIndex = IndexFromChapter(std::move(before));
    m_PendingChapterPaths = std::move(paths);
    DoAddChapters();
}

void BookController::DoAddChapters()
{
    while (!m_PendingChapterPaths.empty()) {
        String const path = m_PendingChapterPaths.front();
        m_PendingChapterPaths.pop_front();
        if (DocumentController::CheckForOldArchiveVersion(path, nullptr)) {
            AskAboutOldVersion(path);
            return;
        }
        // Null for a file that was in the book already; whoever reads the list passes it over.
        m_AddedChapters.push_back(AddChapter(path, m_AddChapterIndex));
        if (m_AddChapterIndex != -1) {
            ++m_AddChapterIndex;
        }
    }
    if (m_AddedChapters.empty()) {
        return;
    }
    VantraController & application = VantraController::GetInstance();
    Kernel::Counted<BookController const> const book(this);
    application.Broadcast(Kernel::MakeCounted<BookChangedNotification>(book));
    application.Broadcast(Kernel::MakeCounted<BookStructureChangedNotification>(book, m_AddedChapters.front()));
    m_AddedChapters.clear();
}

void BookController::AskAboutOldVersion(String const & path)
{
    auto const title = Kernel::LocalisedString("Old document version", "Add old chapter");
    auto const question = Kernel::LocalisedString(
        "The document %1 is from an older version of Korvane. Adding it to a book will result in the file being "
        "modified and no longer usable in the previous version.\nAre you sure you wish to add it?",
        "Add old chapter");
    auto const message =
        Kernel::LocalisedString::CreateFakeFromString(Kernel::Format(question, Kernel::Path::GetFileName(path)));
    auto const choices = static_cast<DocumentPromptChoice>(PromptCancel | PromptYes | PromptNo);
    Kernel::Counted<BookController> const book(this);
    VantraController::GetInstance().Broadcast(Kernel::MakeCounted<DocumentPromptNotification>(
        title, message, choices, PromptIconQuestion, std::vector<String>(),
        [book, path](DocumentPromptChoice choice) {
            if (choice == PromptCancel) {
                book->CancelAddChapters();
                return;
            }
            if (choice == PromptYes) {
                // At the end, wherever the add inserts: by now the place may mean something else.
                Kernel::Counted<BookChapter> const added = book->AddChapter(path, -1);
                book->m_AddedChapters.push_back(added);
                if (added) {
                    book->UpgradeChapter(added);
                }
            }
            book->DoAddChapters();
        },
        Kernel::Counted<DomainController const>(book)));
}

void BookController::UpgradeChapter(Kernel::Counted<BookChapter const> const & chapter)
{
    Kernel::Counted<DocumentController const> const document = LoadChapterDocument(chapter, false, false);
    if (document) {
        VantraController::GetInstance().EnqueueCommandAndWait(Kernel::MakeCounted<UpgradeDocumentCommand>(), document,
                                                              false);
        ReleaseChapterDocument(chapter, true);
    }
}

void BookController::CancelAddChapters()
{
    m_PendingChapterPaths.clear();
    RemoveChapters(ConstChapterList(m_AddedChapters.begin(), m_AddedChapters.end()));
    m_AddedChapters.clear();
}

}
