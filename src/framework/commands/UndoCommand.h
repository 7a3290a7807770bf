#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Takes back the document's last step. A conversion for output that is in force counts as the last step: it lies on
/// top of the document, whatever was edited since, and only it is taken off then. With nothing to undo it does nothing.
class UndoCommand : public PassingDocumentCommand
{
public:
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<DomainCommand> m_Undone;
};

/// Does again what was undone last.
class RedoCommand : public PassingDocumentCommand
{
public:
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    Kernel::Counted<DomainCommand> m_Redone;
};
