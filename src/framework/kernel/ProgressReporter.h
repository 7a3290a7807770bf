#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ThreadSafety.h"

namespace Kernel
{

class Progress;

/// Makes one value of how several pieces of work stand, for the `Progress` that it is attached to.
class ProgressReporter : public virtual Countable
{
public:
    /// How much of the whole is done, from 0 to 1.
    [[nodiscard]] virtual double GetProgress() const = 0;

protected:
    /// The value has changed: tells the progress object, if there is one. Without locks held.
    void Changed() const;

private:
    friend class Progress;

    void SetOwner(Progress * owner);

    /// Not counted: the progress object owns the reporter, and takes itself out when it goes.
    CriticalSection m_OwnerLock;
    Progress * m_Owner KORVANE_GUARDED_BY(m_OwnerLock) = nullptr;
};

}
