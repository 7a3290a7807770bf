#pragma once

#include <string>
#include <typeinfo>

/// The name of a class as in the source, with its namespace.
[[nodiscard]] std::string ClassName(std::type_info const & type);

/// That of an object's own class.
template <typename T>
[[nodiscard]] std::string ClassName(T const & object)
{
    return ClassName(typeid(object));
}
