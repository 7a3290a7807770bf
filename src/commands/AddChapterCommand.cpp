#include "commands/AddChapterCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(AddChapterCommand, "BadC");

AddChapterCommand::AddChapterCommand() = default;

AddChapterCommand::AddChapterCommand(String const & path) : m_Paths{path} {}

AddChapterCommand::AddChapterCommand(std::vector<String> const & paths, Kernel::Counted<BookChapter const> before)
    : m_Paths(paths),
      m_Before(std::move(before))
{
}

Kernel::LocalisedString AddChapterCommand::GetDescription() const
{
    return Kernel::LocalisedString("Add chapter", "Book Command");
}

void AddChapterCommand::Do()
{
    GetBookController()->AddChapters(std::deque<String>(m_Paths.begin(), m_Paths.end()), m_Before);
}

void AddChapterCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    auto const documents = GetBookController()->GetForegroundControllers(m_Paths);
    if (!documents.empty()) {
        Tell<BookChapterInclusionChangedNotification>(notifications, documents);
    }
}

}
