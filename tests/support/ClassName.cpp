#include "support/ClassName.h"

#include <cstdlib>
#include <cxxabi.h>
#include <memory>

std::string ClassName(std::type_info const & type)
{
    int status = 0;
    std::unique_ptr<char, void (*)(void *)> const name(abi::__cxa_demangle(type.name(), nullptr, nullptr, &status),
                                                       std::free);
    return status == 0 ? name.get() : type.name();
}
