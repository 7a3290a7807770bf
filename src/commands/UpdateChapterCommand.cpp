#include "commands/UpdateChapterCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(UpdateChapterCommand, "BUpC");

UpdateChapterCommand::UpdateChapterCommand() = default;

UpdateChapterCommand::UpdateChapterCommand(Kernel::Counted<BookChapter const> chapter) : m_Chapter(std::move(chapter))
{
}

Kernel::LocalisedString UpdateChapterCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update chapter", "Book Commands");
}

void UpdateChapterCommand::Do()
{
    GetBookController()->UpdateChapterStatus(m_Chapter, nullptr, false, false);
}

void UpdateChapterCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<ChapterChangedNotification>(notifications, m_Chapter);
}

}
