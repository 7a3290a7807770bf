#pragma once

#include "framework/kernel/Countable.h"

#include <cstddef>
#include <functional>
#include <type_traits>
#include <utility>

namespace Kernel
{

/// Strong reference to a `Countable`: copying retains, destruction releases, null is allowed.
///
/// `Counted<T>` converts to `Counted<T const>` and to references to bases, never the other way: a mutable reference is
/// had from the object's owner only. Two references are equal if they point at the same object; the order is that of
/// addresses. One reference object must not be written and read by two threads at once; different ones may.
template <typename T>
class Counted
{
public:
    using ElementType = T;

    constexpr Counted() noexcept = default;
    constexpr Counted(std::nullptr_t) noexcept {}
    Counted(T * object) noexcept : m_Object(object) { RetainObject(); }
    Counted(Counted const & other) noexcept : m_Object(other.m_Object) { RetainObject(); }
    Counted(Counted && other) noexcept : m_Object(std::exchange(other.m_Object, nullptr)) {}

    template <typename U, typename = std::enable_if_t<std::is_convertible_v<U *, T *>>>
    Counted(Counted<U> const & other) noexcept : m_Object(other.Get())
    {
        RetainObject();
    }

    template <typename U, typename = std::enable_if_t<std::is_convertible_v<U *, T *>>>
    Counted(Counted<U> && other) noexcept : m_Object(other.Detach())
    {
    }

    ~Counted() { ReleaseObject(); }

    Counted & operator=(Counted const & other) noexcept
    {
        Counted(other).Swap(*this);
        return *this;
    }

    Counted & operator=(Counted && other) noexcept
    {
        Counted(std::move(other)).Swap(*this);
        return *this;
    }

    void Swap(Counted & other) noexcept { std::swap(m_Object, other.m_Object); }
    void Reset() noexcept { Counted().Swap(*this); }

    [[nodiscard]] T * Get() const noexcept { return m_Object; }
    T * operator->() const noexcept { return m_Object; }
    T & operator*() const noexcept { return *m_Object; }
    explicit operator bool() const noexcept { return m_Object != nullptr; }

    /// Gives the object away with its reference still counted: the caller has to release it.
    [[nodiscard]] T * Detach() noexcept { return std::exchange(m_Object, nullptr); }

private:
    void RetainObject() const noexcept
    {
        if (m_Object) {
            m_Object->Retain();
        }
    }
    void ReleaseObject() const noexcept
    {
        if (m_Object) {
            m_Object->Release();
        }
    }

    T * m_Object = nullptr;
};

/// Borrowed pointer without count traffic, valid for the length of the call that hands it over.
template <typename T>
class NonCounted
{
public:
    using ElementType = T;

    constexpr NonCounted() noexcept = default;
    constexpr NonCounted(std::nullptr_t) noexcept {}
    constexpr NonCounted(T * object) noexcept : m_Object(object) {}
    template <typename U, typename = std::enable_if_t<std::is_convertible_v<U *, T *>>>
    constexpr NonCounted(NonCounted<U> const & other) noexcept : m_Object(other.Get())
    {
    }
    template <typename U, typename = std::enable_if_t<std::is_convertible_v<U *, T *>>>
    NonCounted(Counted<U> const & other) noexcept : m_Object(other.Get())
    {
    }

    [[nodiscard]] constexpr T * Get() const noexcept { return m_Object; }
    constexpr T * operator->() const noexcept { return m_Object; }
    constexpr T & operator*() const noexcept { return *m_Object; }
    constexpr explicit operator bool() const noexcept { return m_Object != nullptr; }

private:
    T * m_Object = nullptr;
};

/// Strong reference into the tree or list of an owner. Who returns one hands out the mutable object. It is `Counted`
/// under another name, so that a signature tells that what it points at has a place in somebody's structure.
template <typename T>
using JailCounted = Counted<T>;

/// Borrowed pointer of the same family.
template <typename T>
using JailNonCounted = NonCounted<T>;

/// Handle to an immutable value that many may share. Changing it means replacing the handle.
template <typename T>
class Consolidated
{
public:
    using ElementType = T;

    constexpr Consolidated() noexcept = default;
    constexpr Consolidated(std::nullptr_t) noexcept {}
    Consolidated(Counted<T const> value) noexcept : m_Value(std::move(value)) {}
    Consolidated(T const * value) noexcept : m_Value(value) {}
    template <typename U, typename = std::enable_if_t<std::is_convertible_v<U const *, T const *>>>
    Consolidated(Consolidated<U> const & other) noexcept : m_Value(other.GetCounted())
    {
    }

    [[nodiscard]] T const * Get() const noexcept { return m_Value.Get(); }
    [[nodiscard]] Counted<T const> const & GetCounted() const noexcept { return m_Value; }
    T const * operator->() const noexcept { return m_Value.Get(); }
    T const & operator*() const noexcept { return *m_Value; }
    explicit operator bool() const noexcept { return static_cast<bool>(m_Value); }

    /// Same shared object; two handles to equal values in different objects are not equal.
    friend bool operator==(Consolidated const & a, Consolidated const & b) noexcept { return a.Get() == b.Get(); }
    friend bool operator!=(Consolidated const & a, Consolidated const & b) noexcept { return a.Get() != b.Get(); }

private:
    Counted<T const> m_Value;
};

template <typename T, typename U>
bool operator==(Counted<T> const & a, Counted<U> const & b) noexcept
{
    return a.Get() == b.Get();
}
template <typename T>
bool operator==(Counted<T> const & a, std::nullptr_t) noexcept
{
    return a.Get() == nullptr;
}
template <typename T, typename U>
bool operator<(Counted<T> const & a, Counted<U> const & b) noexcept
{
    return std::less<void const *>()(a.Get(), b.Get());
}
template <typename T, typename U>
bool operator==(NonCounted<T> const & a, NonCounted<U> const & b) noexcept
{
    return a.Get() == b.Get();
}
template <typename T>
bool operator==(NonCounted<T> const & a, std::nullptr_t) noexcept
{
    return a.Get() == nullptr;
}

/// A new object in its first reference.
template <typename T, typename... Arguments>
[[nodiscard]] Counted<T> MakeCounted(Arguments &&... arguments)
{
    return Counted<T>(new T(std::forward<Arguments>(arguments)...));
}

/// The same object as another class, or null if it is not one. Keeps `const`.
template <typename T, typename U>
[[nodiscard]] Counted<T> CountedCast(Counted<U> const & object) noexcept
{
    return Counted<T>(dynamic_cast<T *>(object.Get()));
}

}
