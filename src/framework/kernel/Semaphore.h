#pragma once

#include <condition_variable>
#include <memory>
#include <mutex>

namespace Kernel
{

/// Counting semaphore. Any thread may signal and any may wait.
///
/// A waiter may destroy the semaphore as soon as its `Wait` has returned, even while the `Signal` that woke it is still
/// on its way out of the call: the state that `Signal` works on is shared, and lives as long as one of them needs it.
/// `Signal` itself must begin before the object goes.
class Semaphore
{
public:
    /// `count` waits return at once before the first one blocks.
    explicit Semaphore(int count);

    /// Takes one from the count, waiting for it for at most this many milliseconds; 0 waits without a limit. True if it
    /// got one, false if the time ran out.
    bool Wait(int milliseconds);

    /// Adds one to the count and wakes one waiter.
    void Signal();

private:
    struct State
    {
        std::mutex m_Lock;
        std::condition_variable m_Changed;
        int m_Count = 0;
    };

    std::shared_ptr<State> const m_State;
};

}
