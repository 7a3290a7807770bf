#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Takes chapters out of the book. Their files stay.
class DeleteChaptersCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(DeleteChaptersCommand);

public:
    explicit DeleteChaptersCommand(std::vector<Kernel::Counted<BookChapter const>> const & chapters);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    DeleteChaptersCommand();

private:
    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    /// What follows the first unbroken run of deleted chapters: the book is renumbered from there. Null if that run
    /// reaches the end, since then no number changes.
    Kernel::Counted<BookChapter const> m_NextChapter;
};

}
