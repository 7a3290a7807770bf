#include "framework/kernel/Scheduler.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/Clock.h"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

namespace Kernel
{

namespace
{

constexpr int TurnBudget = 64;
/// A turn that was left to a thread which then took its time goes to another one after this.
constexpr auto PatienceForAThread = std::chrono::microseconds(200);
/// When for so long nobody took a turn although one is ready, the threads may all be blocked in ways that the pool
/// cannot see, and one more is called.
constexpr auto PatienceWithAllThreads = std::chrono::milliseconds(1);
/// Turns that follow each other more closely than this are a burst of short ones.
constexpr auto GapInABurst = std::chrono::microseconds(50);
/// How long a thread that has run out of turns looks out for the next one before it sleeps. To wake it costs more than
/// most turns do, and turns come in bursts.
constexpr auto LookOutTime = std::chrono::microseconds(20);
constexpr auto IdleTimeOfAThread = std::chrono::seconds(2);

thread_local bool IsThreadOfPool = false;

class FunctionTurn final : public Schedulable
{
public:
    explicit FunctionTurn(std::function<void()> function) : m_Function(std::move(function)) {}
    void Fire(int) override { m_Function(); }

private:
    std::function<void()> const m_Function;
};

}

class Scheduler::Pool
{
public:
    /// Never destroyed: its threads end with the process.
    static Pool & Get()
    {
        static Pool * const pool = new Pool;
        return *pool;
    }

    void GiveTurn(Counted<Schedulable> schedulable)
    {
        std::unique_lock lock(m_Lock);
        auto const now = std::chrono::steady_clock::now();
        m_Ready.push_back({std::move(schedulable), now});
        m_ReadyCount.store(m_Ready.size(), std::memory_order_relaxed);
        std::size_t const lookingOut = m_LooksOut ? 1 : 0;
        if (lookingOut >= m_Ready.size()) {
            return;
        }
        // In a burst, whoever has just begun a turn is back sooner than another thread would be awake; and more threads
        // than the machine has processors only get in each other's way, unless they are blocked.
        std::size_t const busy = CountAwake() - lookingOut;
        bool const isLeft = busy > 0 && now - m_LastTaken < GapInABurst;
        if (CountAwake() < m_FirstThreads && !isLeft) {
            CallThread();
        } else if (!m_WatchesReady) {
            EnsureWatcher();
            ++m_Changes;
            lock.unlock();
            m_Watch.notify_one();
        }
    }

    /// A thread of the pool is about to sleep for another one.
    void BeginWait()
    {
        std::lock_guard const lock(m_Lock);
        ++m_Blocked;
        if (!m_Ready.empty() && CountAwake() < m_FirstThreads) {
            CallThread();
        }
    }

    void EndWait()
    {
        std::lock_guard const lock(m_Lock);
        --m_Blocked;
    }

    void GiveTurnAt(std::chrono::nanoseconds due, Counted<Schedulable> schedulable)
    {
        {
            std::lock_guard const lock(m_Lock);
            m_Timers.emplace(due, std::move(schedulable));
            ++m_Changes;
            EnsureWatcher();
        }
        m_Watch.notify_one();
        if (Activity::IsAwaited()) {
            RushTimers();
        }
    }

    void PollTimers()
    {
        {
            std::lock_guard const lock(m_Lock);
            ++m_Changes;
        }
        m_Watch.notify_one();
    }

    void RushTimers()
    {
        std::vector<Counted<Schedulable>> due;
        {
            std::lock_guard const lock(m_Lock);
            for (auto & [time, schedulable] : m_Timers) {
                due.push_back(std::move(schedulable));
            }
            m_Timers.clear();
        }
        for (Counted<Schedulable> & schedulable : due) {
            GiveTurn(std::move(schedulable));
        }
    }

    std::size_t GetNumberOfThreads()
    {
        std::lock_guard const lock(m_Lock);
        return m_Threads;
    }

private:
    struct Turn
    {
        Counted<Schedulable> m_Schedulable;
        std::chrono::steady_clock::time_point m_Since;
    };

    /// Threads that have a turn, are on their way to one, or look out for one. With the lock held.
    [[nodiscard]] std::size_t CountAwake() const { return m_Threads - m_Blocked - (m_Sleeping - m_Called); }

    /// One that sleeps, or a new one. With the lock held.
    void CallThread()
    {
        if (m_Called < m_Sleeping) {
            ++m_Called;
            m_TurnReady.notify_one();
        } else {
            ++m_Threads;
            std::thread([this] { Work(); }).detach();
        }
    }

    /// With the lock held.
    void EnsureWatcher()
    {
        if (!std::exchange(m_HasWatcher, true)) {
            std::thread([this] { Watch(); }).detach();
        }
    }

    void Work()
    {
        IsThreadOfPool = true;
        std::unique_lock lock(m_Lock);
        for (;;) {
            if (m_Ready.empty() && !m_LooksOut) {
                LookOut(lock);
            }
            if (m_Ready.empty()) {
                ++m_Sleeping;
                bool const called = m_TurnReady.wait_for(lock, IdleTimeOfAThread, [this] { return 0 < m_Called; });
                --m_Sleeping;
                m_Called -= called ? 1 : 0;
                if (!called && m_Ready.empty()) {
                    --m_Threads;
                    return;
                }
                continue;
            }
            Counted<Schedulable> schedulable = std::move(m_Ready.front().m_Schedulable);
            m_Ready.pop_front();
            m_LastTaken = std::chrono::steady_clock::now();
            m_ReadyCount.store(m_Ready.size(), std::memory_order_relaxed);
            lock.unlock();
            schedulable->Fire(TurnBudget);
            schedulable.Reset();
            lock.lock();
        }
    }

