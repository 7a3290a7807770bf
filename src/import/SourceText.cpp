#include "import/SourceText.h"

#include "import/Text.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <unicode/ustring.h>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

namespace Import
{

namespace
{

constexpr std::uintmax_t g_LargestSource = 64u << 20;

Place PlaceOfOffset(std::string_view text, std::size_t offset, std::string const & file)
{
    Place place{file, 1, 1};
    for (std::size_t at = 0; at < offset && at < text.size(); ++at) {
        if ('\n' == text[at]) {
            ++place.m_Line;
            place.m_Column = 1;
        } else if (0x80 != (static_cast<unsigned char>(text[at]) & 0xC0)) {
            ++place.m_Column;
        }
    }
    return place;
}

/// Converts UTF-16 of the given byte order; an odd last byte or a lone surrogate becomes the replacement character.
std::string FromUtf16(std::string_view bytes, bool bigEndian)
{
    std::u16string text;
    text.reserve(bytes.size() / 2 + 1);
    for (std::size_t at = 0; at + 1 < bytes.size(); at += 2) {
        auto const first = static_cast<unsigned char>(bytes[at]);
        auto const second = static_cast<unsigned char>(bytes[at + 1]);
        text += static_cast<char16_t>(bigEndian ? first << 8 | second : second << 8 | first);
    }
    return ToUtf8(text);
}

}

std::size_t FindBadByte(std::string_view text)
{
    auto const * bytes = reinterpret_cast<std::uint8_t const *>(text.data());
    std::size_t at = 0;
    while (at < text.size()) {
        // Most text is plain ASCII: eight bytes at a step.
        std::uint64_t word = 0;
        if (at + sizeof word <= text.size()) {
            std::memcpy(&word, bytes + at, sizeof word);
            bool const ascii = 0 == (word & 0x8080808080808080u);
            bool const zero = 0 != ((word - 0x0101010101010101u) & ~word & 0x8080808080808080u);
            if (ascii && !zero) {
                at += sizeof word;
                continue;
            }
        }
        if (0 == bytes[at]) {
            return at;
        }
        if (bytes[at] < 0x80) {
            ++at;
            continue;
        }
        std::size_t const start = at;
        auto const rest = static_cast<std::int32_t>(std::min<std::size_t>(text.size() - at, 8));
        std::int32_t step = 0;
        UChar32 character = 0;
        U8_NEXT(bytes + start, step, rest, character);
        if (character < 0) {
            return start;
        }
        at += static_cast<std::size_t>(step);
    }
    return text.size();
}

std::optional<std::string> DecodeSourceText(std::string bytes, std::string const & shownName, MessageList & messages)
{
    std::string_view const view = bytes;
    if (view.starts_with("\xEF\xBB\xBF")) {
        bytes.erase(0, 3);
    } else if (view.starts_with("\xFF\xFE") || view.starts_with("\xFE\xFF")) {
        bool const bigEndian = view.starts_with("\xFE\xFF");
        messages.Note("encoding", {shownName},
                      Text("The file is in UTF-16 and was converted; save it as UTF-8 to avoid doubts.", "Source"));
        bytes = FromUtf16(view.substr(2), bigEndian);
    }

    std::size_t const bad = FindBadByte(bytes);
    if (bad == bytes.size()) {
        return bytes;
    }
    Place const place = PlaceOfOffset(bytes, bad, shownName);
    if (0 == bytes[bad]) {
        bool const wide = 1 < bytes.size() && (0 == bytes[0] || 0 == bytes[1]);
        messages.Error("encoding", place,
                       wide ? Text("The file looks like UTF-16 without a byte order mark; save it as UTF-8.", "Source")
                            : Text("The file holds a zero byte, so it is not text; save it as UTF-8.", "Source"));
    } else {
        char hex[8];
        std::snprintf(hex, sizeof hex, "0x%02X", static_cast<unsigned char>(bytes[bad]));
        messages.Error(
            "encoding", place,
            Text("The byte %1 is not valid UTF-8 here; save the file as UTF-8.", "Source", std::string(hex)));
    }
    return std::nullopt;
}

std::optional<std::string> ReadSourceText(std::filesystem::path const & path, std::string const & shownName,
                                          MessageList & messages)
{
    std::error_code error;
    if (std::filesystem::is_directory(path, error)) {
        messages.Error("unreadable", {shownName}, Text("This is a folder, not a text file.", "Source"));
        return std::nullopt;
    }
    bool const isThere = std::filesystem::exists(path, error);
    if (isThere && !std::filesystem::is_regular_file(path, error)) {
        messages.Error("unreadable", {shownName},
                       Text("This is a device or a pipe, not a text file; it may have no end.", "Source"));
        return std::nullopt;
    }
    auto const size = std::filesystem::file_size(path, error);
    if (!error && g_LargestSource < size) {
        messages.Error("unreadable", {shownName},
                       Text("The file is larger than 64 MB, which no chapter can be; split it.", "Source"));
        return std::nullopt;
    }
    errno = 0;
    std::ifstream stream(path, std::ios::binary);
    std::string bytes;
    if (stream) {
        if (!error) {
            bytes.resize(size);
            stream.read(bytes.data(), static_cast<std::streamsize>(size));
            bytes.resize(static_cast<std::size_t>(std::max<std::streamsize>(stream.gcount(), 0)));
        } else {
            bytes.assign(std::istreambuf_iterator<char>(stream), {});
        }
    }
    if (!stream.is_open() || stream.bad()) {
        messages.Error("unreadable", {shownName},
                       Text("The file cannot be read: %1.", "Source", std::strerror(errno ? errno : EIO)));
        return std::nullopt;
    }
    return DecodeSourceText(std::move(bytes), shownName, messages);
}

std::u16string ToUtf16(std::string_view text)
{
    std::u16string result;
    result.reserve(text.size());
    auto const * bytes = reinterpret_cast<std::uint8_t const *>(text.data());
    std::size_t at = 0;
    while (at < text.size()) {
        if (bytes[at] < 0x80) {
            result += static_cast<char16_t>(bytes[at++]);
            continue;
        }
        auto const rest = static_cast<std::int32_t>(std::min<std::size_t>(text.size() - at, 8));
        std::int32_t step = 0;
        UChar32 character = 0;
        U8_NEXT_OR_FFFD(bytes + at, step, rest, character);
        at += static_cast<std::size_t>(step);
        if (U_IS_BMP(character)) {
            result += static_cast<char16_t>(character);
        } else {
            result += static_cast<char16_t>(U16_LEAD(character));
            result += static_cast<char16_t>(U16_TRAIL(character));
        }
    }
    return result;
}

std::string ToUtf8(std::u16string_view text)
{
    std::string result;
    result.reserve(text.size() + text.size() / 8);
    std::size_t at = 0;
    while (at < text.size()) {
        UChar32 character = text[at++];
        if (U16_IS_SURROGATE(character)) {
            bool const pair = U16_IS_SURROGATE_LEAD(character) && at < text.size() && U16_IS_TRAIL(text[at]);
            character = pair ? U16_GET_SUPPLEMENTARY(character, text[at]) : 0xFFFD;
            at += pair ? 1 : 0;
        }
        char bytes[4];
        std::int32_t length = 0;
        U8_APPEND_UNSAFE(bytes, length, character);
        result.append(bytes, static_cast<std::size_t>(length));
    }
    return result;
}

std::uint64_t HashBytes(std::string_view bytes, std::uint64_t seed)
{
    constexpr std::uint64_t prime = 0x100000001B3u;
    std::uint64_t hash = (0xCBF29CE484222325u ^ seed) + bytes.size();
    std::size_t at = 0;
    for (; at + 8 <= bytes.size(); at += 8) {
        std::uint64_t word = 0;
        std::memcpy(&word, bytes.data() + at, 8);
        hash = (hash ^ word) * 0x9E3779B97F4A7C15u;
        hash ^= hash >> 32;
    }
    for (; at < bytes.size(); ++at) {
        hash = (hash ^ static_cast<unsigned char>(bytes[at])) * prime;
    }
    hash ^= hash >> 33;
    hash *= 0xFF51AFD7ED558CCDu;
    return hash ^ hash >> 33;
}

}
