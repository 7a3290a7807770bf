#pragma once

#include "commands/BookCommand.h"
#include "framework/document/DocumentSaveResult.h"

namespace Book
{

/// Writes the book to its file, with readers let in meanwhile.
class SaveBookCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(SaveBookCommand);

public:
    /// `closeOnSuccess` is handed on to `BookSavedNotification`: whoever hears it closes the book.
    explicit SaveBookCommand(bool closeOnSuccess);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] ProgressType GetProgressType() override { return ShowProgress; }

protected:
    SaveBookCommand();

private:
    DocumentSaveResult m_Result;
    bool m_CloseOnSuccess = false;
};

}
