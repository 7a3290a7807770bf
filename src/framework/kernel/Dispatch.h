#pragma once

#include <functional>

namespace Kernel
{

/// Splits work over the machine's processors.
class Dispatch
{
public:
    enum class DispatchPriority
    {
        Low = 0,
        Normal = 1,
        High = 2,
    };
    /// What the threads are for. It names them in a debugger.
    enum class ThreadPurpose
    {
        General = 0,
        Rendering = 1,
        Composing = 2,
        Files = 3,
    };

    /// Calls `work(context, index)` once for each index below `count`, on the calling thread and on helpers, and
    /// returns when all calls have. The order is not told. An exception from a call stops the handing out of further
    /// indexes and is thrown on here, after the running calls have ended. Calls may dispatch in turn: the inner one
    /// then finds its helpers busy and does more of its work itself. `Low` work gets no helpers while other work has
    /// them.
    static void DispatchParallelFor(void (*work)(void * context, unsigned long long index), unsigned long long count,
                                    void * context, DispatchPriority priority, ThreadPurpose purpose);

    /// The same with a function object and normal priority.
    static void ParallelFor(unsigned long long count, std::function<void(unsigned long long index)> const & work);

    /// Processors that this process may run on; at least 1.
    [[nodiscard]] static int GetNumberOfRealCPUs();

    /// Threads that one dispatch uses, the caller's included; 0, the default, means one for each processor. 1 makes
    /// every dispatch run on its caller's thread, in order.
    static void SetThreadLimit(int threads);
};

}
