#pragma once

#include "framework/kernel/CriticalSection.h"

#include <cstddef>
#include <memory>
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

    /// Puts `value` in the place of what was there, and gives the latter back.
    T Set(T value)
    {
        Kernel::ScopedLock const lock(m_Lock);
        std::swap(m_Value, value);
        return value;
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
    Snapshot() : m_Value(EmptyValue()) {}
    explicit Snapshot(T value) : m_Value(std::make_shared<const T>(std::move(value))) {}

    [[nodiscard]] T const & operator*() const noexcept { return *m_Value; }
    [[nodiscard]] T const * operator->() const noexcept { return m_Value.get(); }

    // What lists offer, so that a snapshot of one reads like the list.
    [[nodiscard]] auto begin() const { return m_Value->begin(); }
    [[nodiscard]] auto end() const { return m_Value->end(); }
    [[nodiscard]] std::size_t size() const { return m_Value->size(); }
    [[nodiscard]] bool empty() const { return m_Value->empty(); }
    [[nodiscard]] decltype(auto) operator[](std::size_t index) const { return (*m_Value)[index]; }

private:
    static const std::shared_ptr<T const> & EmptyValue()
    {
        static const std::shared_ptr<T const> empty = std::make_shared<const T>();
        return empty;
    }

    std::shared_ptr<const T> m_Value;
};

}
