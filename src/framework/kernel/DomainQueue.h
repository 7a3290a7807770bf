#pragma once

#include "framework/kernel/BackgroundTask.h"
#include "framework/kernel/Counted.h"
#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/Question.h"
#include "framework/kernel/ThreadNode.h"

#include <atomic>
#include <deque>
#include <memory>
#include <mutex>
#include <vector>

class DomainController;

/// The queue of one domain: what waits, who works it, and who waits for what.
///
/// Idle, scheduled (a turn of the pool has been asked for), or worked by a thread: one of the pool, or one that waits for
/// a command of an idle or scheduled queue and takes the turn itself. Safe on any thread. No command, callback or hook
/// runs under the queue's mutex but `IsAnotherAlreadyInQueue`.
class DomainQueue
{
public:
    explicit DomainQueue(DomainController & controller) : m_Controller(controller) {}
    DomainQueue(DomainQueue const &) = delete;
    DomainQueue & operator=(DomainQueue const &) = delete;

    bool Enqueue(Kernel::Counted<DomainCommand> command);
    bool EnqueueAndWait(Kernel::Counted<DomainCommand> command);
    bool EnqueueForTask(Kernel::Counted<DomainCommand> command, Kernel::Counted<BackgroundTask> task);
    void WaitUntilEmpty();
    /// Refuses commands from now on, empties out what background tasks had enqueued, and appends `last` if there is one.
    /// False if the queue was disabled with a last command before.
    bool Disable(Kernel::Counted<DomainCommand> last);
    [[nodiscard]] bool IsDisabled() const { return m_Disabled.load(std::memory_order_acquire); }
    /// Commands wait or run.
    [[nodiscard]] bool IsOccupied();

    /// A turn of the pool.
    void Fire(int budget);
    /// The next command, with those folded in that it can merge with. On the turn's thread.
    Kernel::Counted<DomainCommand> TakeNext();
    /// Another command follows the one that runs.
    [[nodiscard]] bool HasMore();

    /// Remembers an open question that names this domain, to be answered with nothing when the queue is disabled. False
    /// if it is disabled already.
    [[nodiscard]] bool AddQuestion(std::weak_ptr<Kernel::Question::State> question);

private:
    /// Somebody asleep until a command has ended; on the sleeper's stack.
    struct Waiter
    {
        std::shared_ptr<Kernel::ThreadNode> m_Thread;
        Kernel::ThreadNode::Signal m_Signal;
    };
    /// A command with who waits for it; without a command a fence.
    struct Entry
    {
        Kernel::Counted<DomainCommand> m_Command;
        std::vector<Waiter *> m_Waiters;
        std::vector<Kernel::Counted<BackgroundTask>> m_Tasks;
    };
    enum class State
    {
        Idle,
        Scheduled,
        Working
    };

    /// With the mutex held.
    void Append(Entry entry, std::vector<Entry> & dropped);
    [[nodiscard]] bool ScheduleIfIdle();

    bool Wait(Entry entry);
    /// The calling thread is the worker already. Works for a budget, or until the flag is set.
    void Work(int budget, bool const * until);
    void Run(Entry entry);
    /// What is left to do for an entry whose command has run or was dropped.
    void End(Entry entry);
    /// One of the two goes on for both.
    static void Join(Entry & earlier, Entry & later, Entry & survivor);

    DomainController & m_Controller;
    std::mutex m_Lock;
    std::deque<Entry> m_Entries;
    std::vector<std::weak_ptr<Kernel::Question::State>> m_Questions;
    State m_State = State::Idle;
    bool m_HasLast = false;
    std::atomic<bool> m_Disabled{false};
    /// The thread that works the queue; null if none does.
    std::atomic<Kernel::ThreadNode *> m_Worker{nullptr};
    /// What `TakeNext` has taken; only the worker touches it.
    Entry m_Taken;
};
