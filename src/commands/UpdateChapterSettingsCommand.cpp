#include "commands/UpdateChapterSettingsCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(UpdateChapterSettingsCommand, "UCSC");

UpdateChapterSettingsCommand::UpdateChapterSettingsCommand() = default;

UpdateChapterSettingsCommand::UpdateChapterSettingsCommand(Kernel::Counted<BookChapter const> chapter,
                                                           bool continueFromPrevious, int startPage)
    : m_Chapter(std::move(chapter)),
      m_HasPageNumberOptions(true),
      m_ContinueFromPrevious(continueFromPrevious),
      m_StartPage(startPage)
{
}

Kernel::LocalisedString UpdateChapterSettingsCommand::GetDescription() const
{
    return Kernel::LocalisedString("Update Chapter Settings", "Book Commands");
}

void UpdateChapterSettingsCommand::Do()
{
    auto const chapter = GetBookController()->GetMutableChapter(m_Chapter);
    if (chapter && m_HasPageNumberOptions) {
        chapter->SetStartFromPage(m_ContinueFromPrevious ? 0 : m_StartPage);
    }
}

void UpdateChapterSettingsCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<ChapterChangedNotification>(notifications, m_Chapter);
}

}
