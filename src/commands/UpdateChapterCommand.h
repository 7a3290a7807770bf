#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Opens a chapter to bring its record up to date.
class UpdateChapterCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(UpdateChapterCommand);

public:
    explicit UpdateChapterCommand(Kernel::Counted<BookChapter const> chapter);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    UpdateChapterCommand();

private:
    Kernel::Counted<BookChapter const> m_Chapter;
};

}
