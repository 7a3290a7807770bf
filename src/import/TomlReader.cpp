#include "import/TomlReader.h"

#include "import/Text.h"

#include <algorithm>
#include <charconv>

namespace Import
{

std::optional<toml::table> ParseToml(std::string const & text, std::string const & shownName, MessageList & messages)
{
    try {
        return toml::parse(std::string_view(text), std::string_view(shownName));
    } catch (toml::parse_error const & error) {
        auto const place = error.source().begin;
        messages.Error("toml-syntax", {shownName, static_cast<int>(place.line), static_cast<int>(place.column)},
                       std::string(error.description()) + ".");
        return std::nullopt;
    }
}

bool ReadLength(std::string_view text, double & points)
{
    double number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    std::string_view const unit(end, static_cast<std::size_t>(text.data() + text.size() - end));
    double const factor = "pt" == unit   ? 1
                          : "mm" == unit ? 72 / 25.4
                          : "cm" == unit ? 72 / 2.54
                          : "in" == unit ? 72
                                         : 0;
    if (std::errc() != error || 0 == factor || !(std::abs(number * factor) < 20000)) {
        return false;
    }
    points = number * factor;
    return true;
}

TomlReader::TomlReader(toml::table const & table, std::string prefix, std::string const & file, MessageList & messages)
    : m_Table(table),
      m_Prefix(std::move(prefix)),
      m_File(file),
      m_Messages(messages)
{
}

toml::node const * TomlReader::Find(std::string_view key)
{
    m_Known.emplace_back(key);
    return m_Table.get(key);
}

Place TomlReader::PlaceOf(toml::node const & node) const
{
    return {m_File, static_cast<int>(node.source().begin.line), static_cast<int>(node.source().begin.column)};
}

void TomlReader::Refuse(toml::node const & node, std::string_view key, std::string_view wanted)
{
    m_Messages.Error("toml-value", PlaceOf(node),
                     Import::Text("\"%1\" has to be %2.", "Source", m_Prefix + std::string(key), wanted));
}

void TomlReader::ReportUnknown()
{
    for (auto const & [key, node] : m_Table) {
        if (std::find(m_Known.begin(), m_Known.end(), std::string(key.str())) == m_Known.end()) {
            Place const place{m_File, static_cast<int>(key.source().begin.line),
                              static_cast<int>(key.source().begin.column)};
            m_Messages.Warn("toml-key", place,
                            Import::Text("The key \"%1\" is not known and has no effect.", "Source",
                                         m_Prefix + std::string(key.str())));
        }
    }
}

bool TomlReader::Text(std::string_view key, std::string & value)
{
    auto const * node = Find(key);
    if (node && !node->is_string()) {
        Refuse(*node, key, Import::Text("a text in quotes", "Source"));
        return false;
    }
    if (node) {
        value = node->as_string()->get();
    }
    return nullptr != node;
}

bool TomlReader::Switch(std::string_view key, bool & value)
{
    auto const * node = Find(key);
    if (node && !node->is_boolean()) {
        Refuse(*node, key, Import::Text("true or false", "Source"));
        return false;
    }
    if (node) {
        value = node->as_boolean()->get();
    }
    return nullptr != node;
}

bool TomlReader::Integer(std::string_view key, int & value, int least, int most)
{
    auto const * node = Find(key);
    if (!node) {
        return false;
    }
    auto const * number = node->as_integer();
    if (!number || number->get() < least || most < number->get()) {
        Refuse(*node, key, Import::Text("a whole number from %1 to %2", "Source", least, most));
        return false;
    }
    value = static_cast<int>(number->get());
    return true;
}

bool TomlReader::Number(std::string_view key, double & value)
{
    auto const * node = Find(key);
    auto const number = node ? node->value<double>() : std::optional<double>();
    if (node && (!number || !(std::abs(*number) < 100000))) {
        Refuse(*node, key, Import::Text("a number", "Source"));
        return false;
    }
    value = number.value_or(value);
    return number.has_value();
}

bool TomlReader::Length(std::string_view key, double & value)
{
    auto const * node = Find(key);
    if (!node) {
        return false;
    }
    if (auto const number = node->is_number() ? node->value<double>() : std::optional<double>();
        number && std::abs(*number) < 20000) {
        value = *number;
        return true;
    }
    if (!node->is_string() || !ReadLength(node->as_string()->get(), value)) {
        Refuse(*node, key, Import::Text("a length such as \"12pt\" or \"5mm\"", "Source"));
        return false;
    }
    return true;
}

bool TomlReader::Texts(std::string_view key, std::vector<std::string> & values)
{
    auto const * node = Find(key);
    if (!node) {
        return false;
    }
    values.clear();
    if (node->is_string()) {
        values.push_back(node->as_string()->get());
    } else {
        ForEachText(*node, key, [&](std::string const & text, Place const &) { values.push_back(text); });
    }
    return true;
}

bool TomlReader::Choice(std::string_view key, std::vector<std::string_view> const & words, int & index)
{
    auto const * node = Find(key);
    if (!node) {
        return false;
    }
    auto const word = node->is_string() ? std::find(words.begin(), words.end(), node->as_string()->get()) : words.end();
    if (word == words.end()) {
        std::string list;
        for (std::string_view const candidate : words) {
            list += (list.empty() ? "\"" : ", \"") + std::string(candidate) + "\"";
        }
        Refuse(*node, key, Import::Text("one of %1", "Source", list));
        return false;
    }
    index = static_cast<int>(word - words.begin());
    return true;
}

toml::table const * TomlReader::Table(std::string_view key)
{
    auto const * node = Find(key);
    if (node && !node->is_table()) {
        Refuse(*node, key, Import::Text("a table, written [%1]", "Source", m_Prefix + std::string(key)));
        return nullptr;
    }
    return node ? node->as_table() : nullptr;
}

void TomlReader::ForEachText(toml::node const & node, std::string_view key,
                             std::function<void(std::string const &, Place const &)> const & use)
{
    auto const * list = node.as_array();
    if (!list) {
        Refuse(node, key, Import::Text("a list of texts", "Source"));
        return;
    }
    for (toml::node const & element : *list) {
        if (auto const * text = element.as_string()) {
            use(text->get(), PlaceOf(element));
        } else {
            Refuse(element, key, Import::Text("a list of texts", "Source"));
        }
    }
}

}
