#pragma once

#include "framework/kernel/StringT.h"

namespace Kernel
{

/// Parts of a path as text: no file is looked at. Both `\` and `/` separate on every system, since a book may list
/// paths that were written on another one.
class Path
{
public:
    /// True for `\` and `/`.
    [[nodiscard]] static constexpr bool IsSeparator(char c) { return c == '/' || c == '\\'; }

    /// The text after the last separator; the whole path if there is none.
    [[nodiscard]] static String GetFileName(String const & path);
    /// The file name up to its last `.`, which is left out; the whole file name if it has none. "a.b/c" gives "c",
    /// ".profile" gives an empty text.
    [[nodiscard]] static String GetFileNameWithoutExtension(String const & path);
    /// What follows the last `.` of the file name, without the `.`; empty if there is none.
    [[nodiscard]] static String GetExtension(String const & path);
    /// The path up to the file name, with the trailing separator; empty if there is no separator.
    [[nodiscard]] static String GetFolderWithSeparator(String const & path);
    /// The path up to the last separator, without it, except that "/a" gives "/". Empty if there is no separator.
    [[nodiscard]] static String GetFolder(String const & path);
    /// True if it begins with a separator, or with a drive letter and a colon.
    [[nodiscard]] static bool IsAbsolute(String const & path);
};

}
