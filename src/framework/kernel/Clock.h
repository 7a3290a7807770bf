#pragma once

#include "framework/kernel/TimeStamp.h"

#include <atomic>
#include <chrono>
#include <cstdint>

namespace Kernel
{

/// Where the program gets its time from: everything that stamps, measures intervals or waits for a moment asks here, so
/// that a test can hold time still and move it on. Waiting for another thread is not a matter of this clock.
class Clock
{
public:
    virtual ~Clock() = default;

    /// The calendar's time.
    [[nodiscard]] virtual TimeStamp Now() const = 0;
    /// Time that never goes back, from an arbitrary start, in nanoseconds.
    [[nodiscard]] virtual std::chrono::nanoseconds Steady() const = 0;

    /// The clock in use; the system's unless a test has put its own in.
    [[nodiscard]] static Clock & Get();
    /// Puts another clock in; null brings the system's back. The clock must outlive its use.
    static void Set(Clock * clock);
};

/// A clock that stands until it is moved. Safe on any thread.
class ManualClock : public Clock
{
public:
    explicit ManualClock(TimeStamp now) : m_Start(now) {}

    [[nodiscard]] TimeStamp Now() const override { return TimeStamp(m_Start.Nanoseconds() + m_Passed.load()); }
    [[nodiscard]] std::chrono::nanoseconds Steady() const override { return std::chrono::nanoseconds(m_Passed.load()); }
    void Advance(std::chrono::nanoseconds step) { m_Passed += step.count(); }

private:
    TimeStamp const m_Start;
    std::atomic<std::int64_t> m_Passed{0};
};

}
