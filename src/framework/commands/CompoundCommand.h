#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Several commands as one: done in order, undone in reverse, one step of the history. If one fails, those before it
/// are undone and the failure goes on to the queue.
class CompoundCommand : public UndoableDocumentCommand
{
public:
    /// \param stackForUndo it is a step of the history
    /// \param skipFailures a command that fails is left out, instead of ending the whole
    /// \param notifyTogether its notifications come at the end, all together, after all commands are done
    CompoundCommand(bool stackForUndo, bool skipFailures, bool notifyTogether);
    ~CompoundCommand() override;

    /// `after` is the command behind which it is put; null: at the end.
    virtual void Add(Kernel::Counted<DocumentCommand> command, Kernel::Counted<DocumentCommand const> after);
    [[nodiscard]] std::vector<Kernel::Counted<DocumentCommand>> const & GetCommands() const { return m_Commands; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void PostDequeueWithMutableController(Kernel::NonCounted<DocumentController> document) override;
    void Do() override;
    void Undo() override;
    void Redo() override;
    void Teardown() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] bool ShouldStackForUndo() const override { return m_StackForUndo; }

private:
    std::vector<Kernel::Counted<DocumentCommand>> m_Commands;
    /// Those that were done, in order.
    std::vector<Kernel::Counted<DocumentCommand>> m_Done;
    std::vector<Kernel::Counted<Kernel::Notification>> m_Notifications;
    bool const m_StackForUndo;
    bool const m_SkipFailures;
    bool const m_NotifyTogether;
};
