#include "framework/kernel/Trace.h"

#include "framework/kernel/CriticalSection.h"

#include <atomic>
#include <cstdio>
#include <cstdlib>

namespace Kernel
{

namespace
{

struct TraceTarget
{
    CriticalSection m_Lock;
    std::function<void(String const &)> m_Target KORVANE_GUARDED_BY(m_Lock);
    std::atomic<bool> m_HasTarget{false};
    bool const m_ToStandardError = std::getenv("KORVANE_TRACE") != nullptr;
};

/// Never destroyed: pool threads may write a last line while the program ends.
TraceTarget & Target()
{
    static TraceTarget * const target = new TraceTarget;
    return *target;
}

}

bool IsTraceOn()
{
    TraceTarget const & target = Target();
    return target.m_ToStandardError || target.m_HasTarget.load(std::memory_order_acquire);
}

void Trace(String const & line)
{
    if (!IsTraceOn()) {
        return;
    }
    TraceTarget & target = Target();
    ScopedLock lock(target.m_Lock);
    if (target.m_Target) {
        target.m_Target(line);
    } else if (target.m_ToStandardError) {
        bool const ended = !line.Empty() && line.View().back() == '\n';
        std::fprintf(stderr, ended ? "%s" : "%s\n", line.c_str());
    }
}

void Trace(char const * line)
{
    if (IsTraceOn()) {
        Trace(String(line));
    }
}

void SetTraceTarget(std::function<void(String const &)> function)
{
    TraceTarget & target = Target();
    ScopedLock lock(target.m_Lock);
    target.m_HasTarget.store(static_cast<bool>(function), std::memory_order_release);
    target.m_Target = std::move(function);
}

}
