#pragma once

#include "framework/kernel/StringT.h"

#include <cstddef>
#include <string>
#include <string_view>

namespace Kernel
{

/// The first byte of a text that is not valid UTF-8.
struct Utf8Fault
{
    /// Bytes before it.
    std::size_t m_Offset = 0;
    /// Counted from 1. Lines end in LF, CR or CR LF.
    std::size_t m_Line = 1;
    /// Counted from 1, in characters of the line.
    std::size_t m_Column = 1;
};

/// True if the text is well-formed UTF-8 (Unicode 15, table 3-7: no surrogates, no overlong forms, nothing above
/// U+10FFFF); else false and the place of the first fault.
[[nodiscard]] bool IsValidUtf8(std::string_view text, Utf8Fault & fault);
[[nodiscard]] bool IsValidUtf8(std::string_view text);

/// Takes one character off the front of `text`, which must not be empty. A malformed sequence gives U+FFFD for each of
/// its maximal parts, and always takes at least one byte.
char32_t TakeUtf8(std::string_view & text);

/// Conversions never fail: what is malformed becomes U+FFFD.
[[nodiscard]] std::u16string Utf8ToUtf16(std::string_view text);
[[nodiscard]] String Utf16ToUtf8(std::u16string_view text);
void AppendUtf8(std::string & target, std::u16string_view text);
void AppendUtf8(std::string & target, char32_t character);
void AppendUtf16(std::u16string & target, char32_t character);
void AppendUtf16(std::u16string & target, std::string_view utf8);

/// UTF-16 code units that the text has, without converting it.
[[nodiscard]] std::size_t CountUtf16(std::string_view utf8);

}
