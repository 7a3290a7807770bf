#include "content/UpdateNumbersCommand.h"

#include "content/FindNotesVisitor.h"
#include "content/SectionNumbering.h"
#include "core/BookChapter.h"
#include "core/BookController.h"
#include "core/BookNotification.h"
#include "framework/commands/CompoundCommand.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DomainCommandProgress.h"
#include "framework/kernel/SequenceProgressReporter.h"
#include "framework/story/NoteGlyphs.h"

#include <algorithm>

namespace Book
{

namespace
{

/// What numbering reads of a document, in one stretch under its reader lock.
struct Numbering
{
    explicit Numbering(Kernel::Counted<DocumentController const> const & document);

    std::vector<SectionFacts> m_Sections;
    int m_PageCount = 0;
};

Numbering::Numbering(Kernel::Counted<DocumentController const> const & document)
{
    DocumentControllerSession const session(document);
    m_PageCount = document->GetDocument()->GetPageCount();
    for (Kernel::Counted<DocumentSection const> const & section : document->GetDocument()->GetSections()) {
        m_Sections.push_back({static_cast<int>(section->GetStartPageIndex()),
                              static_cast<int>(section->GetStartNumberingAt()), section->RestartPageNumbering(),
                              section->GetIncludeOnExport()});
    }
}

}

KORVANE_DEFINE_BOOK_COMMAND(UpdateNumbersCommand, "UpNC");

UpdateNumbersCommand::UpdateNumbersCommand() = default;

UpdateNumbersCommand::UpdateNumbersCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, bool updatePages,
                                           bool updateLists, bool updateNotes)
    : m_Chapters(std::move(chapters)), m_UpdatePages(updatePages), m_UpdateLists(updateLists),
      m_UpdateNotes(updateNotes)
{
}

Kernel::LocalisedString UpdateNumbersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update numbers", "Book Command");
}

DomainCommand::ProgressType UpdateNumbersCommand::GetProgressType()
{
    return ShowProgress;
}

void UpdateNumbersCommand::Do()
{
    Kernel::Counted<BookController> const book = GetBookController();
    book->SetInNumberUpdate(true);

    auto const progress = Kernel::MakeCounted<DomainCommandProgress>(GetDescription().ToString(), book, this);
    auto const reporter =
        Kernel::MakeCounted<Kernel::SequenceProgressReporter>(static_cast<unsigned long long>(m_Chapters.size()));
    progress->SetReporter(reporter);

    int pageNumber = 1;
    bool changed = false;
    Kernel::Counted<BookChapter const> previous;
    Kernel::Counted<BookChapter const> pending;
    int const count = book->ChapterCount();
    for (int index = 0; index < count; ++index) {
        Kernel::Counted<BookChapter> const chapter = book->GetChapterAtIndex(index);
        if (!chapter || !chapter->IsValid()) {
            continue;
        }
        bool const isUpdated = std::find(m_Chapters.begin(), m_Chapters.end(), chapter) != m_Chapters.end();
        if (!isUpdated) {
            pending = chapter;
            previous = chapter;
            continue;
        }
        if (pending && (chapter->IsContinueFromPrevious() || m_UpdateLists || m_UpdateNotes)) {
            InvestigateChapter(book->GetMutableChapter(pending), pageNumber);
            pending = nullptr;
        }
        if (chapter->IsContinueFromPrevious()) {
            pageNumber = SumOfNumbers(
                pageNumber, chapter->GetPrePagePaddingCount(previous, book->IsPadStrays(), book->IsMergeStrays()));
        } else {
            pageNumber = chapter->GetStartFromPage();
        }
        changed |= UpdateChapter(chapter, pageNumber,
                                 reporter->BeginItemAtIndex(static_cast<unsigned long long>(index)));
        previous = chapter;
    }
    if (changed) {
        book->SetIsDirty(true);
    }
    book->SetInNumberUpdate(false);
}

void UpdateNumbersCommand::InvestigateChapter(Kernel::Counted<BookChapter> chapter, int & pageNumber)
{
    Kernel::Counted<BookController> const book = GetBookController();
    Kernel::Counted<DocumentController> document = book->LoadChapterDocument(chapter, true, false);
    if (!document) {
        return;
    }
    if (m_UpdatePages) {
        Numbering const numbering(document);
        FollowSections(numbering.m_Sections, numbering.m_PageCount, pageNumber);
    }
    document = nullptr;
    book->ReleaseChapterDocument(chapter, true);
}

bool UpdateNumbersCommand::UpdateChapter(Kernel::Counted<BookChapter> chapter, int & pageNumber,
                                         Kernel::Counted<Kernel::Progress> progress)
{
    Kernel::Counted<BookController> const book = GetBookController();
    Kernel::Counted<DocumentController> document = book->LoadChapterDocument(chapter, true, false);
    if (!document) {
        return false;
    }
    if (m_UpdatePages) {
        UpdateSections(*chapter, document, pageNumber);
    }
    bool const dirty = document->IsDirty();
    book->UpdateChapterStatus(chapter, document, false, false);
    book->UpdateAnchors(chapter, document);
    document = nullptr;
    book->ReleaseChapterDocument(chapter, true);
    if (progress) {
        progress->SetFraction(1);
    }
    return dirty;
}

void UpdateNumbersCommand::UpdateSections(BookChapter const & chapter,
                                          Kernel::Counted<DocumentController> const & document, int & pageNumber)
{
    bool const isFirst = GetBookController()->IndexFromChapter(Kernel::Counted<BookChapter const>(&chapter)) == 0;
    auto const compound = Kernel::MakeCounted<CompoundCommand>(true, false, true);
    Numbering const numbering(document);
    for (SectionChange const & change : RenumberSections(numbering.m_Sections, numbering.m_PageCount, isFirst,
                                                         chapter.GetStartFromPage(), pageNumber)) {
        auto const command = Kernel::MakeCounted<ModifySectionCommand>(static_cast<unsigned int>(change.startPageIndex));
        command->SetStartNumberingAt(static_cast<unsigned int>(change.number));
        compound->Add(command, nullptr);
    }
    if (!compound->GetCommands().empty()) {
        VantraController::GetInstance().EnqueueCommandAndWait(compound, document, false);
    }
}

void UpdateNumbersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Kernel::Counted<BookController const> const book = GetBookController();
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        notifications.push_back(Kernel::MakeCounted<ChapterChangedNotification>(book, chapter));
    }
    notifications.push_back(Kernel::MakeCounted<BookChangedNotification>(book));
}

void UpdateNumbersCommand::InvestigateNotes(Kernel::Counted<DocumentController const> document, int & next)
{
    bool first = false;
    DocumentControllerSession const session(document);
    FindNotesVisitor visitor;
    visitor.Visit(document->GetDocument());
    for (FindNotesVisitor::Item const & item : visitor.GetItems()) {
        Kernel::Counted<Story::NoteAtt const> const note = Story::GetNoteAtt(item.m_Position.GetGlyph());
        if (!note || note->GetNumberingMode() != Story::NoteAtt::ThroughBook ||
            note->GetKind() != Story::NoteAtt::Endnote) {
            continue;
        }
        if (!first || note->IsRestartNumbering()) {
            next = note->GetStartNumberingAt() + 1;
            first = true;
        } else {
            ++next;
        }
    }
}

void BookController::InvestigateEndnotes(Kernel::Counted<DocumentController const> document, int & next)
{
    UpdateNumbersCommand::InvestigateNotes(document, next);
}

}
