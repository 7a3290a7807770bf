#pragma once

#include "commands/BookCommand.h"

namespace Book
{

/// Adds document files to the book. It may end before they are all in: a file of an older version waits for the user's
/// answer, and `BookController` tells of the additions when they are done.
class AddChapterCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(AddChapterCommand);

public:
    /// At the end of the book.
    explicit AddChapterCommand(String const & path);
    /// In front of `before`, or at the end if that is null or not in the book.
    AddChapterCommand(std::vector<String> const & paths, Kernel::Counted<BookChapter const> before);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    AddChapterCommand();

private:
    std::vector<String> m_Paths;
    Kernel::Counted<BookChapter const> m_Before;
};

}
