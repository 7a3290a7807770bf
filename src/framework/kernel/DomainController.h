#pragma once

#include "framework/kernel/Archive.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/Notification.h"
#include "framework/kernel/Schedulable.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <vector>

class BackgroundTask;
class BackgroundTaskPump;
class DomainQueue;
class OpenDocumentFailedNotification;

namespace Kernel
{
class Question;
class ReaderWriterLock;
}

/// One domain of data with its queue of commands and its reader/writer lock: a book, or an open document.
///
/// Order: commands run one at a time, in the order of enqueueing, each under the writer lock. At a command's end its
/// notifications are posted, the lock is released, its completion callback runs, and its waiter is woken.
///
/// Waiting: a thread that waits for a command of an idle queue works that queue itself. A command for a queue that is
/// held by the asking turn, or by one that is blocked on it however indirectly, runs in place, ahead of what waits in
/// that queue, with the held lock. So turns that wait for each other never block for ever. See docs/threads.md.
///
/// Everything is safe on any thread unless it says otherwise.
class DomainController : public Kernel::Schedulable
{
public:
    DomainController();
    DomainController(DomainController const &) = delete;
    DomainController & operator=(DomainController const &) = delete;
    ~DomainController() override;

    /// The scheduler's entry: works the queue for about `budget` commands.
    void Fire(int budget) override;

    /// From now on the queue refuses commands. Those that it has accepted still run, apart from those of background
    /// tasks, which are emptied out; the pump stops; open questions that name this domain are answered with nothing.
    /// Returns without waiting; `WaitUntilCommandQueueEmpty` waits.
    virtual void DisableCommandEnqueueAndEmpty();

    /// Runs one command to its end on the calling thread, which holds the queue's turn: lock, do, notify, post, unlock,
    /// callback.
    virtual void PerformCommand(Kernel::Counted<DomainCommand> command);

    /// Waits while a writer holds the lock, or waits for it. Nests: a thread that holds the lock in any form gets it at
    /// once.
    virtual void AcquireReaderLock() const;
    virtual void ReleaseReaderLock() const;

    /// Takes the next command off the queue, after folding those behind it into it that it can merge with; null if
    /// there is none. Called on the queue's turn.
    virtual Kernel::Counted<DomainCommand>
    PreMergeAndDequeueCommand(std::vector<Kernel::Counted<Kernel::Notification>> & notifications);

    /// Called after a turn's command has released the writer lock, which readers may now have; `more` says that another
    /// command follows at once. For letting go of what was kept for readers.
    virtual void ReleaseAfterWriterUnlock(bool more);

    /// While it is set, commands of this domain post no notifications.
    virtual void SetSuppressNotifications(bool suppress);
    [[nodiscard]] bool GetSuppressNotifications() const { return m_SuppressNotifications; }

    /// Lets the tasks run that were or will be added, if the domain wants them (`SetWantBackgroundTasks`).
    virtual void StartBackgroundTaskPump();

    /// Whether the queue takes this command now. By default: unless it has been disabled.
    [[nodiscard]] virtual bool CanEnqueueCommand(Kernel::Counted<DomainCommand> const & command) const;

    /// Around each turn of the queue, on its thread, without the lock.
    virtual void PreProcessCommandQueue() {}
    virtual void PostProcessCommandQueue() {}

    /// Posts one notification of this domain, unless they are suppressed.
    virtual void Notify(Kernel::Counted<Kernel::Notification> const & notification);

    /// Called on the queue's thread before it waits for the writer lock: a moment to let others in.
    virtual void ImmediatePausePriorToWriterLock() {}
    /// Called every few milliseconds while a command waits for readers to leave. Setting `letReadersIn` lets the readers
    /// go first that wait behind the command; `quiet` ends these calls for this wait.
    virtual void PeriodicWhileAwaitingReaderUnlock(bool & letReadersIn, bool & quiet);

    /// Does the command and gathers what it has to say. Under the writer lock.
    virtual void ProcessCommand(Kernel::Counted<DomainCommand> command,
                                std::vector<Kernel::Counted<Kernel::Notification>> & notifications);

