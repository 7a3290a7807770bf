#include "framework/render/PdfPageLabels.h"

#include <algorithm>

namespace Renderer::RenderTree
{

namespace
{

constexpr int LargestRoman = 3999;
/// Longer runs of digits than this are no page numbers.
constexpr std::size_t MostDigits = 8;

std::string Upper(std::string text)
{
    for (char & character : text) {
        character = character >= 'a' && character <= 'z' ? static_cast<char>(character - 'a' + 'A') : character;
    }
    return text;
}

int FromRoman(std::string_view text)
{
    int value = 0;
    int previous = 0;
    for (auto character = text.rbegin(); character != text.rend(); ++character) {
        static constexpr std::string_view letters = "ivxlcdm";
        static constexpr int values[] = {1, 5, 10, 50, 100, 500, 1000};
        std::size_t const letter = letters.find(*character);
        if (letter == std::string_view::npos || value > LargestRoman) {
            return 0;
        }
        value += values[letter] < previous ? -values[letter] : values[letter];
        previous = std::max(previous, values[letter]);
    }
    return value >= 1 && value <= LargestRoman && ToRoman(value) == text ? value : 0;
}

/// All ways to read a label as the start of a range, the likeliest first.
std::vector<PdfLabelRange> Readings(std::string_view label, std::size_t page)
{
    std::vector<PdfLabelRange> readings;
    std::size_t digits = 0;
    while (digits < std::min(label.size(), MostDigits) && label[label.size() - 1 - digits] >= '0' &&
           label[label.size() - 1 - digits] <= '9') {
        ++digits;
    }
    // Leading zeros belong to the prefix, as readers write none.
    std::size_t start = label.size() - digits;
    while (start < label.size() && label[start] == '0') {
        ++start;
    }
    if (start < label.size() && digits > 0) {
        readings.push_back({page, PdfLabelRange::Style::Decimal, std::string(label.substr(0, start)),
                            std::stoi(std::string(label.substr(start)))});
    } else {
        std::size_t letters = 0;
        while (letters < label.size() && std::string_view("ivxlcdmIVXLCDM").find(label[label.size() - 1 - letters]) !=
                                             std::string_view::npos) {
            ++letters;
        }
        for (std::size_t begin = label.size() - letters; begin < label.size(); ++begin) {
            std::string const tail(label.substr(begin));
            std::string const prefix(label.substr(0, begin));
            if (int const lower = FromRoman(tail)) {
                readings.push_back({page, PdfLabelRange::Style::RomanLower, prefix, lower});
            }
            std::string lowered = tail;
            std::transform(tail.begin(), tail.end(), lowered.begin(),
                           [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; });
            if (int const upper = Upper(tail) == tail ? FromRoman(lowered) : 0) {
                readings.push_back({page, PdfLabelRange::Style::RomanUpper, prefix, upper});
            }
        }
    }
    readings.push_back({page, PdfLabelRange::Style::None, std::string(label), 1});
    return readings;
}

}

std::string ToRoman(int number)
{
    static constexpr struct
    {
        int m_Value;
        char const * m_Text;
    } numerals[] = {{1000, "m"}, {900, "cm"}, {500, "d"}, {400, "cd"}, {100, "c"}, {90, "xc"}, {50, "l"},
                    {40, "xl"},  {10, "x"},   {9, "ix"},  {5, "v"},    {4, "iv"},  {1, "i"}};
    std::string text;
    for (auto const & numeral : numerals) {
        for (; number >= numeral.m_Value; number -= numeral.m_Value) {
            text += numeral.m_Text;
        }
    }
    return text;
}

std::string LabelOf(PdfLabelRange const & range, std::size_t offset)
{
    std::size_t const number = static_cast<std::size_t>(range.m_Start) + offset;
    switch (range.m_Style) {
    case PdfLabelRange::Style::None:
        return range.m_Prefix;
    case PdfLabelRange::Style::Decimal:
        return range.m_Prefix + std::to_string(number);
    case PdfLabelRange::Style::RomanLower:
    case PdfLabelRange::Style::RomanUpper:
        // Readers go on beyond this in ways of their own; no label is ever compared equal there.
        if (number > LargestRoman) {
            return range.m_Prefix + "?";
        }
        return range.m_Prefix + (range.m_Style == PdfLabelRange::Style::RomanLower
                                     ? ToRoman(static_cast<int>(number))
                                     : Upper(ToRoman(static_cast<int>(number))));
    }
    return {};
}

std::vector<PdfLabelRange> CompressPageLabels(std::vector<std::string_view> const & labels)
{
    std::vector<PdfLabelRange> ranges;
    for (std::size_t page = 0; page < labels.size();) {
        PdfLabelRange best;
        std::size_t bestEnd = page;
        for (PdfLabelRange const & reading : Readings(labels[page], page)) {
            std::size_t end = page + 1;
            while (end < labels.size() && LabelOf(reading, end - page) == labels[end]) {
                ++end;
            }
            if (end > bestEnd) {
                bestEnd = end;
                best = reading;
            }
        }
        ranges.push_back(best);
        page = bestEnd;
    }
    return ranges;
}

}
