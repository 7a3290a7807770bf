#include "documents/ChapterMarshall.h"

#include "framework/commands/ComposeTextCommand.h"
#include "framework/commands/ConvertFormatOrProfileCommand.h"
#include "framework/commands/SetMetadataTimestampCommand.h"
#include "framework/commands/UndoCommand.h"
#include "framework/commands/UpdateRunningHeadersCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/VantraController.h"

namespace Book
{

ChapterMarshall::ChapterMarshall(Kernel::Counted<BookController> book) : m_Book(std::move(book)) {}

ChapterMarshall::~ChapterMarshall()
{
    Release();
}

Kernel::Counted<DocumentController const> ChapterMarshall::GetChapter(Kernel::Counted<BookChapter const> chapter,
                                                                      bool prepare)
{
    for (MarshalledChapter const & entry : m_Entries) {
        if (entry.m_Chapter == chapter) {
            return entry.m_Document;
        }
    }
    if (m_Entries.size() == Capacity) {
        MarshalledChapter oldest = std::move(m_Entries.front());
        m_Entries.pop_front();
        ReleaseEntry(oldest);
    }
    Kernel::Counted<DocumentController const> const document = m_Book->LoadChapterDocument(chapter, true, false);
    if (!document) {
        return nullptr;
    }
    bool const converted = prepare && Prepare(document);
    m_Entries.push_back({std::move(chapter), document, converted});
    return document;
}

bool ChapterMarshall::Prepare(Kernel::Counted<DocumentController const> const & document) const
{
    VantraController & application = VantraController::GetInstance();
    application.EnqueueCommand(
        Kernel::MakeCounted<SetMetadataTimestampCommand>(SetMetadataTimestampCommand::Action::Output, String()),
        document, false);
    application.EnqueueCommandAndWait(Kernel::MakeCounted<ComposeTextCommand>(false, nullptr), document, false);
    application.EnqueueCommandAndWait(Kernel::MakeCounted<UpdateRunningHeadersCommand>(), document, false);
    // One output has one colour format. Documents of that format keep their own profiles.
    Kernel::Counted<BookChapter const> const key = m_Book->GetKeyChapter(true);
    if (!key || key->GetColourFormat() == document->GetFormat()) {
        return false;
    }
    application.EnqueueCommandAndWait(
        Kernel::MakeCounted<ConvertFormatOrProfileCommand>(key->GetColourFormat(), key->GetProfiles()), document,
        false);
    return true;
}

void ChapterMarshall::Release()
{
    for (MarshalledChapter & entry : m_Entries) {
        ReleaseEntry(entry);
    }
    m_Entries.clear();
}

void ChapterMarshall::ReleaseEntry(MarshalledChapter & entry) const
{
    if (entry.m_Converted) {
        VantraController::GetInstance().EnqueueCommand(Kernel::MakeCounted<UndoCommand>(), entry.m_Document, false);
    }
    entry.m_Document = nullptr;
    m_Book->ReleaseChapterDocument(entry.m_Chapter, false);
}

}
