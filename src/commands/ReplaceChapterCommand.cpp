#include "commands/ReplaceChapterCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(ReplaceChapterCommand, "BrpC");

ReplaceChapterCommand::ReplaceChapterCommand() = default;

ReplaceChapterCommand::ReplaceChapterCommand(Kernel::Counted<BookChapter const> old, String const & path)
    : m_Old(std::move(old)),
      m_Path(path)
{
}

Kernel::LocalisedString ReplaceChapterCommand::GetDescription() const
{
    return Kernel::LocalisedString("Replace chapter", "Book Commands");
}

void ReplaceChapterCommand::Do()
{
    m_New = GetBookController()->ReplaceChapter(m_Old, m_Path);
}

void ReplaceChapterCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
    Tell<BookStructureChangedNotification>(notifications, m_New);
}

}
