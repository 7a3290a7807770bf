#include "app/PaperSize.h"

#include <charconv>
#include <cmath>

namespace App
{

namespace
{

constexpr double PointsOfInch = 72;
constexpr double PointsOfMillimetre = 72 / 25.4;
constexpr double GreatestLength = 100'000 * PointsOfMillimetre;

struct Unit
{
    std::string_view m_Name;
    double m_Points;
};

constexpr Unit Units[] = {{"mm", PointsOfMillimetre}, {"cm", 10 * PointsOfMillimetre}, {"in", PointsOfInch},
                          {"\"", PointsOfInch},       {"pt", 1},                       {"", 1}};

struct Paper
{
    std::string_view m_Name;
    double m_Width;
    double m_Height;
    double m_Points;
};

constexpr Paper Papers[] = {
    {"a0", 841, 1189, PointsOfMillimetre}, {"a1", 594, 841, PointsOfMillimetre},  {"a2", 420, 594, PointsOfMillimetre},
    {"a3", 297, 420, PointsOfMillimetre},  {"a4", 210, 297, PointsOfMillimetre},  {"a5", 148, 210, PointsOfMillimetre},
    {"a6", 105, 148, PointsOfMillimetre},  {"a7", 74, 105, PointsOfMillimetre},   {"a8", 52, 74, PointsOfMillimetre},
    {"b3", 353, 500, PointsOfMillimetre},  {"b4", 250, 353, PointsOfMillimetre},  {"b5", 176, 250, PointsOfMillimetre},
    {"b6", 125, 176, PointsOfMillimetre},  {"letter", 8.5, 11, PointsOfInch},     {"legal", 8.5, 14, PointsOfInch},
    {"tabloid", 11, 17, PointsOfInch},     {"executive", 7.25, 10.5, PointsOfInch}};

/// In small letters and without spaces.
std::string Lowered(std::string_view text)
{
    std::string lowered(text);
    std::erase(lowered, ' ');
    for (char & c : lowered) {
        c = 'A' <= c && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    }
    return lowered;
}

/// A plain number and what stands behind it.
std::optional<double> ReadNumber(std::string_view text, std::string_view & behind)
{
    double number = 0;
    auto const read = std::from_chars(text.data(), text.data() + text.size(), number, std::chars_format::fixed);
    if (read.ec != std::errc() || !std::isfinite(number) || number < 0) {
        return std::nullopt;
    }
    behind = text.substr(static_cast<std::size_t>(read.ptr - text.data()));
    return number;
}

std::optional<double> PointsOf(std::string_view unit)
{
    for (Unit const & known : Units) {
        if (unit == known.m_Name) {
            return known.m_Points;
        }
    }
    return std::nullopt;
}

}

std::optional<double> ReadLength(std::string_view text)
{
    std::string const lowered = Lowered(text);
    std::string_view unit;
    std::optional<double> const number = ReadNumber(lowered, unit);
    std::optional<double> const points = number ? PointsOf(unit) : std::nullopt;
    if (!points || *number * *points > GreatestLength) {
        return std::nullopt;
    }
    return *number * *points;
}

std::optional<Kernel::Size> ReadLengths(std::string_view text)
{
    std::string const lowered = Lowered(text);
    std::size_t const times = lowered.find('x');
    if (times == std::string::npos) {
        std::optional<double> const both = ReadLength(lowered);
        return both ? std::optional(Kernel::Size{*both, *both}) : std::nullopt;
    }
    std::string const second = lowered.substr(times + 1);
    std::string first = lowered.substr(0, times);
    std::string_view firstUnit;
    std::string_view secondUnit;
    if (!ReadNumber(first, firstUnit) || !ReadNumber(second, secondUnit)) {
        return std::nullopt;
    }
    if (firstUnit.empty()) {
        first += secondUnit;
    }
    std::optional<double> const width = ReadLength(first);
    std::optional<double> const height = ReadLength(second);
    return width && height ? std::optional(Kernel::Size{*width, *height}) : std::nullopt;
}

std::optional<Kernel::Size> ReadPaper(std::string_view text)
{
    std::string const lowered = Lowered(text);
    for (Paper const & paper : Papers) {
        if (lowered == paper.m_Name) {
            return Kernel::Size{paper.m_Width * paper.m_Points, paper.m_Height * paper.m_Points};
        }
    }
    std::optional<Kernel::Size> const size =
        lowered.find('x') == std::string::npos ? std::nullopt : ReadLengths(lowered);
    return size && size->width >= 1 && size->height >= 1 ? size : std::nullopt;
}

std::optional<double> ReadScale(std::string_view text)
{
    std::string_view behind;
    std::optional<double> const number = ReadNumber(text, behind);
    if (!number || (!behind.empty() && behind != "%")) {
        return std::nullopt;
    }
    double const scale = behind.empty() ? *number : *number / 100;
    return scale >= 0.01 && scale <= 100 ? std::optional(scale) : std::nullopt;
}

}
