#include "framework/document/ApplicationQueue.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/DomainController.h"
#include "framework/kernel/Scheduler.h"
#include "framework/kernel/TurnSession.h"

#include <exception>
#include <utility>
#include <vector>

namespace
{

thread_local bool onApplicationQueue = false;

}

void ApplicationQueue::Enqueue(Kernel::Counted<VantraCommand> command)
{
    Kernel::Activity::Begin();
    {
        std::lock_guard const lock(m_Lock);
        m_Commands.push_back(std::move(command));
        if (std::exchange(m_Scheduled, true)) {
            return;
        }
    }
    Kernel::Scheduler::GiveTurn(this);
}

void ApplicationQueue::Fire(int budget)
{
    for (int done = 0;; ++done) {
        Kernel::Counted<VantraCommand> command;
        {
            std::lock_guard const lock(m_Lock);
            if (m_Commands.empty()) {
                m_Scheduled = false;
                return;
            }
            if (done == budget) {
                break;
            }
            command = std::move(m_Commands.front());
            m_Commands.pop_front();
        }
        onApplicationQueue = true;
        Run(*command);
        onApplicationQueue = false;
        command.Reset();
        Kernel::Activity::End();
    }
    Kernel::Scheduler::GiveTurn(this);
}

void ApplicationQueue::Run(VantraCommand & command)
{
    Kernel::TurnSession const session;
    std::vector<Kernel::Counted<Kernel::Notification>> notifications;
    try {
        command.Do();
        command.Notify(notifications);
    } catch (std::exception const & exception) {
        notifications.push_back(Kernel::MakeCounted<CommandFailedNotification>(
            nullptr, command.GetDescription().ToString(), String(exception.what())));
    }
    BroadcastNotification::Post(notifications);
    for (std::function<void()> const & callback : command.TakeCompletionCallbacks()) {
        callback();
    }
    command.Teardown();
}

bool ApplicationQueue::IsOnQueue()
{
    return onApplicationQueue;
}
