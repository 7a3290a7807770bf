#include "framework/kernel/Clock.h"

#include <atomic>

namespace Kernel
{

namespace
{

class SystemClock final : public Clock
{
public:
    TimeStamp Now() const override
    {
        auto const now = std::chrono::system_clock::now().time_since_epoch();
        return TimeStamp(std::chrono::duration_cast<std::chrono::nanoseconds>(now).count());
    }
    std::chrono::nanoseconds Steady() const override
    {
        return std::chrono::duration_cast<std::chrono::nanoseconds>(
            std::chrono::steady_clock::now().time_since_epoch());
    }
};

SystemClock & TheSystemClock()
{
    static SystemClock clock;
    return clock;
}

std::atomic<Clock *> s_Clock{nullptr};

}

Clock & Clock::Get()
{
    Clock * const clock = s_Clock.load(std::memory_order_acquire);
    return clock ? *clock : TheSystemClock();
}

void Clock::Set(Clock * clock)
{
    s_Clock.store(clock, std::memory_order_release);
}

}
