#pragma once

#include "core/BookController.h"
#include "framework/kernel/VantraCommand.h"

namespace Book
{

/// Ends a book's work: its queue refuses commands and runs empty. What is unsaved was settled before. Whoever hears the
/// `BookClosedNotification` takes the book out of `BookCollection`.
class CloseBookCommand final : public VantraCommand
{
public:
    explicit CloseBookCommand(Kernel::Counted<BookController const> book);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<BookController const> m_Book;
};

}
