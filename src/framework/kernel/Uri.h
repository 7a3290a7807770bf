#pragma once

#include "framework/kernel/StringT.h"

namespace Kernel
{

/// The text begins with a scheme (RFC 3986 3.1) and "://", or with "mailto:" or "tel:", which have no slashes. Letters'
/// case does not matter. A drive letter is not a scheme.
[[nodiscard]] bool HasUriProtocol(String const & text);

}
