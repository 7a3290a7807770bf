#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Sets what happens to single pages where chapters meet. Whoever sends it knows the new values: it tells nobody.
class SetStrayHandlingCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SetStrayHandlingCommand);

public:
    /// `pad`: blank pages keep every page on its own side. `merge`: a chapter's first page may share the last spread of
    /// the chapter before.
    SetStrayHandlingCommand(bool pad, bool merge);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;

protected:
    SetStrayHandlingCommand();

private:
    bool m_PadStrays = false;
    bool m_MergeStrays = false;
};

}
