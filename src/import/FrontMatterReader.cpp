#include "import/FrontMatterReader.h"

#include "import/Text.h"

namespace Import
{

namespace
{

std::string_view Trimmed(std::string_view text)
{
    std::size_t const first = text.find_first_not_of(" \t\r");
    if (std::string_view::npos == first) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(" \t\r") - first + 1);
}

std::string_view TakeLine(std::string_view & text)
{
    std::size_t const end = text.find('\n');
    std::string_view line = text.substr(0, end);
    text.remove_prefix(std::string_view::npos == end ? text.size() : end + 1);
    if (line.ends_with('\r')) {
        line.remove_suffix(1);
    }
    return line;
}

/// One value; takes it off the front of `text`. A plain one ends at a comment or, in a list, at a comma or bracket.
bool TakeScalar(std::string_view & text, bool inList, std::string & value)
{
    text = Trimmed(text);
    if (text.starts_with('"') || text.starts_with('\'')) {
        char const quote = text.front();
        std::size_t at = 1;
        for (; at < text.size(); ++at) {
            if ('\'' == quote && '\'' == text[at] && at + 1 < text.size() && '\'' == text[at + 1]) {
                ++at;
            } else if (quote == text[at]) {
                break;
            } else if ('"' == quote && '\\' == text[at] && at + 1 < text.size()) {
                ++at;
            }
            value += text[at];
        }
        if (at == text.size()) {
            return false;
        }
        text = Trimmed(text.substr(at + 1));
        return true;
    }
    std::size_t end = text.size();
    for (std::size_t at = 0; at < text.size(); ++at) {
        bool const isComment = '#' == text[at] && (0 == at || ' ' == text[at - 1]);
        if (isComment || (inList && (',' == text[at] || ']' == text[at]))) {
            end = at;
            break;
        }
    }
    value = Trimmed(text.substr(0, end));
    text.remove_prefix(end);
    return true;
}

bool TakeList(std::string_view text, std::vector<std::string> & values)
{
    text.remove_prefix(1);
    for (;;) {
        text = Trimmed(text);
        if (text.starts_with(']')) {
            return true;
        }
        std::string value;
        if (text.empty() || !TakeScalar(text, true, value)) {
            return false;
        }
        values.push_back(std::move(value));
        text = Trimmed(text);
        if (text.starts_with(',')) {
            text.remove_prefix(1);
        } else if (!text.starts_with(']')) {
            // The line ends here, or the rest of it is a comment.
            return false;
        }
    }
}

}

FrontMatter ReadFrontMatter(std::string_view text, std::string const & shownName, MessageList & messages)
{
    FrontMatter result;
    std::string_view rest = text;
    if (!text.starts_with("---") || "---" != Trimmed(TakeLine(rest))) {
        return result;
    }
    // A thematic break also looks like this: it is front matter only if it ends and its first line has a key.
    std::string_view look = rest;
    int lines = 1;
    bool isEnded = false;
    while (!look.empty() && !isEnded) {
        std::string_view const line = Trimmed(TakeLine(look));
        ++lines;
        isEnded = "---" == line || "..." == line;
        if (2 == lines && !isEnded && std::string_view::npos == line.find(':') && !line.starts_with('#')) {
            return result;
        }
    }
    if (!isEnded) {
        return result;
    }
    result.m_Lines = lines;

    std::string key;
    for (int number = 2; number < lines; ++number) {
        std::string_view line = TakeLine(rest);
        bool const isNested = line.starts_with(' ') || line.starts_with('\t');
        line = Trimmed(line);
        if (line.empty() || line.starts_with('#')) {
            continue;
        }
        std::vector<std::string> values;
        bool isGood = true;
        if (line.starts_with("- ") && !key.empty()) {
            line.remove_prefix(2);
            isGood = TakeScalar(line, false, values.emplace_back());
        } else if (isNested) {
            continue;
        } else {
            std::size_t const colon = line.find(':');
            if (std::string_view::npos == colon) {
                messages.Warn("front-matter", {shownName, number, 1},
                              Text("This line of the front matter has no \"key: value\".", "Source"));
                continue;
            }
            key = Trimmed(line.substr(0, colon));
            line = Trimmed(line.substr(colon + 1));
            if (line.empty()) {
                continue;
            }
            isGood = line.starts_with('[') ? TakeList(line, values) : TakeScalar(line, false, values.emplace_back());
        }
        bool const isOurs = "title" == key || "author" == key || "authors" == key || "lang" == key;
        if (!isOurs || (isGood && values.empty())) {
            continue;
        }
        if (!isGood) {
            messages.Warn("front-matter", {shownName, number, 1},
                          Text("The value of \"%1\" is not closed by its quotation mark or bracket; it is ignored.",
                               "Source", key));
        } else if ("title" == key) {
            result.m_Title = values.front();
        } else if ("lang" == key) {
            result.m_Language = values.front();
        } else {
            result.m_Authors.insert(result.m_Authors.end(), values.begin(), values.end());
        }
    }
    return result;
}

}
