#pragma once

#include "core/BookController.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/kernel/VantraCommand.h"

namespace Book
{

/// Opens a book file and registers the book. Over as soon as it has been handed to `VantraController`: the caller reads
/// book and result at once. A book that cannot be opened leaves nothing behind but the result, which is posted.
class LoadBookCommand final : public ImmediateVantraCommand
{
public:
    explicit LoadBookCommand(String const & path);

    /// The book; null before the command has run and if it failed.
    [[nodiscard]] Kernel::Counted<BookController> const & GetBookController() const { return m_Book; }
    /// How it went; null before the command has run.
    [[nodiscard]] Kernel::Counted<OpenDocumentFailedNotification const> GetResult() const { return m_Result; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<BookController> m_Book;
    String m_Path;
    Kernel::Counted<OpenDocumentFailedNotification> m_Result;
};

}
