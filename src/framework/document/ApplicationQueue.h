#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Schedulable.h"
#include "framework/kernel/VantraCommand.h"

#include <deque>
#include <mutex>

/// The queue of the application's commands, in order, one at a time, under no lock. Safe on any thread.
class ApplicationQueue : public Kernel::Schedulable
{
public:
    void Enqueue(Kernel::Counted<VantraCommand> command);
    void Fire(int budget) override;

    /// Runs one to its end on the calling thread: do, notify, post, callbacks. What it throws is posted as a
    /// `CommandFailedNotification`.
    static void Run(VantraCommand & command);

    /// The calling thread is running a command of this queue.
    [[nodiscard]] static bool IsOnQueue();

private:
    std::mutex m_Lock;
    std::deque<Kernel::Counted<VantraCommand>> m_Commands;
    bool m_Scheduled = false;
};
