#pragma once

#include "framework/kernel/Command.h"

class DomainController;

/// A command that runs on a domain's queue, under the domain's writer lock.
///
/// The queue calls, in this order and on one thread: `PostDequeueWithMutableDomainController`; with the writer lock
/// held, `DoAndUpdateCaches` and `NotifyWithCacheUpdates`; then the notifications are posted, the lock is released and
/// the completion callback runs.
class DomainCommand : public Command
{
public:
    /// What the front end shows while the command runs.
    enum ProgressType
    {
        NoProgress = 0,
        ShowProgress = 2
    };
    /// Which way a command ran last, for its notifications.
    enum Direction
    {
        Forward = 0,
        Backward = 1,
        ForwardAgain = 2
    };

    /// The domain that took it off its queue; null before.
    [[nodiscard]] virtual Kernel::Counted<DomainController const> GetDomainController() const = 0;
    [[nodiscard]] virtual Kernel::Counted<DomainController> GetDomainController() = 0;

    /// One of these in the queue is enough: with true, the queue asks `IsAnotherAlreadyInQueue` about what is waiting.
    /// A command that says the same is dropped for this one, which answers for its callback; this one stands last, so
    /// that it sees what was enqueued in between.
    [[nodiscard]] virtual bool AvoidMultipleInQueue() const { return false; }
    /// By default: it is of the same class.
    [[nodiscard]] virtual bool IsAnotherAlreadyInQueue(Kernel::Counted<DomainCommand> const & other) const;

    /// Taken off the queue, about to run.
    virtual void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) = 0;

    /// What the queue and the history call. A family that keeps caches beside its data brings them up to date here.
    virtual void DoAndUpdateCaches() { Do(); }
    virtual void UndoAndUpdateCaches() { Undo(); }
    virtual void RedoAndUpdateCaches() { Redo(); }
    virtual void NotifyWithCacheUpdates(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
    {
        Notify(notifications);
    }

    /// It enters the domain's history and can be undone.
    [[nodiscard]] virtual bool ShouldStackForUndo() const { return true; }
    /// Running it takes back a preview that is being shown.
    [[nodiscard]] virtual bool ClearsPreviewCommands() const { return true; }

    [[nodiscard]] virtual ProgressType GetProgressType() { return NoProgress; }
    /// Least time between two progress notifications, in milliseconds.
    [[nodiscard]] virtual int GetProgressInterval() const { return 100; }
    /// The flag that stops it when set (`Kernel::Abortable`); null if it cannot be stopped.
    [[nodiscard]] virtual bool * GetProgressAbortPointer() const { return nullptr; }
    /// Its progress shows results before its end.
    [[nodiscard]] virtual bool ProgressHasIntermediateUpdates() const { return false; }

    [[nodiscard]] Direction GetDirection() const { return m_Direction; }

protected:
    void SetDirection(Direction direction) { m_Direction = direction; }

private:
    friend class DomainController;

    Direction m_Direction = Forward;
};
