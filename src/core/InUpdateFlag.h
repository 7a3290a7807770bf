#pragma once

#include "framework/kernel/CriticalSection.h"

#include <cstdint>
#include <vector>

namespace Book
{

/// "An update of this kind is running": set by the update on its own thread, read by the dispatch of notifications, so
/// that what an update changes does not start the next one.
///
/// Notifications are delivered after they were posted, by which time the flag may be down again. So the flag also
/// remembers over which posting numbers it stood, and can be asked about a notification by its number.
class InUpdateFlag
{
public:
    /// `postingNumber` is the number that the last notification got that was posted before this call.
    void Set(bool set, std::uint64_t postingNumber);
    [[nodiscard]] bool IsSet() const;

    /// True if the flag stood when the notification with this number was posted. Numbers are asked for in rising order:
    /// stretches that end below one are forgotten.
    [[nodiscard]] bool WasSet(std::uint64_t postingNumber);

private:
    /// The flag stood for the numbers above `m_After` up to and including `m_Last`.
    struct Stretch
    {
        std::uint64_t m_After;
        std::uint64_t m_Last;
    };

    Kernel::CriticalSection m_Lock;
    bool m_Set = false;
    std::uint64_t m_SetAfter = 0;
    std::vector<Stretch> m_Past;
};

}
