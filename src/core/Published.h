#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/TurnSession.h"

#include <cstddef>
#include <utility>

namespace Book
{

/// One value that any thread may read while another replaces it: a counted reference, a string, a snapshot. A reader
/// gets a copy of its own, which stays as it is whatever is published afterwards. Copying must be cheap and must not
/// call back; the old value is destroyed outside of the lock.
template <typename T>
class Published
{
public:
    Published() = default;
    explicit Published(T value) : m_Value(std::move(value)) {}
    Published(const Published &) = delete;
    Published & operator=(const Published &) = delete;

    [[nodiscard]] T Get() const
    {
        Kernel::ScopedLock const lock(m_Lock);
        return m_Value;
    }

    /// What `read` says of the value, in place: for a quick look that needs no copy. `read` runs under the lock, so it
    /// compares a few bytes and calls nothing that might come back here.
    template <typename TRead>
    [[nodiscard]] auto Look(TRead const & read) const
    {
        Kernel::ScopedLock const lock(m_Lock);
        return read(m_Value);
    }

    /// Puts `value` in the place of what was there, and gives the latter back.
    T Set(T value)
    {
        Kernel::ScopedLock const lock(m_Lock);
        std::swap(m_Value, value);
        return value;
    }

    /// Puts `value` in the place of `expected`; if something else is there by now, that stays.
    void Replace(T const & expected, T value)
    {
        Kernel::ScopedLock const lock(m_Lock);
        if (m_Value == expected) {
            std::swap(m_Value, value);
        }
    }

private:
    Kernel::CriticalSectionSpin m_Lock;
    T m_Value{};
};

/// Shared immutable value, never null: a list or table as it was at one moment. Copying shares it. Keep the snapshot
/// itself for as long as you look at what it holds:
///
///     auto const spreads = chapter->GetSpreadInfo();
///     for (SpreadInfo const & spread : *spreads) ...
template <typename T>
class Snapshot
{
public:
    Snapshot() : m_Held(Empty()) {}
    explicit Snapshot(T value) : m_Held(Kernel::MakeCounted<Held>(std::move(value))) {}

    [[nodiscard]] T const & operator*() const noexcept { return m_Held->m_Value; }
    [[nodiscard]] T const * operator->() const noexcept { return &m_Held->m_Value; }

    /// For who gives out a pointer into the snapshot: it stays to the end of the calling thread's turn. On a thread
    /// without a turn or session, only as long as somebody holds the snapshot.
    void KeepForTurn() const
    {
        if (Kernel::TurnSession::IsOpen()) {
            Kernel::TurnSession::Keep(m_Held);
        }
    }

    // What lists offer, so that a snapshot of one reads like the list.
    [[nodiscard]] auto begin() const { return m_Held->m_Value.begin(); }
    [[nodiscard]] auto end() const { return m_Held->m_Value.end(); }
    [[nodiscard]] std::size_t size() const { return m_Held->m_Value.size(); }
    [[nodiscard]] bool empty() const { return m_Held->m_Value.empty(); }
    [[nodiscard]] decltype(auto) operator[](std::size_t index) const { return m_Held->m_Value[index]; }

private:
    struct Held final : public virtual Kernel::Countable
    {
        Held() = default;
        explicit Held(T value) : m_Value(std::move(value)) {}
        T const m_Value{};
    };

    static const Kernel::Counted<Held const> & Empty()
    {
        static const Kernel::Counted<Held const> empty = Kernel::MakeCounted<Held>();
        return empty;
    }

    Kernel::Counted<const Held> m_Held;
};

}
