#pragma once

#include "import/Message.h"

#include <cstdint>
#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace Import
{

/// Reads a text file of the user's into UTF-8. A byte order mark is taken off; UTF-16 with a mark is converted, with a
/// note. Not text (invalid UTF-8, zero bytes), not readable or larger than 64 MB: nothing, and an error in `messages`
/// with line and column of the first bad byte. `shownName` is what messages call the file.
std::optional<std::string> ReadSourceText(std::filesystem::path const & path, std::string const & shownName,
                                          MessageList & messages);

/// The same for bytes that are already in memory.
std::optional<std::string> DecodeSourceText(std::string bytes, std::string const & shownName, MessageList & messages);

/// Offset of the first byte that is not valid UTF-8 (overlong forms and surrogates count as invalid) or is zero;
/// the text's length if all is well.
std::size_t FindBadByte(std::string_view text);

/// UTF-8 to UTF-16 and back; the input must be valid.
std::u16string ToUtf16(std::string_view text);
std::string ToUtf8(std::u16string_view text);

/// 64-bit content hash (FNV-1a over 8-byte words with a final mix): for telling changed files, not for secrets.
std::uint64_t HashBytes(std::string_view bytes, std::uint64_t seed = 0);

}
