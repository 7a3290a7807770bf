#include "import/AttributeReader.h"

#include "import/SourceText.h"

#include <charconv>

namespace Import
{

namespace
{

bool IsNameCharacter(char c)
{
    auto const byte = static_cast<unsigned char>(c);
    return ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z') || ('0' <= c && c <= '9') || '-' == c || '_' == c ||
           ':' == c || '.' == c || 0x80 <= byte;
}

std::string_view TakeName(std::string_view text, std::size_t & at)
{
    std::size_t const start = at;
    while (at < text.size() && IsNameCharacter(text[at])) {
        ++at;
    }
    return text.substr(start, at - start);
}

/// The value after an equals sign: a name or a text in quotes, in which a backslash keeps the next character.
bool TakeValue(std::string_view text, std::size_t & at, std::string & value)
{
    if (at < text.size() && ('"' == text[at] || '\'' == text[at])) {
        char const quote = text[at++];
        while (at < text.size() && quote != text[at]) {
            if ('\\' == text[at] && at + 1 < text.size()) {
                ++at;
            }
            value += text[at++];
        }
        return at < text.size() && quote == text[at++];
    }
    while (at < text.size() && ' ' != text[at] && '}' != text[at] && '"' != text[at]) {
        value += text[at++];
    }
    return !value.empty();
}

}

std::optional<Attributes> ReadAttributes(std::string_view text, std::size_t & length)
{
    if (!text.starts_with('{')) {
        return std::nullopt;
    }
    Attributes attributes;
    std::size_t at = 1;
    for (;;) {
        while (at < text.size() && (' ' == text[at] || '\t' == text[at])) {
            ++at;
        }
        if (at == text.size()) {
            return std::nullopt;
        }
        char const c = text[at];
        if ('}' == c) {
            length = at + 1;
            return attributes;
        }
        if ('#' == c || '.' == c) {
            ++at;
            std::string_view const name = TakeName(text, at);
            if (name.empty()) {
                return std::nullopt;
            }
            if ('#' == c) {
                attributes.m_Id = name;
            } else {
                attributes.m_Classes.emplace_back(name);
            }
        } else if ('-' == c && at + 1 < text.size() && (' ' == text[at + 1] || '}' == text[at + 1])) {
            attributes.m_Classes.emplace_back("unnumbered");
            ++at;
        } else {
            std::string_view const key = TakeName(text, at);
            std::string value;
            if (key.empty() || at == text.size() || '=' != text[at++] || !TakeValue(text, at, value)) {
                return std::nullopt;
            }
            attributes.m_Values.emplace_back(key, std::move(value));
        }
        if (at < text.size() && ' ' != text[at] && '\t' != text[at] && '}' != text[at]) {
            return std::nullopt;
        }
    }
}

std::optional<Attributes> ReadAttributes(std::u16string_view text, std::size_t & length)
{
    // The list ends at the first brace outside of quotes; looking no further keeps long paragraphs cheap.
    char16_t quote = 0;
    for (std::size_t at = 0; at < text.size() && at < 2000; ++at) {
        char16_t const c = text[at];
        if (u'\u2028' == c || u'\uFFFC' == c) {
            return std::nullopt;
        }
        if (quote) {
            quote = c == quote ? char16_t{0} : quote;
        } else if ((u'"' == c || u'\'' == c) && 0 < at && u'=' == text[at - 1]) {
            quote = c;
        } else if (u'}' == c) {
            std::string const list = ToUtf8(text.substr(0, at + 1));
            std::size_t bytes = 0;
            auto result = ReadAttributes(std::string_view(list), bytes);
            if (result && bytes == list.size()) {
                length = at + 1;
                return result;
            }
            return std::nullopt;
        }
    }
    return std::nullopt;
}

bool ReadWidth(std::string_view text, double & share, double & points)
{
    double number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (std::errc() != error || !(0 < number) || 100000 < number) {
        return false;
    }
    std::string_view const unit(end, static_cast<std::size_t>(text.data() + text.size() - end));
    if ("%" == unit) {
        share = number / 100;
        return share <= 10;
    }
    double const factor = "mm" == unit                   ? 72 / 25.4
                          : "cm" == unit                 ? 72 / 2.54
                          : "in" == unit                 ? 72
                          : "pt" == unit                 ? 1
                          : "px" == unit || unit.empty() ? 0.75
                                                         : 0;
    points = number * factor;
    return 0 < factor;
}

bool ReadPageNumber(std::string_view text, int & page)
{
    int number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (std::errc() != error || text.data() + text.size() != end || number < 1) {
        return false;
    }
    page = number;
    return true;
}

}
