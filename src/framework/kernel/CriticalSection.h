#pragma once

#include "framework/kernel/ThreadSafety.h"

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

namespace Kernel
{

/// Exclusive lock of one thread. Not recursive. It may be a field of a `const` object.
class KORVANE_CAPABILITY("mutex") CriticalSection
{
public:
    CriticalSection() = default;
    CriticalSection(CriticalSection const &) = delete;
    CriticalSection & operator=(CriticalSection const &) = delete;

    void AcquireLock() const KORVANE_ACQUIRE() { m_Mutex.lock(); }
    void ReleaseLock() const KORVANE_RELEASE() { m_Mutex.unlock(); }
    /// Takes the lock if it is free; false at once if it is not.
    [[nodiscard]] bool TryAcquireLock() const KORVANE_TRY_ACQUIRE(true) { return m_Mutex.try_lock(); }

    /// The standard mutex, for waiting on a condition variable.
    [[nodiscard]] std::mutex & Native() const { return m_Mutex; }

private:
    mutable std::mutex m_Mutex;
};

/// The same for sections of a few instructions: a thread that finds it taken spins, and soon gives way to others.
class KORVANE_CAPABILITY("mutex") CriticalSectionSpin
{
public:
    CriticalSectionSpin() = default;
    CriticalSectionSpin(CriticalSectionSpin const &) = delete;
    CriticalSectionSpin & operator=(CriticalSectionSpin const &) = delete;

    void AcquireLock() const KORVANE_ACQUIRE()
    {
        for (int round = 0; m_Taken.exchange(true, std::memory_order_acquire);) {
            while (m_Taken.load(std::memory_order_relaxed)) {
                if (++round > 64) {
                    std::this_thread::yield();
                }
            }
        }
    }
    void ReleaseLock() const KORVANE_RELEASE() { m_Taken.store(false, std::memory_order_release); }

private:
    mutable std::atomic<bool> m_Taken{false};
};

/// Holds a `CriticalSection` or `CriticalSectionSpin` for its own lifetime.
template <typename TLock = CriticalSection>
class KORVANE_SCOPED_CAPABILITY ScopedLock
{
public:
    explicit ScopedLock(TLock const & lock) KORVANE_ACQUIRE(lock) : m_Lock(lock) { m_Lock.AcquireLock(); }
    ~ScopedLock() KORVANE_RELEASE() { m_Lock.ReleaseLock(); }
    ScopedLock(ScopedLock const &) = delete;
    ScopedLock & operator=(ScopedLock const &) = delete;

private:
    TLock const & m_Lock;
};

template <typename TLock>
ScopedLock(TLock const &) -> ScopedLock<TLock>;

/// Holds a `CriticalSection` and can wait on a condition variable, which gives the lock up for the wait.
class KORVANE_SCOPED_CAPABILITY WaitableLock
{
public:
    explicit WaitableLock(CriticalSection const & lock) KORVANE_ACQUIRE(lock) : m_Lock(lock.Native()) {}
    ~WaitableLock() KORVANE_RELEASE() = default;

    void Unlock() KORVANE_RELEASE() { m_Lock.unlock(); }
    void Lock() KORVANE_ACQUIRE() { m_Lock.lock(); }
    /// For `std::condition_variable::wait` and its kin.
    [[nodiscard]] std::unique_lock<std::mutex> & Native() { return m_Lock; }

private:
    std::unique_lock<std::mutex> m_Lock;
};

}
