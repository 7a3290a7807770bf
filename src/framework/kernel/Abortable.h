#pragma once

#include <atomic>

namespace Kernel
{

/// Base of work that can be stopped from outside. It polls a flag that belongs to somebody else, or its own if it was
/// given none, and stops soon after the flag is set. The flag may be set on any thread; it is never cleared by the
/// work.
class Abortable
{
public:
    Abortable() = default;
    Abortable(Abortable const &) = delete;
    Abortable & operator=(Abortable const &) = delete;
    virtual ~Abortable() = default;

    /// The flag to poll from now on; it must outlive the work. Null brings the object's own flag back.
    void SetAbortPointer(bool * flag) { m_Flag = flag ? flag : &m_OwnFlag; }
    /// The flag that is polled, for handing it on to a part of the work. Never null.
    [[nodiscard]] bool * GetAbortPointer() const { return m_Flag; }

    [[nodiscard]] bool IsAborted() const { return std::atomic_ref<bool>(*m_Flag).load(std::memory_order_relaxed); }
    void Abort() const { SetFlag(m_Flag); }

    /// Reads and sets such a flag without a data race.
    [[nodiscard]] static bool IsFlagSet(bool * flag)
    {
        return flag && std::atomic_ref<bool>(*flag).load(std::memory_order_relaxed);
    }
    static void SetFlag(bool * flag)
    {
        if (flag) {
            std::atomic_ref<bool>(*flag).store(true, std::memory_order_relaxed);
        }
    }

private:
    mutable bool m_OwnFlag = false;
    bool * m_Flag = &m_OwnFlag;
};

}
