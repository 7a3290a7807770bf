#pragma once

#include "core/BookController.h"
#include "framework/kernel/VantraCommand.h"

namespace Book
{

/// Makes an empty book and registers it. Over as soon as it has been handed to `VantraController`.
class NewBookCommand final : public ImmediateVantraCommand
{
public:
    NewBookCommand() = default;

    /// The new book; null before the command has run.
    [[nodiscard]] Kernel::Counted<BookController> const & GetBookController() const { return m_Book; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<BookController> m_Book;
};

}
