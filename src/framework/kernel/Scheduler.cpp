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
constexpr auto PatienceForAThread = std::chrono::milliseconds(1);
/// A turn that was left to a thread which then took its time goes to another one after this.
constexpr auto PatienceForASleeper = std::chrono::microseconds(200);
/// Turns that follow each other more closely than this are a burst of short ones.
constexpr auto GapInABurst = std::chrono::microseconds(20);
/// How long a thread that has run out of turns looks out for the next one before it sleeps. To wake it costs more than
/// most turns do, and turns come in bursts.
constexpr auto LookOutTime = std::chrono::microseconds(20);
constexpr auto IdleTimeOfAThread = std::chrono::seconds(2);

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
        if (m_LookingOut >= m_Ready.size()) {
            return;
        }
        // In a burst, whoever has just begun a turn is back sooner than another thread would be awake; and more threads
        // than the machine has processors only get in each other's way, unless they are blocked.
        std::size_t const busy = m_Threads - m_Sleeping - m_LookingOut;
        bool const isLeft = busy >= m_FirstThreads || (busy > 0 && now - m_LastTaken < GapInABurst);
        if (!isLeft && m_Sleeping + m_LookingOut >= m_Ready.size()) {
            lock.unlock();
            m_TurnReady.notify_one();
        } else if (!isLeft && m_Threads < m_FirstThreads) {
            AddThread();
        } else if (!m_WatchesReady) {
            EnsureWatcher();
            ++m_Changes;
            lock.unlock();
            m_Watch.notify_one();
        }
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

    /// With the lock held.
    void AddThread()
    {
        ++m_Threads;
        std::thread([this] { Work(); }).detach();
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
        std::unique_lock lock(m_Lock);
        for (;;) {
            if (m_Ready.empty() && m_LookingOut < m_FirstThreads) {
                LookOut(lock);
            }
            if (m_Ready.empty()) {
                ++m_Sleeping;
                bool const woken = m_TurnReady.wait_for(lock, IdleTimeOfAThread, [this] { return !m_Ready.empty(); });
                --m_Sleeping;
                if (!woken) {
                    --m_Threads;
                    return;
                }
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

    /// With the lock held, which it gives up meanwhile.
    void LookOut(std::unique_lock<std::mutex> & lock)
    {
        ++m_LookingOut;
        lock.unlock();
        auto const until = std::chrono::steady_clock::now() + LookOutTime;
        while (m_ReadyCount.load(std::memory_order_relaxed) == 0 && std::chrono::steady_clock::now() < until) {
        }
        lock.lock();
        --m_LookingOut;
    }

    /// Wakes or adds threads for turns that found none, and gives turns whose time has come.
    void Watch()
    {
        std::unique_lock lock(m_Lock);
        for (;;) {
            std::uint64_t const seen = m_Changes;
            auto wake = std::chrono::steady_clock::time_point::max();
            if (!m_Ready.empty()) {
                auto const now = std::chrono::steady_clock::now();
                // One thread a round: if the others are blocked, more rounds follow; if the machine is busy, one helps
                // more than many.
                auto const waiting = now - m_Ready.front().m_Since;
                if (m_Sleeping > 0 && waiting >= PatienceForASleeper) {
                    m_TurnReady.notify_one();
                } else if (m_Sleeping == 0 && waiting >= PatienceForAThread) {
                    AddThread();
                }
                wake = std::max(m_Ready.front().m_Since, now) + PatienceForASleeper;
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
    std::size_t m_Threads = 0;
    std::size_t m_Sleeping = 0;
    /// Threads that are awake without a turn, and will see one that comes.
    std::size_t m_LookingOut = 0;
    /// How many turns are ready, for who looks without the lock.
    std::atomic<std::size_t> m_ReadyCount{0};
    bool m_HasWatcher = false;
    /// The watcher sleeps no longer than until the turn at the front has waited for too long.
    bool m_WatchesReady = false;
    /// What the watcher has to look at again.
    std::uint64_t m_Changes = 0;
    /// Up to here threads are added without waiting.
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
