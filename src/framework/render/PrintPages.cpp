#include "framework/render/PrintPages.h"

#include <algorithm>
#include <limits>
#include <optional>
#include <string>
#include <string_view>

namespace
{

constexpr long long MostOfRange = 100'000;
constexpr std::size_t MostInAll = 1'000'000;
/// Greater numbers are taken for this: indices beyond it could not be added to.
constexpr long long GreatestNumber = std::numeric_limits<int>::max() / 2;

bool IsSeparator(char c)
{
    return c == ',' || c == ';' || c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

/// Page numbers from 1, `m_To` not before it is known where the pages end.
struct Part
{
    long long m_From = 1;
    std::optional<long long> m_To;
};

/// Digits only; 0 is no page.
std::optional<long long> ReadNumber(std::string_view text)
{
    if (text.empty()) {
        return std::nullopt;
    }
    long long number = 0;
    for (char const c : text) {
        if (c < '0' || c > '9') {
            return std::nullopt;
        }
        number = std::min(number * 10 + (c - '0'), GreatestNumber);
    }
    return number == 0 ? std::nullopt : std::optional(number);
}

std::optional<Part> ReadPart(std::string_view text)
{
    std::size_t const dash = text.find('-');
    std::optional<long long> const from = ReadNumber(text.substr(0, dash));
    if (dash == std::string_view::npos) {
        return from ? std::optional(Part{*from, from}) : std::nullopt;
    }
    std::string_view const behind = text.substr(dash + 1);
    std::optional<long long> const to = ReadNumber(behind);
    if ((!from && dash != 0) || (!to && !behind.empty()) || (!from && !to)) {
        return std::nullopt;
    }
    return Part{from.value_or(1), to};
}

/// The text without the spaces round its dashes: "1 - 8" is one range.
std::string Joined(std::string_view text)
{
    std::string joined;
    for (std::size_t i = 0; i < text.size(); ++i) {
        std::size_t const next = text.find_first_not_of(" \t\n\r", i);
        if (next == std::string_view::npos) {
            break;
        }
        if (next != i && text[next] != '-' && !joined.empty() && joined.back() != '-') {
            joined += ' ';
        }
        joined += text[next];
        i = next;
    }
    return joined;
}

/// Calls `take` with each part; stops when it returns false.
template <typename TTake>
void ForEachPart(std::string_view written, TTake const & take)
{
    std::string const joined = Joined(written);
    std::string_view text = joined;
    while (!text.empty()) {
        if (IsSeparator(text.front())) {
            text.remove_prefix(1);
            continue;
        }
        std::size_t const length =
            static_cast<std::size_t>(std::find_if(text.begin(), text.end(), &IsSeparator) - text.begin());
        if (!take(text.substr(0, length))) {
            return;
        }
        text.remove_prefix(length);
    }
}

void AppendPart(std::vector<int> & indices, Part const & part, int pageCount, int first)
{
    long long const end = pageCount >= 0 ? pageCount : GreatestNumber;
    long long from = part.m_From;
    long long to = part.m_To.value_or(std::max(from, end));
    if (from < to) {
        to = std::max(from, std::min({to, end, from + MostOfRange - 1}));
    } else {
        from = std::max(to, std::min(from, end));
        to = std::max(to, from - MostOfRange + 1);
    }
    long long const step = from <= to ? 1 : -1;
    for (long long number = from; indices.size() < MostInAll; number += step) {
        indices.push_back(first + static_cast<int>(number - 1));
        if (number == to) {
            return;
        }
    }
}

}

std::vector<int> ParsePrintPages(String text, int pageCount, std::vector<int> const & firsts)
{
    std::vector<int> indices;
    for (int const first : firsts) {
        ForEachPart(text.View(), [&](std::string_view part) {
            if (std::optional<Part> const read = ReadPart(part)) {
                AppendPart(indices, *read, pageCount, std::clamp(first, 0, std::numeric_limits<int>::max() / 2));
            }
            return true;
        });
    }
    return indices;
}

bool CheckPrintPages(String const & text, String & problem)
{
    bool isGood = true;
    ForEachPart(text.View(), [&](std::string_view part) {
        isGood = ReadPart(part).has_value();
        if (!isGood) {
            problem = String(std::string(part));
        }
        return isGood;
    });
    return isGood;
}
