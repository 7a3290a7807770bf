#pragma once

#include <optional>
#include <utility>

namespace Kernel
{

/// A value that may be absent, as an override that need not be given.
template <typename T>
class NullableProperty
{
public:
    constexpr NullableProperty() = default;
    constexpr NullableProperty(std::nullopt_t) {}
    constexpr NullableProperty(T value) : m_Value(std::move(value)) {}

    [[nodiscard]] constexpr bool IsNull() const { return !m_Value.has_value(); }
    /// The value, which must be there.
    [[nodiscard]] constexpr T const & Get() const { return *m_Value; }
    [[nodiscard]] constexpr T GetOr(T fallback) const { return m_Value.value_or(std::move(fallback)); }
    constexpr void Set(T value) { m_Value = std::move(value); }
    constexpr void SetNull() { m_Value.reset(); }

    /// Two absent ones are equal.
    friend constexpr bool operator==(NullableProperty const &, NullableProperty const &) = default;

private:
    std::optional<T> m_Value;
};

}
