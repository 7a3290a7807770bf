#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Makes a chapter the one that the others take their styles from.
class SetKeyChapterCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SetKeyChapterCommand);

public:
    explicit SetKeyChapterCommand(Kernel::Counted<BookChapter const> chapter);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    SetKeyChapterCommand();

private:
    Kernel::Counted<BookChapter const> m_Chapter;
    Kernel::Counted<BookChapter const> m_OldKey;
};

}
