#pragma once

#include "framework/kernel/BackgroundTask.h"

namespace Book
{

/// Background pass over a book's chapters: all of them, or only those that the user has open. Dirty means that somebody
/// asked for a pass; the pump then makes one command at the task's interval, whose end cleans the task.
///
/// Owned by its `BookController`, which adds two of them to its own pump.
class UpdateChaptersTask final : public BackgroundTask
{
public:
    /// The first three arguments are those of `BackgroundTask`.
    UpdateChaptersTask(int interval, bool whileQueueOccupied, bool gathersChanges, bool foregroundOnly);

    /// A new `UpdateChaptersCommand`. Built in the folder of the commands.
    Kernel::Counted<DomainCommand> GenerateCommand() override;

    [[nodiscard]] bool IsForegroundOnly() const { return m_ForegroundOnly; }

private:
    const bool m_ForegroundOnly;
};

}
