#include "framework/kernel/BroadcastNotification.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/Assert.h"
#include "framework/kernel/Schedulable.h"
#include "framework/kernel/Scheduler.h"
#include "framework/kernel/TurnSession.h"

#include <algorithm>
#include <atomic>
#include <condition_variable>
#include <deque>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>

namespace
{

thread_local std::uint64_t lineOfThread = 0;
thread_local Kernel::Notification const * deliveryOfThread = nullptr;

}

/// The lines of all sinks. The hub's lock is held while a posting joins the lines, so that all get one order; lock order:
/// the hub's, then a line's. No sink and no function runs under either.
class BroadcastNotification::Hub
{
public:
    class Line;

    /// Never destroyed: threads of the pool may outlive the program's static objects.
    static Hub & Get()
    {
        static Hub * const hub = new Hub;
        return *hub;
    }

    void Register(BroadcastNotificationSink * sink);
    void Unregister(BroadcastNotificationSink * sink);
    void Post(Kernel::Counted<Kernel::Notification> const * notifications, std::size_t count);
    void RunOnLine(std::uint64_t id, std::function<void()> function);
    std::uint64_t LastPostingNumber() const { return m_Last.load(std::memory_order_acquire); }
    std::uint64_t DeliveredUpTo();

    /// A notification that wants to know when it has passed all lines: they share this, and the last one tells it.
    struct Passing
    {
        explicit Passing(Kernel::Counted<Kernel::Notification> notification) : m_Notification(std::move(notification)) {}
        ~Passing() { m_Notification->OnPassedEveryLine(); }
        Passing(Passing const &) = delete;
        Passing & operator=(Passing const &) = delete;

        Kernel::Counted<Kernel::Notification> const m_Notification;
    };

    /// What a line delivers: a notification, in one of two forms, or a function.
    struct Item
    {
        [[nodiscard]] Kernel::Counted<Kernel::Notification> const & GetNotification() const
        {
            return m_Passing ? m_Passing->m_Notification : m_Notification;
        }

        Kernel::Counted<Kernel::Notification> m_Notification;
        std::shared_ptr<Passing> m_Passing;
        std::function<void()> m_Function;
        std::uint64_t m_Number = 0;
    };

private:
    std::mutex m_Lock;
    std::vector<Kernel::Counted<Line>> m_Lines;
    std::uint64_t m_LastLine = 0;
    std::atomic<std::uint64_t> m_Last{0};
};

class BroadcastNotification::Hub::Line final : public Kernel::Schedulable
{
public:
    Line(BroadcastNotificationSink * sink, std::uint64_t id) : m_Sink(sink), m_Id(id) {}

    [[nodiscard]] BroadcastNotificationSink * GetSink() const { return m_Sink; }
    [[nodiscard]] std::uint64_t GetId() const { return m_Id; }

    void Append(Item item)
    {
        Kernel::Activity::Begin();
        {
            std::lock_guard const lock(m_Lock);
            m_Items.push_back(std::move(item));
            if (std::exchange(m_Scheduled, true)) {
                return;
            }
        }
        Kernel::Scheduler::GiveTurn(this);
    }

    void Fire(int budget) override
    {
        for (int done = 0;; ++done) {
            Item item;
            {
                std::unique_lock lock(m_Lock);
                m_Delivering = std::thread::id();
                m_Delivered.notify_all();
                if (m_Closed || m_Items.empty()) {
                    m_Scheduled = false;
                    return;
                }
                if (done == budget) {
                    lock.unlock();
                    Kernel::Scheduler::GiveTurn(this);
                    return;
                }
                item = std::move(m_Items.front());
                m_Items.pop_front();
                m_Delivering = std::this_thread::get_id();
                m_InDelivery = item.m_Number;
            }
            Deliver(item);
            Kernel::Activity::End();
        }
    }

    /// Returns when the sink is not being called any more, unless the caller is inside that call.
    void Close()
    {
        std::deque<Item> dropped;
        {
            std::unique_lock lock(m_Lock);
            m_Closed = true;
            dropped.swap(m_Items);
            m_Delivered.wait(lock, [this] {
                return m_Delivering == std::thread::id() || m_Delivering == std::this_thread::get_id();
            });
        }
        for (Item & item : dropped) {
            item = Item();
            Kernel::Activity::End();
        }
    }

    /// Everything that joined up to this number has been delivered; the largest number if nothing is left.
    [[nodiscard]] std::uint64_t DeliveredUpTo()
    {
        std::lock_guard const lock(m_Lock);
        if (m_Delivering != std::thread::id() && m_InDelivery != 0) {
            return m_InDelivery - 1;
        }
        for (Item const & item : m_Items) {
            if (item.m_Number != 0) {
                return item.m_Number - 1;
            }
        }
        return UINT64_MAX;
    }

private:
    void Deliver(Item & item)
    {
        Kernel::TurnSession const session;
        lineOfThread = m_Id;
        deliveryOfThread = item.GetNotification().Get();
        if (item.m_Function) {
            item.m_Function();
        } else {
            m_Sink->Notify(item.GetNotification());
        }
        deliveryOfThread = nullptr;
        item = Item();
        lineOfThread = 0;
    }

