#pragma once

#include "commands/BookCommand.h"
#include "framework/document/DocumentSaveResult.h"

namespace Book
{

/// Writes the book to another path, where it is from then on, with readers let in meanwhile.
class SaveBookAsCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SaveBookAsCommand);

public:
    /// `closeOnSuccess` is handed on to `BookSavedNotification`.
    SaveBookAsCommand(String const & path, bool closeOnSuccess);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] ProgressType GetProgressType() override { return ShowProgress; }

protected:
    SaveBookAsCommand();

private:
    String m_Path;
    DocumentSaveResult m_Result;
    bool m_CloseOnSuccess = false;
};

}
