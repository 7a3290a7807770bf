#include "commands/ChapterOpenCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(ChapterOpenCommand, "CopC");

ChapterOpenCommand::ChapterOpenCommand() = default;

ChapterOpenCommand::ChapterOpenCommand(Kernel::Counted<DocumentController const> document)
    : m_Document(std::move(document))
{
}

Kernel::LocalisedString ChapterOpenCommand::GetDescription() const
{
    return Kernel::LocalisedString("Chapter Open", "Book Command");
}

void ChapterOpenCommand::Do()
{
    GetBookController()->OnDocumentOpen(m_Document);
}

void ChapterOpenCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<ChapterChangedNotification>(notifications, GetBookController()->GetChapterFromPath(m_Document->GetPath()));
}

}