    BroadcastNotificationSink * const m_Sink;
    std::uint64_t const m_Id;
    std::mutex m_Lock;
    std::condition_variable m_Delivered;
    std::deque<Item> m_Items;
    bool m_Scheduled = false;
    bool m_Closed = false;
    /// The thread that is calling the sink, and what with.
    std::thread::id m_Delivering;
    std::uint64_t m_InDelivery = 0;
};

void BroadcastNotification::Hub::Register(BroadcastNotificationSink * sink)
{
    std::lock_guard const lock(m_Lock);
    for (Kernel::Counted<Line> const & line : m_Lines) {
        KORVANE_ASSERT_MESSAGE(line->GetSink() != sink, "a sink is registered twice");
    }
    m_Lines.push_back(Kernel::MakeCounted<Line>(sink, ++m_LastLine));
}

void BroadcastNotification::Hub::Unregister(BroadcastNotificationSink * sink)
{
    Kernel::Counted<Line> line;
    {
        std::lock_guard const lock(m_Lock);
        auto const found = std::find_if(m_Lines.begin(), m_Lines.end(),
                                        [&](Kernel::Counted<Line> const & each) { return each->GetSink() == sink; });
        if (found == m_Lines.end()) {
            return;
        }
        line = *found;
        m_Lines.erase(found);
    }
    line->Close();
}

void BroadcastNotification::Hub::Post(Kernel::Counted<Kernel::Notification> const * notifications, std::size_t count)
{
    std::lock_guard const lock(m_Lock);
    for (std::size_t index = 0; index < count; ++index) {
        Kernel::Counted<Kernel::Notification> const & notification = notifications[index];
        if (!notification) {
            continue;
        }
        notification->m_PostingNumber.store(m_Last.fetch_add(1, std::memory_order_acq_rel) + 1,
                                            std::memory_order_release);
        Item item{notification, nullptr, nullptr, notification->GetPostingNumber()};
        if (notification->m_TellWhenPassed) {
            item.m_Passing = std::make_shared<Passing>(std::move(item.m_Notification));
            if (m_Lines.empty()) {
                Kernel::Activity::Begin();
                Kernel::Scheduler::Run([passing = std::move(item.m_Passing)]() mutable {
                    passing.reset();
                    Kernel::Activity::End();
                });
            }
        }
        // The last line gets the item itself, so that it is never this thread that lets go of it last.
        for (std::size_t line = 0; line < m_Lines.size(); ++line) {
            m_Lines[line]->Append(line + 1 < m_Lines.size() ? item : std::move(item));
        }
    }
}

void BroadcastNotification::Hub::RunOnLine(std::uint64_t id, std::function<void()> function)
{
    if (id == 0) {
        Kernel::Activity::Begin();
        Kernel::Scheduler::Run([run = std::move(function)] {
            run();
            Kernel::Activity::End();
        });
        return;
    }
    std::lock_guard const lock(m_Lock);
    for (Kernel::Counted<Line> const & line : m_Lines) {
        if (line->GetId() == id) {
            line->Append({nullptr, nullptr, std::move(function), 0});
        }
    }
}

std::uint64_t BroadcastNotification::Hub::DeliveredUpTo()
{
    std::lock_guard const lock(m_Lock);
    std::uint64_t upTo = m_Last.load(std::memory_order_acquire);
    for (Kernel::Counted<Line> const & line : m_Lines) {
        upTo = std::min(upTo, line->DeliveredUpTo());
    }
    return upTo;
}

void BroadcastNotification::RegisterBroadcastSink(BroadcastNotificationSink * sink)
{
    Hub::Get().Register(sink);
}

void BroadcastNotification::UnregisterBroadcastSink(BroadcastNotificationSink * sink)
{
    Hub::Get().Unregister(sink);
}

void BroadcastNotification::Post(Kernel::Counted<Kernel::Notification> notification)
{
    Hub::Get().Post(&notification, 1);
}

void BroadcastNotification::Post(std::vector<Kernel::Counted<Kernel::Notification>> const & notifications)
{
    Hub::Get().Post(notifications.data(), notifications.size());
}

std::uint64_t BroadcastNotification::CurrentLine()
{
    return lineOfThread;
}

void BroadcastNotification::RunOnLine(std::uint64_t line, std::function<void()> function)
{
    Hub::Get().RunOnLine(line, std::move(function));
}

std::uint64_t BroadcastNotification::LastPostingNumber()
{
    return Hub::Get().LastPostingNumber();
}

Kernel::NonCounted<Kernel::Notification const> BroadcastNotification::CurrentDelivery()
{
    return deliveryOfThread;
}

std::uint64_t BroadcastNotification::DeliveredUpTo()
{
    return Hub::Get().DeliveredUpTo();
}
