#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Schedulable.h"

#include <chrono>
#include <cstddef>
#include <functional>

namespace Kernel
{

/// The pool of threads that all queues and delivery lines of the process share.
///
/// Turns begin in the order in which they were asked for. As many threads work as the machine has processors, not
/// counting those that are blocked; one that blocks is replaced at once where the pool knows of it (`Wait`). When all
/// have been at their turns for long while others are ready, more threads come, at growing intervals, but without an
/// upper limit: threads may block on one another's turns, so that a limit would be a deadlock. Threads that find nothing
/// to do for a while end. Safe on any thread.
class Scheduler
{
public:
    /// Gives the object one turn soon. It is retained until then. Asking twice gives two turns.
    static void GiveTurn(Counted<Schedulable> schedulable);

    /// Runs a function once on a thread of the pool.
    static void Run(std::function<void()> function);

    /// Around a sleep that another thread ends: while it lives, the pool runs another thread in the place of the calling
    /// one. Not nested. On a thread that is not the pool's it does nothing.
    class Wait
    {
    public:
        Wait();
        ~Wait();
        Wait(Wait const &) = delete;
        Wait & operator=(Wait const &) = delete;

    private:
        bool const m_IsOfPool;
    };

    /// Gives the object one turn when the steady time of `Clock` has come to `due`. With a clock that stands still
    /// until it is moved, `PollTimers` tells the scheduler that it was. At once while somebody waits for rest
    /// (`Activity::WaitForRest`).
    static void GiveTurnAt(std::chrono::nanoseconds due, Counted<Schedulable> schedulable);
    /// Looks at the clock again at once.
    static void PollTimers();
    /// Gives all turns that wait for a time at once.
    static void RushTimers();

    /// Threads of the pool at this moment, for tests and diagnostics.
    [[nodiscard]] static std::size_t GetNumberOfThreads();

    class Pool;
};

}
