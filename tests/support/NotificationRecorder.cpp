#include "support/NotificationRecorder.h"

#include "framework/document/VantraController.h"
#include "support/ClassName.h"

#include <algorithm>
#include <thread>

namespace
{

constexpr std::string_view BookNamespace = "Book::";

}

NotificationRecorder::NotificationRecorder()
{
    BroadcastNotification::RegisterBroadcastSink(this);
}

NotificationRecorder::~NotificationRecorder()
{
    BroadcastNotification::UnregisterBroadcastSink(this);
}

void NotificationRecorder::Notify(Kernel::Counted<Kernel::Notification> notification)
{
    std::lock_guard const lock(m_Lock);
    m_Notifications.push_back(std::move(notification));
}

namespace
{

/// A question that waits for its answer ends the wait for rest early: what was posted by then has to be delivered all
/// the same.
void WaitForDelivery()
{
    VantraController::GetInstance().WaitUntilIdle();
    std::uint64_t const posted = BroadcastNotification::LastPostingNumber();
    while (BroadcastNotification::DeliveredUpTo() < posted) {
        std::this_thread::yield();
    }
}

}

std::vector<Kernel::Counted<Kernel::Notification>> NotificationRecorder::Rested()
{
    WaitForDelivery();
    std::lock_guard const lock(m_Lock);
    return m_Notifications;
}

void NotificationRecorder::Clear()
{
    WaitForDelivery();
    std::lock_guard const lock(m_Lock);
    m_Notifications.clear();
}

std::vector<std::string> NotificationRecorder::Names()
{
    std::vector<std::string> names;
    for (Kernel::Counted<Kernel::Notification> const & notification : Rested()) {
        std::string name = ClassName(*notification);
        names.push_back(name.starts_with(BookNamespace) ? name.substr(BookNamespace.size()) : name);
    }
    return names;
}

std::vector<std::string> NotificationRecorder::BookNames(std::vector<std::string> const & except)
{
    std::vector<std::string> names;
    for (Kernel::Counted<Kernel::Notification> const & notification : Rested()) {
        std::string const name = ClassName(*notification);
        if (!name.starts_with(BookNamespace)) {
            continue;
        }
        std::string const plain = name.substr(BookNamespace.size());
        if (std::find(except.begin(), except.end(), plain) == except.end()) {
            names.push_back(plain);
        }
    }
    return names;
}
