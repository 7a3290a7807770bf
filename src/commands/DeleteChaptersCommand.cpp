#include "commands/DeleteChaptersCommand.h"

#include "core/BookNotification.h"

#include <algorithm>

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(DeleteChaptersCommand, "BdeC");

DeleteChaptersCommand::DeleteChaptersCommand() = default;

DeleteChaptersCommand::DeleteChaptersCommand(std::vector<Kernel::Counted<BookChapter const>> const & chapters)
    : m_Chapters(chapters)
{
}

Kernel::LocalisedString DeleteChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Delete chapter", "Book Commands");
}

void DeleteChaptersCommand::Do()
{
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        auto const next = GetBookController()->GetNextChapter(chapter);
        if (std::find(m_Chapters.begin(), m_Chapters.end(), next) == m_Chapters.end()) {
            m_NextChapter = next;
            break;
        }
    }
    GetBookController()->RemoveChapters(m_Chapters);
}

void DeleteChaptersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
    if (m_NextChapter) {
        Tell<BookStructureChangedNotification>(notifications, m_NextChapter);
    }
    std::vector<String> paths;
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        if (chapter) {
            paths.push_back(chapter->GetPath());
        }
    }
    auto const documents = GetBookController()->GetForegroundControllers(paths);
    if (!documents.empty()) {
        Tell<BookChapterInclusionChangedNotification>(notifications, documents);
    }
}

}
