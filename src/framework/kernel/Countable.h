#pragma once

#include <atomic>
#include <cstdint>

namespace Kernel
{

/// Base of every shared object: an intrusive reference count.
///
/// Derive virtually, so that an object of several families has one count. The object deletes itself when its last
/// reference goes, on the thread that lets go of it. Counting is safe on any thread; nothing else is implied.
class Countable
{
public:
    Countable() = default;
    /// A copy is a new object with a count of its own.
    Countable(Countable const &) noexcept {}
    Countable & operator=(Countable const &) noexcept { return *this; }
    virtual ~Countable() = default;

    void Retain() const noexcept { m_Count.fetch_add(1, std::memory_order_relaxed); }

    void Release() const noexcept
    {
        if (m_Count.fetch_sub(1, std::memory_order_acq_rel) == 1) {
            delete this;
        }
    }

    /// Retains the object unless its last reference has gone already; the caller makes sure that its memory is still
    /// there. For looking from a list of borrowed pointers at objects that take themselves out when they go.
    [[nodiscard]] bool RetainIfAlive() const noexcept
    {
        std::uint32_t count = m_Count.load(std::memory_order_relaxed);
        while (count != 0 && !m_Count.compare_exchange_weak(count, count + 1, std::memory_order_acq_rel)) {
        }
        return count != 0;
    }

    /// Number of references at this moment: for assertions and tests only, as it may change at once.
    [[nodiscard]] std::uint32_t ReferenceCount() const noexcept { return m_Count.load(std::memory_order_relaxed); }

private:
    mutable std::atomic<std::uint32_t> m_Count{0};
};

}
