#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"

#include <chrono>
#include <cstdint>

class DomainCommand;
class DomainController;

/// A source of commands that a domain runs by itself while there is something to catch up with.
///
/// Clean until `Dirty`. While it is dirty, the domain's pump asks it for a command once an interval, one at a time,
/// until `Clean`. All operations but `GenerateCommand` are safe on any thread.
class BackgroundTask : public virtual Kernel::Countable
{
public:
    /// \param interval milliseconds from getting dirty to the first command, and between two commands
    /// \param whileQueueOccupied also enqueues when other commands stand in the queue; otherwise it lets them go first
    /// \param gathersChanges getting dirty starts the interval, so that a burst of changes costs one command; with false
    ///        the first command comes at once, and only later ones keep the interval
    BackgroundTask(int interval, bool whileQueueOccupied, bool gathersChanges);
    BackgroundTask(BackgroundTask const & other);

    /// There is work.
    void Dirty();
    /// The work has been done. From inside the task's command it covers only what was dirty when that command was taken
    /// off the queue: what came later still waits.
    void Clean();
    [[nodiscard]] bool IsDirty() const;

    /// The command that does the work, or null for nothing this time. Called by the pump, on a thread of the pool.
    [[nodiscard]] virtual Kernel::Counted<DomainCommand> GenerateCommand() = 0;

    [[nodiscard]] int GetInterval() const { return m_Interval; }
    [[nodiscard]] bool IsWhileQueueOccupied() const { return m_WhileQueueOccupied; }
    [[nodiscard]] bool GathersChanges() const { return m_GathersChanges; }

protected:
    ~BackgroundTask() override;

private:
    friend class DomainController;
    friend class BackgroundTaskPump;

    int const m_Interval;
    bool const m_WhileQueueOccupied;
    bool const m_GathersChanges;

    /// With the lock held: sets the timer if there is work that nobody is at; keeps count of the process's activity.
    /// `later` says that an interval has to pass in any case.
    void Arm(bool later) KORVANE_REQUIRES(m_Lock);

    Kernel::CriticalSection m_Lock;
    /// The domain whose pump it was handed to; not counted, since that one takes itself out when it goes.
    DomainController * m_Controller KORVANE_GUARDED_BY(m_Lock) = nullptr;
    /// The pump runs.
    bool m_Active KORVANE_GUARDED_BY(m_Lock) = false;
    /// Counts calls of `Dirty`; the task is dirty while it is ahead of `m_CleanUpTo`.
    std::uint64_t m_DirtyCount KORVANE_GUARDED_BY(m_Lock) = 0;
    std::uint64_t m_CleanUpTo KORVANE_GUARDED_BY(m_Lock) = 0;
    /// `m_DirtyCount` as the command in flight was taken off the queue.
    std::uint64_t m_TakenAt KORVANE_GUARDED_BY(m_Lock) = 0;
    bool m_CommandInFlight KORVANE_GUARDED_BY(m_Lock) = false;
    bool m_CommandTaken KORVANE_GUARDED_BY(m_Lock) = false;
    bool m_TimerSet KORVANE_GUARDED_BY(m_Lock) = false;
    /// Dirty, and waiting for the queue to run empty.
    bool m_AwaitsEmptyQueue KORVANE_GUARDED_BY(m_Lock) = false;
    bool m_CountedAsActivity KORVANE_GUARDED_BY(m_Lock) = false;
    std::chrono::nanoseconds m_LastCommand KORVANE_GUARDED_BY(m_Lock){INT64_MIN / 2};
};
