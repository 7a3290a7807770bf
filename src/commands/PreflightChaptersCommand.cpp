#include "commands/PreflightChaptersCommand.h"

#include "core/BookNotification.h"

namespace Book
{

KORVANE_DEFINE_BOOK_COMMAND(PreflightChaptersCommand, "PrfC");

std::atomic<bool> PreflightChaptersCommand::ms_InPreflight{false};

PreflightChaptersCommand::PreflightChaptersCommand() = default;

PreflightChaptersCommand::PreflightChaptersCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, bool run)
    : m_Chapters(std::move(chapters)),
      m_RunPreflight(run)
{
}

Kernel::LocalisedString PreflightChaptersCommand::GetDescription() const
{
    return Kernel::LocalisedString("Preflight chapters", "Book Commands");
}

void PreflightChaptersCommand::Do()
{
    Kernel::Counted<BookController> const book = GetBookController();
    // Also where a check ends in an exception: a flag left up would change what others are told for good.
    struct Flag
    {
        Flag() { ms_InPreflight = true; }
        ~Flag() { ms_InPreflight = false; }
    } const flag;
    for (std::size_t done = 0; done < m_Chapters.size(); ++done) {
        book->UpdatePreflightStatus(m_Chapters[done], nullptr, m_RunPreflight);
        book->UpdateProgress(Kernel::Counted<DomainCommand const>(this),
                             static_cast<float>(done + 1) / static_cast<float>(m_Chapters.size()));
    }
}

void PreflightChaptersCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    for (Kernel::Counted<BookChapter const> const & chapter : m_Chapters) {
        Tell<ChapterChangedNotification>(notifications, chapter);
    }
}

}
