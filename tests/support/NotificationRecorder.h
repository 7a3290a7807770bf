#pragma once

#include "framework/kernel/BroadcastNotification.h"

#include <mutex>
#include <string>
#include <vector>

/// Hears every notification of the process while it lives, in the order of posting, and keeps them.
class NotificationRecorder final : public BroadcastNotificationSink
{
public:
    NotificationRecorder();
    ~NotificationRecorder() override;

    void Notify(Kernel::Counted<Kernel::Notification> notification) override;

    /// Forgets what came so far, once all is at rest.
    void Clear();

    /// The class names of what came so far, once all is at rest; those of the book family without their namespace, such
    /// as "BookChangedNotification".
    [[nodiscard]] std::vector<std::string> Names();
    /// The same for the notifications of the book family alone, without those in `except`.
    [[nodiscard]] std::vector<std::string> BookNames(std::vector<std::string> const & except = {});

    /// All of one class, in order, once all is at rest.
    template <typename T>
    [[nodiscard]] std::vector<Kernel::Counted<T>> All()
    {
        std::vector<Kernel::Counted<T>> found;
        for (Kernel::Counted<Kernel::Notification> const & notification : Rested()) {
            if (auto const match = Kernel::CountedCast<T>(notification)) {
                found.push_back(match);
            }
        }
        return found;
    }

private:
    [[nodiscard]] std::vector<Kernel::Counted<Kernel::Notification>> Rested();

    std::mutex m_Lock;
    std::vector<Kernel::Counted<Kernel::Notification>> m_Notifications;
};
