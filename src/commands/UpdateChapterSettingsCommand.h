#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Sets where a chapter's page numbers start. Does not make the book unsaved.
class UpdateChapterSettingsCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(UpdateChapterSettingsCommand);

public:
    /// `startPage` counts only without `continueFromPrevious`.
    UpdateChapterSettingsCommand(Kernel::Counted<BookChapter const> chapter, bool continueFromPrevious, int startPage);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    UpdateChapterSettingsCommand();

private:
    Kernel::Counted<BookChapter const> m_Chapter;
    bool m_HasPageNumberOptions = false;
    bool m_ContinueFromPrevious = false;
    int m_StartPage = 0;
};

}
