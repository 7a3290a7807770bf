#pragma once

#include "commands/BookCommand.h"

namespace App
{

/// Tells the book where a missing chapter's file has gone, or asks for it as opening the book does.
class LocateChaptersCommand : public Book::BookCommand
{
public:
    /// The user is asked for the first file that is gone, and so on.
    LocateChaptersCommand() = default;
    /// The file that was at `oldPath` is at `newPath` now. Other missing chapters that the same move explains are found
    /// as well.
    LocateChaptersCommand(String oldPath, String newPath) : m_OldPath(std::move(oldPath)), m_NewPath(std::move(newPath))
    {
    }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;

private:
    String m_OldPath;
    String m_NewPath;
};

}
