#pragma once

#include "framework/kernel/IDTag.h"
#include "framework/kernel/PropType.h"
#include "framework/kernel/TimeStamp.h"

#include <bit>
#include <concepts>
#include <type_traits>

namespace Kernel
{

// The format's numbers and arrays are the memory of the machines that this runs on.
static_assert(std::endian::native == std::endian::little);

/// A type that one field of fixed size holds as it lies in memory.
template <typename T>
concept SerialisableScalar = std::is_arithmetic_v<T> || std::is_enum_v<T> || std::same_as<T, IDTag> ||
    std::same_as<T, ClassUID> || std::same_as<T, TimeStamp>;

/// A type whose elements may lie in a file one after the other: no pointers, no padding bytes of unknown content.
template <typename T>
concept SerialisableElement =
    std::is_trivially_copyable_v<T> && !std::is_pointer_v<T> && alignof(T) <= 8 &&
    (std::has_unique_object_representations_v<T> || std::is_floating_point_v<T> || T::IsSerialisableElement);

/// The property type of a scalar.
template <SerialisableScalar T>
[[nodiscard]] constexpr PropType GetPropType()
{
    if constexpr (std::same_as<T, bool>) {
        return PropType::Bool;
    } else if constexpr (std::same_as<T, float>) {
        return PropType::Float;
    } else if constexpr (std::same_as<T, double>) {
        return PropType::Double;
    } else if constexpr (sizeof(T) == 1) {
        return PropType::Int8;
    } else if constexpr (sizeof(T) == 2) {
        return PropType::Int16;
    } else if constexpr (sizeof(T) == 4) {
        return PropType::Int32;
    } else {
        static_assert(sizeof(T) == 8);
        return PropType::Int64;
    }
}

}
