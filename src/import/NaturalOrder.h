#pragma once

#include <string_view>

namespace Import
{

/// Order of file names as people expect it: runs of digits by their value ("ch2" before "ch10"), other characters by
/// code point without regard to ASCII case; equal but for leading zeros or case: the shorter, then byte order.
/// A strict weak order.
bool ComesBefore(std::string_view a, std::string_view b);

}
