#pragma once

#include "framework/document/DocumentCommand.h"
#include "framework/kernel/ClassProperties.h"

namespace Book
{

/// Makes one document hold still against the user's edits, or lets it go. Runs on the document's own queue, is no step
/// that the user sees, and never enters the document's history.
class BookLockCommand final : public DocumentCommand
{
public:
    explicit BookLockCommand(bool engage);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {}; }
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }

private:
    bool const m_Engage;
};

}
