#include "framework/kernel/DomainQueue.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/BackgroundTaskPump.h"
#include "framework/kernel/BroadcastNotification.h"
#include "framework/kernel/DomainBackgroundTaskCommand.h"
#include "framework/kernel/DomainController.h"
#include "framework/kernel/QuestionState.h"
#include "framework/kernel/Scheduler.h"

#include <algorithm>
#include <iterator>
#include <utility>

using Kernel::Counted;
using Kernel::ThreadNode;
using Kernel::WaitGraph;

bool DomainQueue::Enqueue(Counted<DomainCommand> command)
{
    if (!m_Controller.CanEnqueueCommand(command)) {
        return false;
    }
    std::vector<Entry> dropped;
    bool schedule = false;
    {
        std::lock_guard const lock(m_Lock);
        if (m_Disabled) {
            return false;
        }
        Append({std::move(command), {}, {}}, dropped);
        schedule = ScheduleIfIdle();
    }
    if (schedule) {
        Kernel::Scheduler::GiveTurn(&m_Controller);
    }
    return true;
}

bool DomainQueue::EnqueueForTask(Counted<DomainCommand> command, Counted<BackgroundTask> task)
{
    if (!m_Controller.CanEnqueueCommand(command)) {
        return false;
    }
    std::vector<Entry> dropped;
    bool schedule = false;
    {
        std::lock_guard const lock(m_Lock);
        if (m_Disabled) {
            return false;
        }
        Entry entry{std::move(command), {}, {}};
        entry.m_Tasks.push_back(std::move(task));
        Append(std::move(entry), dropped);
        schedule = ScheduleIfIdle();
    }
    if (schedule) {
        Kernel::Scheduler::GiveTurn(&m_Controller);
    }
    return true;
}

bool DomainQueue::EnqueueAndWait(Counted<DomainCommand> command)
{
    return m_Controller.CanEnqueueCommand(command) && Wait({std::move(command), {}, {}});
}

void DomainQueue::WaitUntilEmpty()
{
    Wait({});
}

bool DomainQueue::Wait(Entry entry)
{
    std::shared_ptr<ThreadNode> const & thread = ThreadNode::Current();
    Waiter waiter{thread, {}};
    std::vector<Entry> dropped;
    std::unique_lock lock(m_Lock);
    bool const fence = !entry.m_Command;
    if (fence ? m_State == State::Idle : m_Disabled.load()) {
        return fence;
    }
    if (m_State != State::Working) {
        // Nobody is at it: quicker than waking a thread of the pool, and one thread fewer that waits.
        m_State = State::Working;
        m_Worker.store(thread.get(), std::memory_order_release);
        entry.m_Waiters.push_back(&waiter);
        Append(std::move(entry), dropped);
        lock.unlock();
        dropped.clear();
        Work(0, &waiter.m_Signal.m_Given);
        return true;
    }
    if (!WaitGraph::WaitForWorker(*thread, m_Worker)) {
        lock.unlock();
        if (!fence) {
            Kernel::Activity::Begin();
            m_Controller.PerformCommand(std::move(entry.m_Command));
            Kernel::Activity::End();
        }
        return true;
    }
    entry.m_Waiters.push_back(&waiter);
    Append(std::move(entry), dropped);
    lock.unlock();
    dropped.clear();
    thread->Sleep(waiter.m_Signal);
    thread->AwaitLentLocks();
    return true;
}

void DomainQueue::Append(Entry entry, std::vector<Entry> & dropped)
{
    Kernel::Activity::Begin();
    if (entry.m_Command && entry.m_Command->AvoidMultipleInQueue()) {
        // Not past a fence: who waits there waits for the callbacks of what stands before it.
        for (std::size_t index = m_Entries.size(); index-- > 0 && m_Entries[index].m_Command;) {
            if (entry.m_Command->IsAnotherAlreadyInQueue(m_Entries[index].m_Command)) {
                Join(m_Entries[index], entry, entry);
                dropped.push_back(std::move(m_Entries[index]));
                m_Entries.erase(m_Entries.begin() + static_cast<std::ptrdiff_t>(index));
                Kernel::Activity::End();
            }
        }
    }
    m_Entries.push_back(std::move(entry));
}

