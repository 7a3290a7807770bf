#pragma once

#include <compare>
#include <cstdint>

namespace Kernel
{

/// A moment, such as a file's modification time: nanoseconds since 1970-01-01 00:00 UTC. Zero, the default, stands for
/// "not known". Differences of one nanosecond count.
class TimeStamp
{
public:
    constexpr TimeStamp() = default;
    constexpr explicit TimeStamp(std::int64_t nanoseconds) : m_Nanoseconds(nanoseconds) {}

    [[nodiscard]] constexpr std::int64_t Nanoseconds() const { return m_Nanoseconds; }
    [[nodiscard]] constexpr bool IsKnown() const { return m_Nanoseconds != 0; }

    friend constexpr auto operator<=>(TimeStamp const &, TimeStamp const &) = default;

private:
    std::int64_t m_Nanoseconds = 0;
};

}
