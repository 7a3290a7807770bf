#pragma once

#include <cstdint>

namespace Kernel
{

/// How a field of a tagged stream is written. The numbers are part of the file format. All numbers lie in the file with
/// the least significant byte first.
enum class PropType : std::uint8_t
{
    Bool = 1,
    /// UTF-8, without a closing zero.
    String = 2,
    Int8 = 3,
    Int16 = 4,
    Float = 5,
    Double = 6,
    Int32 = 7,
    /// 8 bytes: a 64-bit integer, or a value such as a time stamp.
    Int64 = 8,
    /// Elements of one fixed size, one after the other, after 8 bytes that give that size.
    Array = 9,
    StringArray = 10,
    Object = 11,
    ObjectArray = 12,
    SharedObject = 13,
};

}