void DomainQueue::Join(Entry & earlier, Entry & later, Entry & survivor)
{
    std::vector<std::function<void()>> callbacks = earlier.m_Command->TakeCompletionCallbacks();
    for (std::function<void()> & callback : later.m_Command->TakeCompletionCallbacks()) {
        callbacks.push_back(std::move(callback));
    }
    survivor.m_Command->AddCompletionCallbacks(std::move(callbacks));
    Entry & folded = &survivor == &later ? earlier : later;
    for (Waiter * const waiter : std::exchange(folded.m_Waiters, {})) {
        survivor.m_Waiters.push_back(waiter);
    }
    for (Counted<BackgroundTask> & task : std::exchange(folded.m_Tasks, {})) {
        survivor.m_Tasks.push_back(std::move(task));
    }
}

bool DomainQueue::ScheduleIfIdle()
{
    if (m_State != State::Idle) {
        return false;
    }
    m_State = State::Scheduled;
    return true;
}

bool DomainQueue::AddQuestion(std::weak_ptr<Kernel::Question::State> question)
{
    std::lock_guard const lock(m_Lock);
    if (m_Disabled) {
        return false;
    }
    std::erase_if(m_Questions, [](std::weak_ptr<Kernel::Question::State> const & each) {
        std::shared_ptr<Kernel::Question::State> const state = each.lock();
        return !state || state->IsAnswered();
    });
    m_Questions.push_back(std::move(question));
    return true;
}

bool DomainQueue::Disable(Counted<DomainCommand> last)
{
    std::vector<std::weak_ptr<Kernel::Question::State>> questions;
    {
        std::lock_guard const lock(m_Lock);
        if (m_HasLast && last) {
            return false;
        }
        questions.swap(m_Questions);
    }
    // Their answers are turns of this queue: before it refuses them.
    for (std::weak_ptr<Kernel::Question::State> const & question : questions) {
        if (std::shared_ptr<Kernel::Question::State> const state = question.lock()) {
            state->Answer(nullptr);
        }
    }
    std::vector<Entry> dropped;
    std::vector<Entry> repeats;
    bool schedule = false;
    {
        std::lock_guard const lock(m_Lock);
        if (last && std::exchange(m_HasLast, true)) {
            return false;
        }
        m_Disabled = true;
        questions.swap(m_Questions);
        for (std::size_t index = 0; index < m_Entries.size();) {
            // One that somebody waits for is not just a matter of the background.
            if (!m_Entries[index].m_Tasks.empty() && m_Entries[index].m_Waiters.empty()) {
                dropped.push_back(std::move(m_Entries[index]));
                m_Entries.erase(m_Entries.begin() + static_cast<std::ptrdiff_t>(index));
            } else {
                ++index;
            }
        }
        if (last) {
            Append({std::move(last), {}, {}}, repeats);
            schedule = ScheduleIfIdle();
        }
    }
    for (std::weak_ptr<Kernel::Question::State> const & question : questions) {
        if (std::shared_ptr<Kernel::Question::State> const state = question.lock()) {
            state->Answer(nullptr);
        }
    }
    for (Entry & entry : dropped) {
        for (std::function<void()> const & callback : entry.m_Command->TakeCompletionCallbacks()) {
            callback();
        }
        End(std::move(entry));
    }
    if (schedule) {
        Kernel::Scheduler::GiveTurn(&m_Controller);
    }
    return true;
}

bool DomainQueue::IsOccupied()
{
    std::lock_guard const lock(m_Lock);
    return m_State != State::Idle;
}

bool DomainQueue::HasMore()
{
    std::lock_guard const lock(m_Lock);
    return !m_Entries.empty();
}

