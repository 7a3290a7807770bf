#include "framework/kernel/Activity.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Scheduler.h"

#include <atomic>
#include <condition_variable>
#include <mutex>

namespace Kernel
{

namespace
{

struct State
{
    std::atomic<std::int64_t> m_Count{0};
    std::atomic<int> m_Questions{0};
    std::atomic<int> m_Waiters{0};
    std::mutex m_Lock;
    std::condition_variable m_Rest;
};

/// Never destroyed: threads of the pool may outlive the program's static objects.
State & GetState()
{
    static State * const state = new State;
    return *state;
}

void WakeWaiters(State & state)
{
    if (state.m_Waiters.load() > 0) {
        std::lock_guard const lock(state.m_Lock);
        state.m_Rest.notify_all();
    }
}

}

void Activity::Begin()
{
    GetState().m_Count.fetch_add(1);
}

void Activity::End()
{
    State & state = GetState();
    std::int64_t const before = state.m_Count.fetch_sub(1);
    KORVANE_ASSERT(before > 0);
    if (before == 1) {
        WakeWaiters(state);
    }
}

void Activity::BeginQuestion()
{
    State & state = GetState();
    state.m_Questions.fetch_add(1);
    WakeWaiters(state);
}

void Activity::EndQuestion()
{
    GetState().m_Questions.fetch_sub(1);
}

Activity::Rest Activity::WaitForRest()
{
    State & state = GetState();
    state.m_Waiters.fetch_add(1);
    Scheduler::RushTimers();
    std::unique_lock lock(state.m_Lock);
    state.m_Rest.wait(lock, [&state] { return state.m_Count.load() == 0 || state.m_Questions.load() > 0; });
    Rest const rest = state.m_Questions.load() > 0 ? Rest::WaitingForUser : Rest::Idle;
    lock.unlock();
    state.m_Waiters.fetch_sub(1);
    return rest;
}

bool Activity::IsAwaited()
{
    return GetState().m_Waiters.load() > 0;
}

std::int64_t Activity::GetCount()
{
    return GetState().m_Count.load();
}

}
