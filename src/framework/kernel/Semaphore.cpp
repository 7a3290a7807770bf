#include "framework/kernel/Semaphore.h"

#include "framework/kernel/Scheduler.h"

#include <chrono>
#include <optional>

namespace Kernel
{

Semaphore::Semaphore(int count) : m_State(std::make_shared<State>())
{
    m_State->m_Count = count;
}

bool Semaphore::Wait(int milliseconds)
{
    std::unique_lock lock(m_State->m_Lock);
    std::optional<Scheduler::Wait> wait;
    if (m_State->m_Count <= 0) {
        wait.emplace();
    }
    auto const available = [this] { return 0 < m_State->m_Count; };
    if (milliseconds <= 0) {
        m_State->m_Changed.wait(lock, available);
    } else if (!m_State->m_Changed.wait_for(lock, std::chrono::milliseconds(milliseconds), available)) {
        return false;
    }
    --m_State->m_Count;
    return true;
}

void Semaphore::Signal()
{
    std::shared_ptr<State> const state = m_State;
    // Notified under the lock: the waiter cannot return, and destroy this object, before the copy above is made.
    std::lock_guard lock(state->m_Lock);
    ++state->m_Count;
    state->m_Changed.notify_one();
}

}
