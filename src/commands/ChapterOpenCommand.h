#pragma once

#include "commands/BookCommand.h"
#include "framework/document/DocumentController.h"

namespace Book
{

/// The user has opened a document that is a chapter of the book.
class ChapterOpenCommand final : public BookCommand
{
    KORVANE_BOOK_COMMAND(ChapterOpenCommand);

public:
    explicit ChapterOpenCommand(Kernel::Counted<DocumentController const> document);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    ChapterOpenCommand();

private:
    Kernel::Counted<DocumentController const> m_Document;
};

}
