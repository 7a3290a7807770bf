#include "import/HtmlTokens.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <unicode/utf8.h>

namespace Import
{

namespace
{

struct NamedCharacter
{
    std::string_view m_Name;
    std::string_view m_Text;
};

constexpr std::array g_Characters{
    NamedCharacter{"amp", "&"},        NamedCharacter{"lt", "<"},         NamedCharacter{"gt", ">"},
    NamedCharacter{"quot", "\""},      NamedCharacter{"apos", "'"},       NamedCharacter{"nbsp", "\u00A0"},
    NamedCharacter{"copy", "\u00A9"},  NamedCharacter{"reg", "\u00AE"},   NamedCharacter{"trade", "\u2122"},
    NamedCharacter{"deg", "\u00B0"},   NamedCharacter{"times", "\u00D7"}, NamedCharacter{"middot", "\u00B7"},
    NamedCharacter{"ndash", "\u2013"}, NamedCharacter{"mdash", "\u2014"}, NamedCharacter{"hellip", "\u2026"},
    NamedCharacter{"lsquo", "\u2018"}, NamedCharacter{"rsquo", "\u2019"}, NamedCharacter{"ldquo", "\u201C"},
    NamedCharacter{"rdquo", "\u201D"}, NamedCharacter{"laquo", "\u00AB"}, NamedCharacter{"raquo", "\u00BB"},
    NamedCharacter{"bull", "\u2022"},  NamedCharacter{"shy", "\u00AD"},   NamedCharacter{"thinsp", "\u2009"},
    NamedCharacter{"ensp", "\u2002"},  NamedCharacter{"emsp", "\u2003"},  NamedCharacter{"euro", "\u20AC"},
    NamedCharacter{"pound", "\u00A3"}, NamedCharacter{"sect", "\u00A7"},  NamedCharacter{"para", "\u00B6"},
    NamedCharacter{"rarr", "\u2192"},  NamedCharacter{"larr", "\u2190"},
};

bool IsNameCharacter(char c)
{
    return ('a' <= c && c <= 'z') || ('A' <= c && c <= 'Z') || ('0' <= c && c <= '9') || '-' == c || '_' == c ||
           ':' == c;
}

bool IsSpace(char c)
{
    return ' ' == c || '\t' == c || '\n' == c || '\r' == c || '\f' == c;
}

std::string Lowered(std::string_view text)
{
    std::string result(text);
    for (char & c : result) {
        c = 'A' <= c && c <= 'Z' ? static_cast<char>(c + 32) : c;
    }
    return result;
}

void SkipSpace(std::string_view text, std::size_t & at)
{
    while (at < text.size() && IsSpace(text[at])) {
        ++at;
    }
}

std::string_view TakeName(std::string_view text, std::size_t & at)
{
    std::size_t const start = at;
    while (at < text.size() && IsNameCharacter(text[at])) {
        ++at;
    }
    return text.substr(start, at - start);
}

/// The value after an equals sign; false if its quotation mark never closes.
bool TakeValue(std::string_view text, std::size_t & at, std::string & value)
{
    SkipSpace(text, at);
    if (at < text.size() && ('"' == text[at] || '\'' == text[at])) {
        std::size_t const end = text.find(text[at], at + 1);
        if (std::string_view::npos == end) {
            return false;
        }
        value = DecodeCharacterReferences(text.substr(at + 1, end - at - 1));
        at = end + 1;
        return true;
    }
    std::size_t const start = at;
    while (at < text.size() && !IsSpace(text[at]) && '>' != text[at]) {
        ++at;
    }
    value = DecodeCharacterReferences(text.substr(start, at - start));
    return true;
}

/// The tag that starts at `at`, which moves behind it; false and unmoved if there is none.
bool TakeTag(std::string_view html, std::size_t & at, HtmlToken & token)
{
    std::size_t next = at + 1;
    bool const isClosing = next < html.size() && '/' == html[next];
    next += isClosing ? 1 : 0;
    std::string_view const name = TakeName(html, next);
    if (name.empty() || !(('a' <= name[0] && name[0] <= 'z') || ('A' <= name[0] && name[0] <= 'Z'))) {
        return false;
    }
    token.m_Kind = isClosing ? HtmlToken::Kind::CloseTag : HtmlToken::Kind::OpenTag;
    token.m_Name = Lowered(name);
    for (;;) {
        SkipSpace(html, next);
        if (next == html.size()) {
            return false;
        }
        if ('>' == html[next]) {
            at = next + 1;
            return true;
        }
        if ('/' == html[next]) {
            token.m_IsSelfClosing = true;
            ++next;
            continue;
        }
        std::string const key = Lowered(TakeName(html, next));
        if (key.empty()) {
            return false;
        }
        std::string value;
        SkipSpace(html, next);
        if (next < html.size() && '=' == html[next]) {
            ++next;
            if (!TakeValue(html, next, value)) {
                return false;
            }
        }
        token.m_Attributes.emplace_back(key, std::move(value));
    }
}

}

std::string const & HtmlToken::Value(std::string_view name) const
{
    static std::string const empty;
    auto const found = std::find_if(m_Attributes.begin(), m_Attributes.end(),
                                    [name](auto const & attribute) { return attribute.first == name; });
    return found == m_Attributes.end() ? empty : found->second;
}

std::string DecodeCharacterReferences(std::string_view text)
{
    std::string result;
    for (std::size_t at = 0; at < text.size(); ++at) {
        std::size_t const end = '&' == text[at] ? text.find(';', at) : std::string_view::npos;
        if (std::string_view::npos == end || 12 < end - at || end < at + 2) {
            result += text[at];
            continue;
        }
        std::string_view name = text.substr(at + 1, end - at - 1);
        if ('#' == name.front()) {
            name.remove_prefix(1);
            bool const isHex = name.starts_with('x') || name.starts_with('X');
            name.remove_prefix(isHex ? 1 : 0);
            std::uint32_t code = 0;
            auto const [stop, error] = std::from_chars(name.data(), name.data() + name.size(), code, isHex ? 16 : 10);
            bool const isGood =
                std::errc() == error && stop == name.data() + name.size() && U_IS_UNICODE_CHAR(code) && 0 < code;
            if (isGood) {
                char bytes[4];
                std::int32_t length = 0;
                U8_APPEND_UNSAFE(bytes, length, code);
                result.append(bytes, static_cast<std::size_t>(length));
                at = end;
                continue;
            }
        } else if (auto const found = std::find_if(g_Characters.begin(), g_Characters.end(),
                                                   [name](NamedCharacter const & c) { return c.m_Name == name; });
                   found != g_Characters.end()) {
            result += found->m_Text;
            at = end;
            continue;
        }
        result += text[at];
    }
    return result;
}

std::vector<HtmlToken> TokeniseHtml(std::string_view html)
{
    std::vector<HtmlToken> tokens;
    std::size_t textStart = 0;
    int line = 0;
    int textLine = 0;
    auto const flush = [&](std::size_t end) {
        if (textStart < end) {
            HtmlToken token;
            token.m_Text = DecodeCharacterReferences(html.substr(textStart, end - textStart));
            token.m_LineOffset = textLine;
            tokens.push_back(std::move(token));
        }
    };
    std::size_t at = 0;
    while (at < html.size()) {
        if ('<' != html[at]) {
            line += '\n' == html[at] ? 1 : 0;
            ++at;
            continue;
        }
        HtmlToken token;
        token.m_LineOffset = line;
        std::size_t const start = at;
        std::string_view const rest = html.substr(at);
        if (rest.starts_with("<!--")) {
            std::size_t const end = html.find("-->", at + 4);
            token.m_Kind = HtmlToken::Kind::Comment;
            token.m_Text = html.substr(at + 4, std::string_view::npos == end ? end : end - at - 4);
            at = std::string_view::npos == end ? html.size() : end + 3;
        } else if (rest.starts_with("<!") || rest.starts_with("<?")) {
            std::size_t const end = html.find('>', at);
            token.m_Kind = HtmlToken::Kind::Comment;
            at = std::string_view::npos == end ? html.size() : end + 1;
        } else if (!TakeTag(html, at, token)) {
            ++at;
            continue;
        }
        flush(start);
        line += static_cast<int>(std::count(html.begin() + static_cast<std::ptrdiff_t>(start),
                                            html.begin() + static_cast<std::ptrdiff_t>(at), '\n'));
        textStart = at;
        textLine = line;
        tokens.push_back(std::move(token));
    }
    flush(html.size());
    return tokens;
}

}
