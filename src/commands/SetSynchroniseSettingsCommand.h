#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Sets what synchronising carries from the key chapter to the others. Whoever sends it knows the new values: it tells
/// nobody. Shares its description with `SetStrayHandlingCommand`, and so its translation.
class SetSynchroniseSettingsCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SetSynchroniseSettingsCommand);

public:
    explicit SetSynchroniseSettingsCommand(BookController::SynchroniseSettings const & settings);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;

protected:
    SetSynchroniseSettingsCommand();

private:
    BookController::SynchroniseSettings m_Settings;
};

}