void DomainQueue::Fire(int budget)
{
    {
        std::lock_guard const lock(m_Lock);
        // A thread that waits may have taken the turn meanwhile.
        if (m_State != State::Scheduled) {
            return;
        }
        m_State = State::Working;
        m_Worker.store(ThreadNode::CurrentPointer(), std::memory_order_release);
    }
    Work(budget, nullptr);
}

void DomainQueue::Work(int budget, bool const * until)
{
    Counted<DomainController> const keep(&m_Controller);
    m_Controller.PreProcessCommandQueue();
    for (int done = 0; until ? !*until : done < budget; ++done) {
        Entry fence;
        bool isFence = false;
        {
            std::lock_guard const lock(m_Lock);
            if (m_Entries.empty()) {
                break;
            }
            if (!m_Entries.front().m_Command) {
                isFence = true;
                fence = std::move(m_Entries.front());
                m_Entries.pop_front();
            }
        }
        if (isFence) {
            End(std::move(fence));
            continue;
        }
        std::vector<Counted<Kernel::Notification>> notifications;
        Counted<DomainCommand> const command = m_Controller.PreMergeAndDequeueCommand(notifications);
        if (!notifications.empty()) {
            BroadcastNotification::Post(notifications);
        }
        if (command) {
            Run(std::exchange(m_Taken, {}));
        }
    }
    m_Controller.PostProcessCommandQueue();
    bool more = false;
    {
        std::lock_guard const lock(m_Lock);
        more = !m_Entries.empty();
        m_Worker.store(nullptr, std::memory_order_release);
        m_State = more ? State::Scheduled : State::Idle;
    }
    if (more) {
        Kernel::Scheduler::GiveTurn(keep);
    } else {
        m_Controller.m_Pump->QueueRanEmpty();
    }
}

Counted<DomainCommand> DomainQueue::TakeNext()
{
    Entry entry;
    Counted<DomainCommand> next;
    {
        std::lock_guard const lock(m_Lock);
        if (m_Entries.empty() || !m_Entries.front().m_Command) {
            return nullptr;
        }
        entry = std::move(m_Entries.front());
        m_Entries.pop_front();
        if (!m_Entries.empty()) {
            next = m_Entries.front().m_Command;
        }
    }
    while (next && entry.m_Command->CanMerge(next)) {
        Entry folded;
        {
            std::lock_guard const lock(m_Lock);
            if (m_Entries.empty() || !(m_Entries.front().m_Command == next)) {
                break;
            }
            folded = std::move(m_Entries.front());
            m_Entries.pop_front();
            next = m_Entries.empty() ? nullptr : m_Entries.front().m_Command;
        }
        entry.m_Command->Merge(folded.m_Command);
        Join(entry, folded, entry);
        Kernel::Activity::End();
    }
    m_Taken = std::move(entry);
    return m_Taken.m_Command;
}

void DomainQueue::Run(Entry entry)
{
    bool skip = false;
    for (Counted<BackgroundTask> const & task : entry.m_Tasks) {
        BackgroundTaskPump::CommandTaken(*task);
    }
    if (!entry.m_Tasks.empty() && entry.m_Waiters.empty()) {
        auto const * const background = dynamic_cast<DomainBackgroundTaskCommand const *>(entry.m_Command.Get());
        skip = background && background->CanIgnoreIfQueueOccupied() && HasMore();
    }
    if (skip) {
        for (std::function<void()> const & callback : entry.m_Command->TakeCompletionCallbacks()) {
            callback();
        }
    } else {
        m_Controller.PerformCommand(entry.m_Command);
    }
    End(std::move(entry));
}

void DomainQueue::End(Entry entry)
{
    entry.m_Command.Reset();
    for (Counted<BackgroundTask> const & task : entry.m_Tasks) {
        m_Controller.m_Pump->CommandEnded(task);
    }
    for (Waiter * const waiter : entry.m_Waiters) {
        std::shared_ptr<ThreadNode> const thread = waiter->m_Thread;
        if (thread.get() != ThreadNode::CurrentPointer()) {
            WaitGraph::EndWait(*thread);
        }
        thread->Give(waiter->m_Signal);
    }
    Kernel::Activity::End();
}
