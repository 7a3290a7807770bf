#include "framework/kernel/ThreadNode.h"

#include "framework/kernel/ReaderWriterLock.h"
#include "framework/kernel/Scheduler.h"

#include <algorithm>
#include <chrono>
#include <utility>
#include <vector>

namespace Kernel
{

namespace
{

/// Never destroyed: threads of the pool may outlive the program's static objects.
std::mutex & GraphLock()
{
    static std::mutex * const lock = new std::mutex;
    return *lock;
}

}

std::shared_ptr<ThreadNode> const & ThreadNode::Current()
{
    // A plain pointer, so that static objects may still take locks after the thread's own objects have gone.
    thread_local std::shared_ptr<ThreadNode> * node = nullptr;
    struct Owner
    {
        ~Owner()
        {
            {
                // Whoever walks the graph may have met this thread as a worker or a holder a moment ago.
                std::lock_guard const lock(GraphLock());
            }
            delete std::exchange(node, nullptr);
        }
    };
    if (!node) {
        node = new std::shared_ptr<ThreadNode>(std::make_shared<ThreadNode>());
        thread_local Owner const owner;
    }
    return *node;
}

bool ThreadNode::IsGiven(Signal const & signal)
{
    std::lock_guard const lock(m_Lock);
    return signal.m_Given;
}

void ThreadNode::Sleep(Signal const & signal)
{
    if (IsGiven(signal)) {
        return;
    }
    Scheduler::Wait const wait;
    std::unique_lock lock(m_Lock);
    m_Given.wait(lock, [&signal] { return signal.m_Given; });
}

bool ThreadNode::SleepFor(Signal const & signal, int milliseconds)
{
    if (IsGiven(signal)) {
        return true;
    }
    Scheduler::Wait const wait;
    std::unique_lock lock(m_Lock);
    return m_Given.wait_for(lock, std::chrono::milliseconds(milliseconds), [&signal] { return signal.m_Given; });
}

void ThreadNode::Give(Signal & signal)
{
    std::lock_guard const lock(m_Lock);
    signal.m_Given = true;
    m_Given.notify_one();
}

void ThreadNode::AwaitLentLocks()
{
    for (std::vector<ReaderWriterLock *> lent; !(lent = WaitGraph::TakeLent(*this)).empty();) {
        for (ReaderWriterLock * const lock : lent) {
            lock->AwaitReturn();
        }
    }
}

std::vector<ReaderWriterLock *> WaitGraph::TakeLent(ThreadNode & thread)
{
    std::lock_guard const lock(GraphLock());
    return std::exchange(thread.m_Lent, {});
}

bool WaitGraph::WaitForWorker(ThreadNode & thread, std::atomic<ThreadNode *> const & worker)
{
    Step const step;
    if (step.IsBlockedOn(worker.load(std::memory_order_acquire), thread)) {
        return false;
    }
    thread.m_AwaitedWorker = &worker;
    return true;
}

void WaitGraph::EndWait(ThreadNode & thread)
{
    std::lock_guard const lock(GraphLock());
    thread.m_AwaitedWorker = nullptr;
    thread.m_AwaitedLock = nullptr;
}

WaitGraph::Step::Step() : m_Held(GraphLock()) {}

void WaitGraph::Step::EnterLockWait(ThreadNode & thread, ReaderWriterLock const & lock)
{
    thread.m_AwaitedLock = &lock;
}

void WaitGraph::Step::EnterLoan(ThreadNode & lender, ReaderWriterLock & lock)
{
    lender.m_Lent.push_back(&lock);
}

bool WaitGraph::Step::IsBlockedOn(ThreadNode const * thread, ThreadNode const & other) const
{
    std::vector<ThreadNode const *> open{thread};
    std::vector<ThreadNode const *> seen;
    while (!open.empty()) {
        ThreadNode const * const next = open.back();
        open.pop_back();
        if (!next) {
            continue;
        }
        if (next == &other) {
            return true;
        }
        if (std::find(seen.begin(), seen.end(), next) != seen.end()) {
            continue;
        }
        seen.push_back(next);
        if (next->m_AwaitedWorker) {
            ThreadNode const * const worker = next->m_AwaitedWorker->load(std::memory_order_acquire);
            // A worker that is not waiting may end its turn at any moment: only one that waits counts, and that one
            // holds still while the graph is locked.
            bool const waits = worker && (worker == &other || worker->m_AwaitedWorker || worker->m_AwaitedLock);
            if (waits && next->m_AwaitedWorker->load(std::memory_order_acquire) == worker) {
                open.push_back(worker);
            }
        } else if (next->m_AwaitedLock) {
            next->m_AwaitedLock->AddHolders(*next, open);
        }
    }
    return false;
}

}
