#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Puts another document file in the place of a chapter.
class ReplaceChapterCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(ReplaceChapterCommand);

public:
    ReplaceChapterCommand(Kernel::Counted<BookChapter const> old, String const & path);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    ReplaceChapterCommand();

private:
    Kernel::Counted<BookChapter const> m_Old;
    Kernel::Counted<BookChapter const> m_New;
    String m_Path;
};

}
