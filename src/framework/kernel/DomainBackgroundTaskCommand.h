#pragma once

#include "framework/kernel/Counted.h"

class DomainController;

/// Second base of a command that a `BackgroundTask` generated.
class DomainBackgroundTaskCommand
{
public:
    virtual ~DomainBackgroundTaskCommand() = default;

    /// Skipped, when its turn comes, if other commands wait behind it; its task stays dirty and tries again.
    [[nodiscard]] virtual bool CanIgnoreIfQueueOccupied() const { return false; }
    /// It polls `IsReaderWaiting` of its domain and ends early for a reader.
    [[nodiscard]] virtual bool ShouldAbortForReader() const { return false; }
    virtual void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller);

protected:
    /// The domain that took it off its queue; null before.
    [[nodiscard]] Kernel::NonCounted<DomainController> GetTaskDomainController() const { return m_Controller; }

private:
    Kernel::NonCounted<DomainController> m_Controller;
};
