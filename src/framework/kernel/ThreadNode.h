#pragma once

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <vector>

namespace Kernel
{

class ReaderWriterLock;

/// A thread as the queues and locks see it: where it sleeps, and what it sleeps for. Others may keep it for as long as
/// they have to wake it.
class ThreadNode
{
public:
    /// The calling thread's.
    [[nodiscard]] static std::shared_ptr<ThreadNode> const & Current();
    [[nodiscard]] static ThreadNode * CurrentPointer() { return Current().get(); }

    /// A flag that one thread sleeps on and another sets.
    struct Signal
    {
        bool m_Given = false;
    };
    /// Sleeps until the signal is given. Own thread.
    void Sleep(Signal const & signal);
    /// The same for at most so many milliseconds; true if it was given.
    bool SleepFor(Signal const & signal, int milliseconds);
    /// Gives the signal. The sleeper may destroy the signal as soon as it has it; this node must be kept by the caller.
    void Give(Signal & signal);

    /// Own thread, after a wait: sleeps until every lock is back that others have borrowed from it meanwhile. The thread
    /// that lent may have been woken by another way than the one by which the borrower made sure of it.
    void AwaitLentLocks();

private:
    friend class WaitGraph;

    [[nodiscard]] bool IsGiven(Signal const & signal);

    std::mutex m_Lock;
    std::condition_variable m_Given;
    /// What it waits for; guarded by the wait graph. At most one of them.
    std::atomic<ThreadNode *> const * m_AwaitedWorker = nullptr;
    ReaderWriterLock const * m_AwaitedLock = nullptr;
    /// Locks that were borrowed from it while it slept; guarded by the wait graph.
    std::vector<ReaderWriterLock *> m_Lent;
};

/// Who waits for whom: the edges between threads that wait for a queue's worker or for a lock's holder.
///
/// One mutex guards all edges. A wait is looked at and entered in one step, so that of the waits which would close a
/// ring one always sees the ring and does not wait. Lock order: a queue's mutex, then this, then a lock's mutex.
class WaitGraph
{
public:
    /// Enters that the thread waits for the worker of a queue, unless that worker is blocked on the thread: then nothing
    /// is entered, and the result is false.
    [[nodiscard]] static bool WaitForWorker(ThreadNode & thread, std::atomic<ThreadNode *> const & worker);
    /// The locks lent since it was last asked.
    [[nodiscard]] static std::vector<ReaderWriterLock *> TakeLent(ThreadNode & thread);
    /// The wait is over. Called before the thread is woken, so that nobody takes it for blocked when it is not.
    static void EndWait(ThreadNode & thread);

    /// Holds the mutex for a step of `ReaderWriterLock`.
    class Step
    {
    public:
        Step();
        /// The thread, or one that it waits for however indirectly, is `other`.
        [[nodiscard]] bool IsBlockedOn(ThreadNode const * thread, ThreadNode const & other) const;
        void EnterLockWait(ThreadNode & thread, ReaderWriterLock const & lock);
        void EnterLoan(ThreadNode & lender, ReaderWriterLock & lock);

    private:
        std::unique_lock<std::mutex> m_Held;
    };
};

}