    /// Until a turn is ready or the time is over. With the lock held, which it gives up meanwhile.
    void LookOut(std::unique_lock<std::mutex> & lock)
    {
        m_LooksOut = true;
        auto const until = std::chrono::steady_clock::now() + LookOutTime;
        for (bool isOver = false; m_Ready.empty() && !isOver;) {
            lock.unlock();
            do {
                isOver = std::chrono::steady_clock::now() >= until;
            } while (m_ReadyCount.load(std::memory_order_relaxed) == 0 && !isOver);
            lock.lock();
        }
        m_LooksOut = false;
    }

    /// Calls one thread more if the turn at the front waits for too long. With the lock held.
    void HelpReady(std::chrono::steady_clock::time_point now)
    {
        std::size_t const awake = CountAwake();
        auto const waiting = now - m_Ready.front().m_Since;
        if (awake < m_FirstThreads) {
            if (waiting >= PatienceForAThread) {
                CallThread();
            }
            return;
        }
        // The more there are already, the likelier it is that they are only slow, or the machine is: turns that take
        // long must not draw in thread after thread. Yet it never ends, since all may be blocked.
        auto const more = static_cast<std::int64_t>(awake - m_FirstThreads + 1);
        auto const patience = more * more * PatienceWithAllThreads;
        if (waiting >= patience && now - std::max(m_LastTaken, m_LastHelp) >= patience) {
            m_LastHelp = now;
            CallThread();
        }
    }

    /// Calls threads for turns that found none, and gives turns whose time has come.
    void Watch()
    {
        std::unique_lock lock(m_Lock);
        for (;;) {
            std::uint64_t const seen = m_Changes;
            auto wake = std::chrono::steady_clock::time_point::max();
            if (!m_Ready.empty()) {
                auto const now = std::chrono::steady_clock::now();
                HelpReady(now);
                wake = now + PatienceForAThread;
            }
            if (!m_Timers.empty()) {
                std::chrono::nanoseconds const now = Clock::Get().Steady();
                while (!m_Timers.empty() && m_Timers.begin()->first <= now) {
                    Counted<Schedulable> schedulable = std::move(m_Timers.begin()->second);
                    m_Timers.erase(m_Timers.begin());
                    lock.unlock();
                    GiveTurn(std::move(schedulable));
                    lock.lock();
                }
                if (!m_Timers.empty()) {
                    wake = std::min(wake, std::chrono::steady_clock::now() + (m_Timers.begin()->first - now));
                }
            }
            // Turns that came while the lock was given up are looked at once more.
            m_WatchesReady = !m_Ready.empty() && wake != std::chrono::steady_clock::time_point::max();
            auto const changed = [&] { return m_Changes != seen; };
            if (wake == std::chrono::steady_clock::time_point::max()) {
                m_Watch.wait(lock, changed);
            } else {
                m_Watch.wait_until(lock, wake, changed);
            }
            m_WatchesReady = false;
        }
    }

    std::mutex m_Lock;
    std::condition_variable m_TurnReady;
    std::condition_variable m_Watch;
    std::deque<Turn> m_Ready;
    std::multimap<std::chrono::nanoseconds, Counted<Schedulable>> m_Timers;
    std::chrono::steady_clock::time_point m_LastTaken;
    std::chrono::steady_clock::time_point m_LastHelp;
    std::size_t m_Threads = 0;
    std::size_t m_Sleeping = 0;
    /// How many of those that sleep were called, and have not come yet.
    std::size_t m_Called = 0;
    /// Threads whose turn waits for another thread.
    std::size_t m_Blocked = 0;
    /// A thread is awake without a turn, and will see one that comes. One at a time does so.
    bool m_LooksOut = false;
    /// How many turns are ready, for who looks without the lock.
    std::atomic<std::size_t> m_ReadyCount{0};
    bool m_HasWatcher = false;
    /// The watcher sleeps no longer than until the turn at the front has waited for too long.
    bool m_WatchesReady = false;
    /// What the watcher has to look at again.
    std::uint64_t m_Changes = 0;
    /// So many work at once, not counting those that are blocked.
    std::size_t const m_FirstThreads = std::max(2U, std::thread::hardware_concurrency());
};

void Scheduler::GiveTurn(Counted<Schedulable> schedulable)
{
    Pool::Get().GiveTurn(std::move(schedulable));
}

void Scheduler::Run(std::function<void()> function)
{
    GiveTurn(MakeCounted<FunctionTurn>(std::move(function)));
}

Scheduler::Wait::Wait() : m_IsOfPool(IsThreadOfPool)
{
    if (m_IsOfPool) {
        Pool::Get().BeginWait();
    }
}

Scheduler::Wait::~Wait()
{
    if (m_IsOfPool) {
        Pool::Get().EndWait();
    }
}

void Scheduler::GiveTurnAt(std::chrono::nanoseconds due, Counted<Schedulable> schedulable)
{
    Pool::Get().GiveTurnAt(due, std::move(schedulable));
}

void Scheduler::PollTimers()
{
    Pool::Get().PollTimers();
}

void Scheduler::RushTimers()
{
    Pool::Get().RushTimers();
}

std::size_t Scheduler::GetNumberOfThreads()
{
    return Pool::Get().GetNumberOfThreads();
}

}
