#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Notification.h"

#include <cstdint>
#include <functional>
#include <vector>

/// Receives every notification of the process from the moment that it is registered.
///
/// `Notify` is called for one notification at a time and in the order of posting, on a thread that works no queue
/// meanwhile. It must not wait for a queue; it may wait for a domain's lock, which delays no other sink.
class BroadcastNotificationSink
{
public:
    virtual void Notify(Kernel::Counted<Kernel::Notification> notification) = 0;

protected:
    virtual ~BroadcastNotificationSink() = default;
};

/// The hub of all notifications. Each registered sink has a line of its own: what is posted joins every line in one
/// order, and each line delivers at its own pace. A line takes a thread of the pool only while it has something to
/// deliver. All operations are safe on any thread, and none delivers on the thread of its caller.
class BroadcastNotification
{
public:
    /// The sink is not owned and must stay until it is unregistered. Registering it twice is a mistake.
    static void RegisterBroadcastSink(BroadcastNotificationSink * sink);

    /// On return the sink is not being called and never will be again; what its line still held is dropped, with the
    /// functions that it had been left (`RunOnLine`). From inside the sink's own `Notify` it returns at once.
    static void UnregisterBroadcastSink(BroadcastNotificationSink * sink);

    /// Posts one notification to all lines and gives it its posting number. Never waits for delivery.
    static void Post(Kernel::Counted<Kernel::Notification> notification);
    /// Posts a batch in its order; nothing of another thread comes in between.
    static void Post(std::vector<Kernel::Counted<Kernel::Notification>> const & notifications);

    /// Names the line that is delivering on the calling thread, for `RunOnLine`; 0 outside of a delivery.
    [[nodiscard]] static std::uint64_t CurrentLine();
    /// Runs a function on a line, behind all that was posted before; on a thread of its own for line 0. Dropped if the
    /// line's sink has gone.
    static void RunOnLine(std::uint64_t line, std::function<void()> function);

    /// The number that the last posting of the process got; 0 before the first.
    [[nodiscard]] static std::uint64_t LastPostingNumber();
    /// The notification that is being delivered on the calling thread; null outside of a delivery.
    [[nodiscard]] static Kernel::NonCounted<Kernel::Notification const> CurrentDelivery();
    /// Every notification up to this number has passed all lines.
    [[nodiscard]] static std::uint64_t DeliveredUpTo();

    class Hub;
};
