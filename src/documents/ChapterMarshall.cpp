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

class ChapterMarshall::MarshalledChapter final : public virtual Kernel::Countable
{
public:
    MarshalledChapter(Kernel::Counted<BookController> book, Kernel::Counted<BookChapter const> chapter,
                      Kernel::Counted<DocumentController const> document, bool converted)
        : m_Chapter(std::move(chapter)),
          m_Document(std::move(document)),
          m_Converted(converted),
          m_Book(std::move(book))
    {
    }
    ~MarshalledChapter() override
    {
        if (m_Converted) {
            VantraController::GetInstance().EnqueueCommand(Kernel::MakeCounted<UndoCommand>(), m_Document, false);
        }
        m_Document = nullptr;
        m_Book->ReleaseChapterDocument(m_Chapter, false);
    }

    Kernel::Counted<BookChapter const> const m_Chapter;
    Kernel::Counted<DocumentController const> m_Document;
    /// Brought to the key chapter's colour format here, which has to be taken back.
    bool const m_Converted;

private:
    Kernel::Counted<BookController> const m_Book;
};

ChapterMarshall::ChapterMarshall() = default;
ChapterMarshall::ChapterMarshall(ChapterMarshall const & other) = default;
ChapterMarshall & ChapterMarshall::operator=(ChapterMarshall const & other) = default;

ChapterMarshall::ChapterMarshall(Kernel::Counted<BookController> book) : m_Book(std::move(book)) {}

ChapterMarshall::~ChapterMarshall()
{
    Release();
}

Kernel::Counted<DocumentController const> ChapterMarshall::GetChapter(Kernel::Counted<BookChapter const> chapter,
                                                                      bool prepare)
{
    for (Kernel::Counted<MarshalledChapter const> const & entry : m_Entries) {
        if (entry->m_Chapter == chapter) {
            return entry->m_Document;
        }
    }
    if (m_Entries.size() == Capacity) {
        m_Entries.pop_front();
    }
    Kernel::Counted<DocumentController const> const document = m_Book->LoadChapterDocument(chapter, true, false);
    if (!document) {
        return nullptr;
    }
    bool const converted = prepare && Prepare(document);
    m_Entries.push_back(Kernel::MakeCounted<MarshalledChapter>(m_Book, std::move(chapter), document, converted));
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
    while (!m_Entries.empty()) {
        m_Entries.pop_front();
    }
}

}
