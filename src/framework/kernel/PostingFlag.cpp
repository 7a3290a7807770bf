#include "framework/kernel/PostingFlag.h"

#include "framework/kernel/BroadcastNotification.h"

#include <algorithm>

namespace Kernel
{

void PostingFlag::Set(bool value)
{
    std::uint64_t const delivered = BroadcastNotification::DeliveredUpTo();
    ScopedLock const lock(m_Lock);
    if (value == m_Value) {
        return;
    }
    m_Value = value;
    std::uint64_t const last = BroadcastNotification::LastPostingNumber();
    if (!value) {
        m_Periods.back().second = last;
        return;
    }
    std::erase_if(m_Periods, [&](auto const & period) { return period.second <= delivered; });
    m_Periods.emplace_back(last, UINT64_MAX);
}

bool PostingFlag::IsSet() const
{
    NonCounted<Notification const> const delivery = BroadcastNotification::CurrentDelivery();
    ScopedLock const lock(m_Lock);
    return delivery ? WasSetAt(delivery->GetPostingNumber()) : m_Value;
}

bool PostingFlag::WasSetAt(std::uint64_t posting) const
{
    return std::any_of(m_Periods.begin(), m_Periods.end(),
                       [&](auto const & period) { return period.first < posting && posting <= period.second; });
}

}
