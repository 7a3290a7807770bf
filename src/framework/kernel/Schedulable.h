#pragma once

#include "framework/kernel/Countable.h"

namespace Kernel
{

/// Work that the scheduler gives turns on a thread of its pool.
class Schedulable : public virtual Countable
{
public:
    /// One turn. It should do about `budget` pieces of work, then ask for another turn if there are more, so that
    /// others get their turn too. It may block: the pool then runs the others on further threads. It must not throw.
    virtual void Fire(int budget) = 0;
};

}
