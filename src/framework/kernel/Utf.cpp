#include "framework/kernel/Utf.h"

#include <cstdint>
#include <cstring>

namespace Kernel
{

namespace
{

constexpr char32_t Replacement = 0xFFFD;
constexpr std::uint64_t HighBits = 0x8080808080808080ULL;

/// Length of the run of ASCII characters at the front.
std::size_t AsciiRun(std::string_view text)
{
    std::size_t at = 0;
    for (; at + 8 <= text.size(); at += 8) {
        std::uint64_t word;
        std::memcpy(&word, text.data() + at, sizeof(word));
        if ((word & HighBits) != 0) {
            break;
        }
    }
    while (at < text.size() && static_cast<unsigned char>(text[at]) < 0x80) {
        ++at;
    }
    return at;
}

/// One sequence at the front: its length, and its character, or false if it is malformed. The length of a malformed one
/// is that of its longest part that could begin a character, at least 1.
bool Decode(std::string_view text, char32_t & character, std::size_t & length)
{
    auto const byte = [&](std::size_t i) { return static_cast<unsigned char>(text[i]); };
    unsigned const first = byte(0);
    length = 1;
    if (first < 0x80) {
        character = first;
        return true;
    }
    if (first < 0xC2 || 0xF4 < first) {
        return false;
    }
    std::size_t const wanted = first < 0xE0 ? 2 : first < 0xF0 ? 3 : 4;
    // Only the second byte's range depends on the first: that shuts out overlong forms, surrogates and what is too
    // high.
    unsigned lowest = first == 0xE0 ? 0xA0 : first == 0xF0 ? 0x90 : 0x80;
    unsigned highest = first == 0xED ? 0x9F : first == 0xF4 ? 0x8F : 0xBF;
    character = first & (0xFFu >> (wanted + 1));
    for (; length < wanted; ++length) {
        if (text.size() <= length || byte(length) < lowest || highest < byte(length)) {
            return false;
        }
        character = character << 6 | (byte(length) & 0x3F);
        lowest = 0x80;
        highest = 0xBF;
    }
    return true;
}

Utf8Fault PlaceOf(std::string_view text, std::size_t offset)
{
    Utf8Fault fault;
    fault.m_Offset = offset;
    std::size_t lineStart = 0;
    for (std::size_t i = 0; i < offset; ++i) {
        if (text[i] == '\n' || (text[i] == '\r' && !(i + 1 < text.size() && text[i + 1] == '\n'))) {
            ++fault.m_Line;
            lineStart = i + 1;
        }
    }
    for (std::size_t i = lineStart; i < offset; ++i) {
        // Continuation bytes are part of the character before.
        fault.m_Column += (static_cast<unsigned char>(text[i]) & 0xC0) != 0x80 ? 1 : 0;
    }
    return fault;
}

}

bool IsValidUtf8(std::string_view text, Utf8Fault & fault)
{
    std::size_t at = 0;
    while (at < text.size()) {
        at += AsciiRun(text.substr(at));
        if (at == text.size()) {
            break;
        }
        char32_t character = 0;
        std::size_t length = 0;
        if (!Decode(text.substr(at), character, length)) {
            fault = PlaceOf(text, at);
            return false;
        }
        at += length;
    }
    return true;
}

bool IsValidUtf8(std::string_view text)
{
    Utf8Fault fault;
    return IsValidUtf8(text, fault);
}

char32_t TakeUtf8(std::string_view & text)
{
    char32_t character = 0;
    std::size_t length = 0;
    bool const valid = Decode(text, character, length);
    text.remove_prefix(length);
    return valid ? character : Replacement;
}

void AppendUtf16(std::u16string & target, char32_t character)
{
    if (character < 0x10000) {
        target += static_cast<char16_t>(character);
    } else {
        target += static_cast<char16_t>(0xD7C0 + (character >> 10));
        target += static_cast<char16_t>(0xDC00 + (character & 0x3FF));
    }
}

void AppendUtf16(std::u16string & target, std::string_view utf8)
{
    while (!utf8.empty()) {
        std::size_t const run = AsciiRun(utf8);
        target.append(utf8.begin(), utf8.begin() + static_cast<std::ptrdiff_t>(run));
        utf8.remove_prefix(run);
        if (!utf8.empty()) {
            AppendUtf16(target, TakeUtf8(utf8));
        }
    }
}

std::u16string Utf8ToUtf16(std::string_view text)
{
    std::u16string result;
    result.reserve(text.size());
    AppendUtf16(result, text);
    return result;
}

void AppendUtf8(std::string & target, char32_t character)
{
    if (0x10FFFF < character || (0xD800 <= character && character <= 0xDFFF)) {
        character = Replacement;
    }
    if (character < 0x80) {
        target += static_cast<char>(character);
    } else if (character < 0x800) {
        target += static_cast<char>(0xC0 | character >> 6);
        target += static_cast<char>(0x80 | (character & 0x3F));
    } else if (character < 0x10000) {
        target += static_cast<char>(0xE0 | character >> 12);
        target += static_cast<char>(0x80 | (character >> 6 & 0x3F));
        target += static_cast<char>(0x80 | (character & 0x3F));
    } else {
        target += static_cast<char>(0xF0 | character >> 18);
        target += static_cast<char>(0x80 | (character >> 12 & 0x3F));
        target += static_cast<char>(0x80 | (character >> 6 & 0x3F));
        target += static_cast<char>(0x80 | (character & 0x3F));
    }
}

void AppendUtf8(std::string & target, std::u16string_view text)
{
    for (std::size_t i = 0; i < text.size(); ++i) {
        char32_t character = text[i];
        bool const leads = 0xD800 <= character && character < 0xDC00;
        if (leads && i + 1 < text.size() && 0xDC00 <= text[i + 1] && text[i + 1] <= 0xDFFF) {
            character = 0x10000 + ((character - 0xD800) << 10) + (text[++i] - 0xDC00u);
        }
        AppendUtf8(target, character);
    }
}

String Utf16ToUtf8(std::u16string_view text)
{
    std::string result;
    result.reserve(text.size());
    AppendUtf8(result, text);
    return String(result);
}

std::size_t CountUtf16(std::string_view utf8)
{
    std::size_t count = 0;
    while (!utf8.empty()) {
        std::size_t const run = AsciiRun(utf8);
        count += run;
        utf8.remove_prefix(run);
        if (!utf8.empty()) {
            count += TakeUtf8(utf8) < 0x10000 ? 1 : 2;
        }
    }
    return count;
}

}
