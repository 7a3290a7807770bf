#include "framework/render/PdfBombGuard.h"

#include <algorithm>
#include <string>
#include <string_view>
#include <zlib.h>

namespace Renderer::RenderTree
{

namespace
{

bool Has(std::string_view text, std::string_view word)
{
    return std::string_view::npos != text.find(word);
}

/// How often the names of the common packing occur, in full or short.
int CountDeflate(std::string_view text)
{
    int count = 0;
    for (std::size_t at = text.find("/Fl"); std::string_view::npos != at; at = text.find("/Fl", at + 1)) {
        std::string_view const rest = text.substr(at + 3);
        bool const isShort = rest.empty() || std::string_view::npos != std::string_view(" \t\r\n/[]<>(%").find(rest[0]);
        count += isShort || rest.starts_with("ateDecode") ? 1 : 0;
    }
    return count;
}

int HexDigit(char digit)
{
    return '0' <= digit && digit <= '9'   ? digit - '0'
           : 'A' <= digit && digit <= 'F' ? digit - 'A' + 10
           : 'a' <= digit && digit <= 'f' ? digit - 'a' + 10
                                          : -1;
}

/// Names without their escapes (ISO 32000-2, 7.3.5).
std::string Unescaped(std::string_view text)
{
    std::string plain;
    for (std::size_t i = 0; i < text.size(); ++i) {
        bool const isEscape =
            '#' == text[i] && i + 2 < text.size() && 0 <= HexDigit(text[i + 1]) && 0 <= HexDigit(text[i + 2]);
        plain += isEscape ? static_cast<char>(HexDigit(text[i + 1]) * 16 + HexDigit(text[i + 2])) : text[i];
        i += isEscape ? 2 : 0;
    }
    return plain;
}

/// Takes off what the data unpack to; false if it is more than is left.
bool Unpack(std::string_view data, std::size_t & left)
{
    z_stream stream{};
    if (Z_OK != inflateInit(&stream)) {
        return false;
    }
    unsigned char buffer[1 << 15];
    stream.next_in = reinterpret_cast<unsigned char *>(const_cast<char *>(data.data()));
    stream.avail_in = static_cast<uInt>(data.size());
    int state = Z_OK;
    bool fits = true;
    while (fits && Z_OK == state) {
        stream.next_out = buffer;
        stream.avail_out = sizeof buffer;
        state = inflate(&stream, Z_NO_FLUSH);
        std::size_t const size = sizeof buffer - stream.avail_out;
        fits = size <= left;
        left -= std::min(left, size);
    }
    inflateEnd(&stream);
    return fits;
}

}

bool UnpacksTooFar(std::vector<unsigned char> const & bytes, std::size_t limit)
{
    std::string_view const file(reinterpret_cast<char const *>(bytes.data()), bytes.size());
    std::size_t left = limit;
    std::size_t last = 0;
    for (std::size_t at = file.find("stream"); std::string_view::npos != at; at = file.find("stream", at + 6)) {
        std::string_view const between = file.substr(last, at - last);
        last = at + 6;
        if (between.ends_with("end")) {
            continue;
        }
        std::string const names = Unescaped(between);
        // Only what has these keys is read as a table, whatever it calls itself.
        bool const isTable = (Has(names, "/First") && Has(names, "/N")) || (Has(names, "/Size") && Has(names, "/W"));
        if (!isTable) {
            continue;
        }
        std::size_t const begin = std::min(file.find_first_not_of("\r\n", last), file.size());
        int const packings = CountDeflate(names);
        if (1 < packings || Has(names, "LZW") ||
            (1 == packings && !Unpack(file.substr(begin, std::size_t(1) << 30), left))) {
            return true;
        }
    }
    return false;
}

}