    /// Folds a batch before it is posted: drops repeats by `GetDedupeId`, joins by `Merge`.
    virtual void SimplifyNotifications(std::vector<Kernel::Counted<Kernel::Notification>> & notifications);

    /// The calling thread has got, or has released, the reader lock; not for nested ones.
    virtual void OnAcquireReaderLock() const {}
    virtual void OnReleaseReaderLock() const {}

    /// Hands a command in and returns at once. False if the queue refuses it: then it is dropped and its callback does
    /// not run. Never waits, so it is safe under any lock.
    bool EnqueueCommand(Kernel::Counted<DomainCommand> command);
    /// The same, and returns when the command has run and its callback has returned. False at once if refused.
    bool EnqueueCommandAndWait(Kernel::Counted<DomainCommand> command);
    /// Makes this the queue's last command: disables the queue as `DisableCommandEnqueueAndEmpty` does, then accepts this
    /// one. False if a last command was already there.
    bool EnqueueLastCommand(Kernel::Counted<DomainCommand> command);

    /// Returns when every command that was enqueued before has run and its callback has returned. At once if the calling
    /// turn holds the queue, or blocks the turn that does: nothing behind that turn can run before it.
    void WaitUntilCommandQueueEmpty() const;
    [[nodiscard]] bool IsCommandEnqueueDisabled() const;

    /// Takes the lock by hand, outside of the queue. Nests. Book before document.
    void AcquireWriterLock();
    void ReleaseWriterLock();
    /// The calling thread holds the lock for writing.
    [[nodiscard]] bool IsWriterLockHeld() const;
    /// Somebody waits for the lock: a long reader, or a background command that gives way to readers, looks here.
    [[nodiscard]] bool IsWriterWaiting() const;
    [[nodiscard]] bool IsReaderWaiting() const;

    void AddBackgroundTask(Kernel::Counted<BackgroundTask> task);
    /// Without it the pump rests and tasks stay dirty. Off at first.
    void SetWantBackgroundTasks(bool want);
    [[nodiscard]] bool GetWantBackgroundTasks() const { return m_WantBackgroundTasks; }

    /// Whether commands of this domain may show progress in the front end. On at first.
    void SetCanShowProgress(bool can) const { m_CanShowProgress = can; }
    [[nodiscard]] bool GetCanShowProgress() const { return m_CanShowProgress; }
    /// Tells the front end how far a command is, from 0 to 1, as often as the command's interval allows. Posts a
    /// `CommandProgressNotification`.
    void UpdateProgress(Kernel::Counted<DomainCommand const> command, float fraction);

protected:
    /// Fills a failure from the result of `Kernel::Archive::Open`: its code, and a sentence for the user.
    static void SetNotifyResultFromError(OpenDocumentFailedNotification & notification,
                                         enum Kernel::Archive::OpenResult & result);

    /// A command has been done and wants to be undoable; under the writer lock. A domain with a history takes it and
    /// returns true, and then owns its `Teardown`.
    virtual bool StackForUndo(Kernel::Counted<DomainCommand> const & command);
    /// A command threw `what`. By default it posts a `CommandFailedNotification`, also when notifications are
    /// suppressed. Under the writer lock.
    virtual void CommandThrew(Kernel::Counted<DomainCommand> const & command, char const * what);

private:
    friend class BackgroundTask;
    friend class BackgroundTaskPump;
    friend class DomainQueue;
    friend class DomainWriterUnlockSession;
    friend class Kernel::Question;

    std::unique_ptr<Kernel::ReaderWriterLock> const m_Lock;
    std::unique_ptr<DomainQueue> const m_Queue;
    std::unique_ptr<BackgroundTaskPump> const m_Pump;
    std::atomic<bool> m_SuppressNotifications{false};
    std::atomic<bool> m_WantBackgroundTasks{false};
    mutable std::atomic<bool> m_CanShowProgress{true};
    std::atomic<std::int64_t> m_LastProgress{0};
};
