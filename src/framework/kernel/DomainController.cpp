#include "framework/kernel/DomainController.h"

#include "framework/kernel/BackgroundTask.h"
#include "framework/kernel/BackgroundTaskPump.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/DomainQueue.h"
#include "framework/kernel/ReaderWriterLock.h"
#include "framework/kernel/TurnSession.h"

#include <chrono>
#include <exception>
#include <map>
#include <typeindex>
#include <utility>

using Kernel::Counted;
using Kernel::Notification;

DomainController::DomainController()
    : m_Lock(std::make_unique<Kernel::ReaderWriterLock>()), m_Queue(std::make_unique<DomainQueue>(*this)),
      m_Pump(std::make_unique<BackgroundTaskPump>(*this))
{
}

DomainController::~DomainController() = default;

void DomainController::Fire(int budget)
{
    m_Queue->Fire(budget);
}

void DomainController::DisableCommandEnqueueAndEmpty()
{
    m_Pump->Stop();
    m_Queue->Disable(nullptr);
}

bool DomainController::EnqueueLastCommand(Counted<DomainCommand> command)
{
    m_Pump->Stop();
    return m_Queue->Disable(std::move(command));
}

bool DomainController::EnqueueCommand(Counted<DomainCommand> command)
{
    return m_Queue->Enqueue(std::move(command));
}

bool DomainController::EnqueueCommandAndWait(Counted<DomainCommand> command)
{
    return m_Queue->EnqueueAndWait(std::move(command));
}

void DomainController::WaitUntilCommandQueueEmpty() const
{
    m_Queue->WaitUntilEmpty();
}

bool DomainController::IsCommandEnqueueDisabled() const
{
    return m_Queue->IsDisabled();
}

bool DomainController::CanEnqueueCommand(Counted<DomainCommand> const &) const
{
    return !m_Queue->IsDisabled();
}

Counted<DomainCommand> DomainController::PreMergeAndDequeueCommand(std::vector<Counted<Notification>> &)
{
    return m_Queue->TakeNext();
}

void DomainController::PerformCommand(Counted<DomainCommand> command)
{
    Kernel::TurnSession const session;
    std::vector<Counted<Notification>> notifications;
    command->PostDequeueWithMutableDomainController(this);
    ImmediatePausePriorToWriterLock();
    m_Lock->AcquireWriter(
        [this](bool & letReadersIn, bool & quiet) { PeriodicWhileAwaitingReaderUnlock(letReadersIn, quiet); });
    ProcessCommand(command, notifications);
    if (!notifications.empty() && !m_SuppressNotifications) {
        SimplifyNotifications(notifications);
        BroadcastNotification::Post(notifications);
    }
    m_Lock->ReleaseWriter();
    ReleaseAfterWriterUnlock(m_Queue->HasMore());
    for (std::function<void()> const & callback : command->TakeCompletionCallbacks()) {
        callback();
    }
}

void DomainController::ProcessCommand(Counted<DomainCommand> command,
                                      std::vector<Counted<Notification>> & notifications)
{
    try {
        command->m_Direction = DomainCommand::Forward;
        command->DoAndUpdateCaches();
        bool const stacked = command->ShouldStackForUndo() && StackForUndo(command);
        command->NotifyWithCacheUpdates(notifications);
        if (!stacked) {
            command->Teardown();
        }
        return;
    } catch (std::exception const & exception) {
        // It may have given the lock up by hand.
        if (!IsWriterLockHeld()) {
            AcquireWriterLock();
        }
        CommandThrew(command, exception.what());
    }
    command->Teardown();
}

bool DomainController::StackForUndo(Counted<DomainCommand> const &)
{
    return false;
}

void DomainController::CommandThrew(Counted<DomainCommand> const & command, char const * what)
{
    BroadcastNotification::Post(Kernel::MakeCounted<CommandFailedNotification>(
        Counted<DomainController const>(this), command->GetDescription().ToString(), String(what)));
}

void DomainController::SimplifyNotifications(std::vector<Counted<Notification>> & notifications)
{
    if (notifications.size() < 2) {
        return;
    }
    std::map<std::pair<std::type_index, int>, bool> seen;
    std::map<std::type_index, std::size_t> lastOfClass;
    std::vector<Counted<Notification>> kept;
    kept.reserve(notifications.size());
    for (Counted<Notification> & notification : notifications) {
        if (!notification) {
            continue;
        }
        Notification const & object = *notification;
        std::type_index const type(typeid(object));
        int const id = notification->GetDedupeId();
        if (id != 0 && !seen.emplace(std::pair(type, id), true).second) {
            continue;
        }
        auto const [last, first] = lastOfClass.emplace(type, kept.size());
        if (!first) {
            if (Counted<Notification> merged = kept[last->second]->Merge(notification)) {
                kept[last->second] = std::move(merged);
                continue;
            }
            last->second = kept.size();
        }
        kept.push_back(std::move(notification));
    }
    notifications.swap(kept);
}

void DomainController::Notify(Counted<Notification> const & notification)
{
    if (!m_SuppressNotifications) {
        BroadcastNotification::Post(notification);
    }
}

void DomainController::SetSuppressNotifications(bool suppress)
{
    m_SuppressNotifications = suppress;
}

void DomainController::ReleaseAfterWriterUnlock(bool) {}

void DomainController::PeriodicWhileAwaitingReaderUnlock(bool &, bool & quiet)
{
    quiet = true;
}

void DomainController::AcquireReaderLock() const
{
    if (m_Lock->AcquireReader()) {
        OnAcquireReaderLock();
    }
}

void DomainController::ReleaseReaderLock() const
{
    if (m_Lock->ReleaseReader()) {
        OnReleaseReaderLock();
    }
}

void DomainController::AcquireWriterLock()
{
    m_Lock->AcquireWriter(nullptr);
}

void DomainController::ReleaseWriterLock()
{
    if (m_Lock->ReleaseWriter()) {
        OnAcquireReaderLock();
    }
}

bool DomainController::IsWriterLockHeld() const
{
    return m_Lock->IsHeldForWriting();
}

bool DomainController::IsWriterWaiting() const
{
    return m_Lock->IsWriterWaiting();
}

bool DomainController::IsReaderWaiting() const
{
    return m_Lock->IsReaderWaiting();
}

void DomainController::StartBackgroundTaskPump()
{
    m_Pump->Start();
}

void DomainController::AddBackgroundTask(Counted<BackgroundTask> task)
{
    m_Pump->Add(std::move(task));
}

void DomainController::SetWantBackgroundTasks(bool want)
{
    m_WantBackgroundTasks = want;
    m_Pump->SetWanted(want);
}

void DomainController::UpdateProgress(Counted<DomainCommand const> command, float fraction)
{
    // Asking for the type changes nothing in a command; it is only not declared so.
    if (!m_CanShowProgress || !command ||
        const_cast<DomainCommand &>(*command).GetProgressType() != DomainCommand::ShowProgress) {
        return;
    }
    std::int64_t const now = Kernel::Clock::Get().Steady().count();
    std::int64_t const interval = std::chrono::nanoseconds(std::chrono::milliseconds(command->GetProgressInterval())).count();
    std::int64_t last = m_LastProgress.load();
    bool const due = now - last >= interval || fraction <= 0 || fraction >= 1;
    if (!due || !m_LastProgress.compare_exchange_strong(last, now)) {
        return;
    }
    BroadcastNotification::Post(Kernel::MakeCounted<CommandProgressNotification>(
        Counted<DomainController const>(this), command->GetDescription().ToString(), fraction,
        command->GetProgressAbortPointer() != nullptr));
}
