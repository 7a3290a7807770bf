#include "core/InUpdateFlag.h"

#include <algorithm>

namespace Book
{

void InUpdateFlag::Set(bool set, std::uint64_t postingNumber)
{
    Kernel::ScopedLock const lock(m_Lock);
    if (set == m_Set) {
        return;
    }
    m_Set = set;
    if (set) {
        m_SetAfter = postingNumber;
    } else if (postingNumber > m_SetAfter) {
        m_Past.push_back({m_SetAfter, postingNumber});
    }
}

bool InUpdateFlag::IsSet() const
{
    Kernel::ScopedLock const lock(m_Lock);
    return m_Set;
}

bool InUpdateFlag::WasSet(std::uint64_t postingNumber)
{
    Kernel::ScopedLock const lock(m_Lock);
    std::erase_if(m_Past, [postingNumber](const Stretch & stretch) { return stretch.m_Last < postingNumber; });
    return (m_Set && postingNumber > m_SetAfter) ||
           std::any_of(m_Past.begin(), m_Past.end(), [postingNumber](const Stretch & stretch) {
               return stretch.m_After < postingNumber && postingNumber <= stretch.m_Last;
           });
}

}
