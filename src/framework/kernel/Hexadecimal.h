#pragma once

#include "framework/kernel/StringT.h"

#include <cstdint>
#include <span>

namespace Kernel
{

/// Two lower-case digits a byte, in order.
[[nodiscard]] String ToHexadecimal(std::span<std::uint8_t const> bytes);

}
