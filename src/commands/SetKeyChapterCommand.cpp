#include "commands/SetKeyChapterCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(SetKeyChapterCommand, "SkCC");

SetKeyChapterCommand::SetKeyChapterCommand() = default;

SetKeyChapterCommand::SetKeyChapterCommand(Kernel::Counted<BookChapter const> chapter) : m_Chapter(std::move(chapter))
{
}

Kernel::LocalisedString SetKeyChapterCommand::GetDescription() const
{
    return Kernel::LocalisedString("Set style source chapter", "Book Commands");
}

void SetKeyChapterCommand::Do()
{
    m_OldKey = GetBookController()->GetKeyChapter(true);
    GetBookController()->SetKeyChapter(m_Chapter);
}

void SetKeyChapterCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<ChapterChangedNotification>(notifications, m_Chapter);
    if (m_OldKey) {
        Tell<ChapterChangedNotification>(notifications, m_OldKey);
    }
}

}
