#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Makes the chapters that the user has open hold still, or lets them go, in turn with the book's other commands.
class EngageBookLockCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(EngageBookLockCommand);

public:
    explicit EngageBookLockCommand(bool engage);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;

protected:
    EngageBookLockCommand();

private:
    bool m_Engage = false;
};

}
