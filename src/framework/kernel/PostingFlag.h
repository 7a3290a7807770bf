#pragma once

#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"

#include <cstdint>
#include <utility>
#include <vector>

namespace Kernel
{

/// A flag that stays set for the notifications that were posted while it was set, also when they are delivered later.
///
/// A command raises it around work whose notifications must not start the same work again. Delivery runs behind, so that
/// the plain value would be clear by then, and the work would start itself for ever. Safe on any thread.
class PostingFlag
{
public:
    void Set(bool value);

    /// Inside a delivery: the notification being delivered was posted while the flag was set. Elsewhere: it is set now.
    [[nodiscard]] bool IsSet() const;

private:
    [[nodiscard]] bool WasSetAt(std::uint64_t posting) const KORVANE_REQUIRES(m_Lock);

    CriticalSection m_Lock;
    bool m_Value KORVANE_GUARDED_BY(m_Lock) = false;
    /// Last posting before the flag was set, last posting before it was cleared: while it is set, the last pair is open.
    std::vector<std::pair<std::uint64_t, std::uint64_t>> m_Periods KORVANE_GUARDED_BY(m_Lock);
};

}
