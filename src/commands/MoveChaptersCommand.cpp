#include "commands/MoveChaptersCommand.h"

#include "core/BookNotification.h"

#include <algorithm>

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(MoveChaptersCommand, "BMvC");

MoveChaptersCommand::MoveChaptersCommand() = default;

MoveChaptersCommand::MoveChaptersCommand(Kernel::Counted<BookChapter const> before,
                                         std::vector<Kernel::Counted<BookChapter const>> chapters)
    : m_Chapters(std::move(chapters)),
      m_Before(std::move(before))
{
}

Kernel::LocalisedString MoveChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Move chapter", "Book Commands");
}

void MoveChaptersCommand::Do()
{
    Kernel::Counted<BookController> const book = GetBookController();
    auto const isMoved = [this](Kernel::Counted<BookChapter const> const & chapter) {
        return std::find(m_Chapters.begin(), m_Chapters.end(), chapter) != m_Chapters.end();
    };
    BookController::ConstChapterList all;
    book->GetChapters(all);
    auto const firstMoved = std::find_if(all.begin(), all.end(), isMoved);
    bool const isTowardsFront =
        m_Before && !m_Chapters.empty() && std::find(all.begin(), firstMoved, m_Before) != firstMoved;

    book->MoveChapters(m_Before, m_Chapters);

    // Towards the front the block stands where the change starts. Else it starts where the block was taken out, and the
    // whole book is renumbered.
    m_FirstMoved = isTowardsFront ? m_Chapters.front() : book->GetChapterAtIndex(0);
}

void MoveChaptersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    Tell<BookChangedNotification>(notifications);
    Tell<BookStructureChangedNotification>(notifications, m_FirstMoved);
}

}
