#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Fills the preflight column of the chapter list.
class PreflightChaptersCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(PreflightChaptersCommand);

public:
    /// With `run` each chapter is checked first; else the results that its document has are taken over.
    PreflightChaptersCommand(std::vector<Kernel::Counted<BookChapter const>> chapters, bool run);

    /// Such a command is at work, in any book.
    [[nodiscard]] static bool IsInPreflight() { return ms_InPreflight; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] ProgressType GetProgressType() override { return ShowProgress; }

protected:
    PreflightChaptersCommand();

private:
    static std::atomic<bool> ms_InPreflight;

    std::vector<Kernel::Counted<BookChapter const>> m_Chapters;
    bool m_RunPreflight = false;
};

}
