#include "framework/kernel/BackgroundTask.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/BackgroundTaskPump.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/DomainController.h"
#include "framework/kernel/DomainQueue.h"
#include "framework/kernel/Scheduler.h"

#include <algorithm>
#include <utility>

namespace
{

/// A task's timer. It keeps the domain: a domain lives as long as it has something to catch up with.
class TaskTimer final : public Kernel::Schedulable
{
public:
    TaskTimer(Kernel::Counted<DomainController> controller, BackgroundTaskPump & pump,
              Kernel::Counted<BackgroundTask> task)
        : m_Controller(std::move(controller)), m_Pump(pump), m_Task(std::move(task))
    {
    }

    void Fire(int) override { m_Pump.Tick(m_Task); }

private:
    Kernel::Counted<DomainController> const m_Controller;
    BackgroundTaskPump & m_Pump;
    Kernel::Counted<BackgroundTask> const m_Task;
};

}

BackgroundTask::BackgroundTask(int interval, bool whileQueueOccupied, bool gathersChanges)
    : m_Interval(interval), m_WhileQueueOccupied(whileQueueOccupied), m_GathersChanges(gathersChanges)
{
}

BackgroundTask::BackgroundTask(BackgroundTask const & other)
    : Countable(other), m_Interval(other.m_Interval), m_WhileQueueOccupied(other.m_WhileQueueOccupied),
      m_GathersChanges(other.m_GathersChanges)
{
}

BackgroundTask::~BackgroundTask() = default;

void BackgroundTask::Dirty()
{
    Kernel::ScopedLock const lock(m_Lock);
    ++m_DirtyCount;
    Arm(false);
}

void BackgroundTask::Clean()
{
    Kernel::ScopedLock const lock(m_Lock);
    m_CleanUpTo = m_CommandTaken ? m_TakenAt : m_DirtyCount;
    Arm(false);
}

bool BackgroundTask::IsDirty() const
{
    Kernel::ScopedLock const lock(m_Lock);
    return m_DirtyCount > m_CleanUpTo;
}

void BackgroundTask::Arm(bool later)
{
    bool const hasWork = m_DirtyCount > m_CleanUpTo && m_Active && m_Controller;
    if (hasWork != m_CountedAsActivity) {
        m_CountedAsActivity = hasWork;
        hasWork ? Kernel::Activity::Begin() : Kernel::Activity::End();
    }
    if (!hasWork || m_CommandInFlight || m_TimerSet || m_AwaitsEmptyQueue || !m_Controller->RetainIfAlive()) {
        return;
    }
    Kernel::Counted<DomainController> controller(m_Controller);
    m_Controller->Release();
    std::chrono::nanoseconds const now = Kernel::Clock::Get().Steady();
    std::chrono::nanoseconds const interval = std::chrono::milliseconds(m_Interval);
    bool const wait = later || m_GathersChanges;
    std::chrono::nanoseconds due = wait ? now + interval : std::max(now, m_LastCommand + interval);
    if (Kernel::Activity::IsAwaited()) {
        due = now;
    }
    m_TimerSet = true;
    BackgroundTaskPump & pump = *controller->m_Pump;
    Kernel::Scheduler::GiveTurnAt(due, Kernel::MakeCounted<TaskTimer>(std::move(controller), pump, this));
}

BackgroundTaskPump::~BackgroundTaskPump()
{
    for (Kernel::Counted<BackgroundTask> const & task : m_Tasks) {
        Kernel::ScopedLock const lock(task->m_Lock);
        task->m_Controller = nullptr;
        task->Arm(false);
    }
}

void BackgroundTaskPump::Add(Kernel::Counted<BackgroundTask> task)
{
    std::lock_guard const lock(m_Lock);
    m_Tasks.push_back(task);
    Kernel::ScopedLock const taskLock(task->m_Lock);
    task->m_Controller = &m_Controller;
    task->m_Active = m_Started && m_Wanted && !m_Stopped;
    task->Arm(false);
}

void BackgroundTaskPump::ConditionsChanged()
{
    for (Kernel::Counted<BackgroundTask> const & task : m_Tasks) {
        Kernel::ScopedLock const lock(task->m_Lock);
        task->m_Active = m_Started && m_Wanted && !m_Stopped;
        task->m_AwaitsEmptyQueue = false;
        task->Arm(false);
    }
}

void BackgroundTaskPump::Start()
{
    std::lock_guard const lock(m_Lock);
    m_Started = true;
    ConditionsChanged();
}

void BackgroundTaskPump::SetWanted(bool wanted)
{
    std::lock_guard const lock(m_Lock);
    m_Wanted = wanted;
    ConditionsChanged();
}

void BackgroundTaskPump::Stop()
{
    std::lock_guard const lock(m_Lock);
    m_Stopped = true;
    ConditionsChanged();
}

void BackgroundTaskPump::QueueRanEmpty()
{
    std::lock_guard const lock(m_Lock);
    for (Kernel::Counted<BackgroundTask> const & task : m_Tasks) {
        Kernel::ScopedLock const taskLock(task->m_Lock);
        if (std::exchange(task->m_AwaitsEmptyQueue, false)) {
            task->Arm(false);
        }
    }
}

void BackgroundTaskPump::Tick(Kernel::Counted<BackgroundTask> const & task)
{
    {
        Kernel::ScopedLock const lock(task->m_Lock);
        task->m_TimerSet = false;
        if (task->m_DirtyCount <= task->m_CleanUpTo || !task->m_Active || task->m_CommandInFlight) {
            return;
        }
        if (!task->m_WhileQueueOccupied) {
            task->m_AwaitsEmptyQueue = true;
        }
    }
    // Asked with the wish already entered: a queue that runs empty from here on takes it up.
    if (!task->m_WhileQueueOccupied && m_Controller.m_Queue->IsOccupied()) {
        return;
    }
    {
        Kernel::ScopedLock const lock(task->m_Lock);
        if (!task->m_WhileQueueOccupied && !std::exchange(task->m_AwaitsEmptyQueue, false)) {
            return;
        }
        task->m_CommandInFlight = true;
        task->m_LastCommand = Kernel::Clock::Get().Steady();
    }
    Kernel::Counted<DomainCommand> command = task->GenerateCommand();
    if (!command || !m_Controller.m_Queue->EnqueueForTask(std::move(command), task)) {
        CommandEnded(task);
    }
}

void BackgroundTaskPump::CommandTaken(BackgroundTask & task)
{
    Kernel::ScopedLock const lock(task.m_Lock);
    task.m_TakenAt = task.m_DirtyCount;
    task.m_CommandTaken = true;
}

void BackgroundTaskPump::CommandEnded(Kernel::Counted<BackgroundTask> const & task)
{
    Kernel::ScopedLock const lock(task->m_Lock);
    task->m_CommandInFlight = false;
    task->m_CommandTaken = false;
    task->Arm(true);
}
