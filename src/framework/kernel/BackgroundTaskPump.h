#pragma once

#include "framework/kernel/BackgroundTask.h"
#include "framework/kernel/Counted.h"

#include <chrono>
#include <mutex>
#include <vector>

class DomainController;

/// Turns the dirty tasks of a domain into commands on its queue, on the scheduler's timers. Safe on any thread. Lock
/// order: the pump's, then a task's.
class BackgroundTaskPump
{
public:
    explicit BackgroundTaskPump(DomainController & controller) : m_Controller(controller) {}
    /// No timer is under way, since those keep the domain: lets the tasks go.
    ~BackgroundTaskPump();

    void Add(Kernel::Counted<BackgroundTask> task);
    /// Its three conditions: started, wanted, and not stopped for good.
    void Start();
    void SetWanted(bool wanted);
    void Stop();

    /// The queue has run empty: tasks that let other commands go first have their turn now.
    void QueueRanEmpty();

    /// Of a task of this pump: its timer has come; its command was taken off the queue; its command has ended, or was
    /// dropped.
    void Tick(Kernel::Counted<BackgroundTask> const & task);
    static void CommandTaken(BackgroundTask & task);
    void CommandEnded(Kernel::Counted<BackgroundTask> const & task);

private:
    friend class BackgroundTask;

    void ConditionsChanged();

    DomainController & m_Controller;
    std::mutex m_Lock;
    std::vector<Kernel::Counted<BackgroundTask>> m_Tasks;
    bool m_Started = false;
    bool m_Wanted = false;
    bool m_Stopped = false;
};
