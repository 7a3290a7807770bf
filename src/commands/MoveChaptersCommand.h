#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Moves chapters, in the given order and as a block, in front of another one or to the end.
class MoveChaptersCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(MoveChaptersCommand);

public:
    /// A null `before` means the end.
    MoveChaptersCommand(Kernel::Counted<BookChapter const> before,
                        std::vector<Kernel::Counted<BookChapter const>> chapters);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    MoveChaptersCommand();

private:
    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    Kernel::Counted<BookChapter const> m_Before;
    /// From here on numbers may have changed.
    Kernel::Counted<BookChapter const> m_FirstMoved;
};

}
