#pragma once

#include "framework/kernel/StringT.h"

namespace Kernel
{

/// Joining of paths that may have been written with either separator.
class PathTraitsDos
{
public:
    /// Joins the first `pathLength` bytes of `buffer` and the `partLength` bytes of `part` in `buffer`, which holds
    /// `capacity` bytes, ends the text with a zero byte, and gives its length. Exactly one separator stands between the
    /// two: one that is there already is kept, `\` or `/`; else `\` is put in for a path that is written with `\`
    /// alone, and `/` for any other. An empty path or part adds no separator. If the result and its closing zero do not
    /// fit, the buffer stays as it is and the result is the length that was needed.
    static unsigned long long Append(char * buffer, char const * part, unsigned long long pathLength,
                                     unsigned long long partLength, unsigned long long capacity);

    /// The same on strings.
    [[nodiscard]] static String Append(String const & path, String const & part);
};

}
