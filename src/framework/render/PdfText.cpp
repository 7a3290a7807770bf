#include "framework/render/PdfText.h"

#include "framework/kernel/Utf.h"

#include <charconv>
#include <cmath>
#include <cstdio>
#include <ctime>

namespace Renderer::RenderTree
{

namespace
{

/// Readers that keep to single precision lose whole points beyond this.
constexpr double LargestNumber = 32767;

void AppendDecimals(std::string & text, std::int64_t value, int decimals)
{
    std::int64_t scale = 1;
    for (int i = 0; i < decimals; ++i) {
        scale *= 10;
    }
    if (value < 0) {
        text += '-';
        value = -value;
    }
    AppendInteger(text, value / scale);
    std::int64_t fraction = value % scale;
    if (fraction == 0) {
        return;
    }
    text += '.';
    while (fraction != 0) {
        scale /= 10;
        text += static_cast<char>('0' + fraction / scale);
        fraction %= scale;
    }
}

std::tm BrokenDown(std::int64_t seconds)
{
    std::time_t const time = static_cast<std::time_t>(seconds);
    std::tm parts{};
    gmtime_r(&time, &parts);
    return parts;
}

std::string FormatDate(std::int64_t seconds, char const * format)
{
    std::tm const parts = BrokenDown(seconds);
    char buffer[80];
    std::snprintf(buffer, sizeof(buffer), format, parts.tm_year + 1900, parts.tm_mon + 1, parts.tm_mday, parts.tm_hour,
                  parts.tm_min, parts.tm_sec);
    return buffer;
}

}

Thousandths ToThousandths(double value)
{
    if (!(value > -LargestNumber)) {
        return std::isnan(value) ? 0 : static_cast<Thousandths>(-LargestNumber * 1000);
    }
    return static_cast<Thousandths>(std::lround(std::min(value, LargestNumber) * 1000));
}

void AppendThousandths(std::string & text, Thousandths value)
{
    AppendDecimals(text, value, 3);
}

void AppendInteger(std::string & text, std::int64_t value)
{
    char buffer[24];
    auto const result = std::to_chars(buffer, buffer + sizeof(buffer), value);
    text.append(buffer, result.ptr);
}

void AppendMatrix(std::string & text, Raster::AffineTransform::Params const & matrix)
{
    for (double const value : {matrix.a, matrix.b, matrix.c, matrix.d}) {
        double const bounded = std::isnan(value) ? 0 : std::min(std::max(value, -LargestNumber), LargestNumber);
        AppendDecimals(text, std::llround(bounded * 1e6), 6);
        text += ' ';
    }
    AppendPoint(text, {matrix.e, matrix.f});
}

void AppendHexText(std::string & text, std::u16string_view value)
{
    static char const digits[] = "0123456789ABCDEF";
    text += "<FEFF";
    for (char16_t const unit : value) {
        for (int shift = 12; shift >= 0; shift -= 4) {
            text += digits[unit >> shift & 15];
        }
    }
    text += '>';
}

std::string TextString(std::string_view utf8)
{
    bool plain = true;
    for (char const character : utf8) {
        unsigned char const byte = static_cast<unsigned char>(character);
        plain = plain && byte < 0x7F && (byte >= 0x20 || byte == '\n' || byte == '\r' || byte == '\t');
    }
    if (plain) {
        return std::string(utf8);
    }
    std::string bytes = "\xFE\xFF";
    for (char16_t const unit : Kernel::Utf8ToUtf16(utf8)) {
        bytes += static_cast<char>(unit >> 8);
        bytes += static_cast<char>(unit & 0xFF);
    }
    return bytes;
}

std::string PdfDate(std::int64_t seconds)
{
    return FormatDate(seconds, "D:%04d%02d%02d%02d%02d%02dZ");
}

std::string XmpDate(std::int64_t seconds)
{
    return FormatDate(seconds, "%04d-%02d-%02dT%02d:%02d:%02dZ");
}

}
