#pragma once

#include "commands/BookCommand.h"
#include "framework/kernel/DomainBackgroundTaskCommand.h"

namespace Book
{

/// A book command that a background task has generated. Streams cannot name it.
class BookBackgroundTaskCommand : public BookCommand, public DomainBackgroundTaskCommand
{
public:
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override;
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }
    [[nodiscard]] bool ClearsPreviewCommands() const override { return false; }
    void Save(Kernel::OutSerialiser &) const override {}
    /// False: nobody keeps such a command for later.
    bool Load(Kernel::InSerialiser const &, Kernel::FileStore &, unsigned short) override { return false; }
    /// Those of no class: what a stream was given of such a command reads back as null.
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
};

}
