#include "commands/UpdateChaptersCommand.h"

#include "core/BookNotification.h"
#include "core/UpdateChaptersTask.h"

namespace Book
{

UpdateChaptersTask::UpdateChaptersTask(int interval, bool whileQueueOccupied, bool gathersChanges, bool foregroundOnly)
    : BackgroundTask(interval, whileQueueOccupied, gathersChanges),
      m_ForegroundOnly(foregroundOnly)
{
}

Kernel::Counted<DomainCommand> UpdateChaptersTask::GenerateCommand()
{
    return Kernel::MakeCounted<UpdateChaptersCommand>(m_ForegroundOnly);
}

UpdateChaptersCommand::UpdateChaptersCommand(bool foregroundOnly) : m_ForegroundOnly(foregroundOnly) {}

Kernel::LocalisedString UpdateChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update chapters", "Book Commands");
}

void UpdateChaptersCommand::Do()
{
    Kernel::Counted<BookController> const book = GetBookController();
    if (m_ForegroundOnly) {
        book->UpdateForegroundChapterStatus();
        book->OnUpdateForegroundChaptersComplete();
        return;
    }
    BookController::ConstChapterList chapters;
    book->GetChapters(chapters);
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        book->UpdateChapterStatus(chapter, nullptr, false, false);
    }
    book->OnUpdateChaptersComplete();
}

void UpdateChaptersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    BookController::ConstChapterList chapters;
    GetBookController()->GetChapters(chapters);
    Tell<ChapterChangedNotification>(notifications, std::move(chapters));
}

}
