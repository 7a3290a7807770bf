#pragma once

#include "import/Message.h"

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <toml++/toml.h>
#include <vector>

namespace Import
{

/// Parses TOML; what is wrong with it goes to `messages` with line and column.
std::optional<toml::table> ParseToml(std::string const & text, std::string const & shownName, MessageList & messages);

/// Reads typed values out of one table. A value of another type is an error in `messages`, with its place, and leaves
/// the variable alone; so does a key that is not there, without an error. Borrows all that it is given.
class TomlReader
{
public:
    TomlReader(toml::table const & table, std::string prefix, std::string const & file, MessageList & messages);

    bool Text(std::string_view key, std::string & value);
    bool Switch(std::string_view key, bool & value);
    bool Integer(std::string_view key, int & value, int least, int most);
    bool Number(std::string_view key, double & value);
    /// "12pt", "5mm", "1.2cm", "0.5in", or a bare number of points; may be negative.
    bool Length(std::string_view key, double & value);
    /// A text, or a list of texts.
    bool Texts(std::string_view key, std::vector<std::string> & values);
    /// One of `words`: its index.
    bool Choice(std::string_view key, std::vector<std::string_view> const & words, int & index);
    /// The table under a key, or null.
    toml::table const * Table(std::string_view key);
    void ForEachText(toml::node const & node, std::string_view key,
                     std::function<void(std::string const &, Place const &)> const & use);

    /// The node under a key, which counts as known from then on, or null.
    toml::node const * Find(std::string_view key);
    /// Warns of each key that nobody has asked for.
    void ReportUnknown();

    [[nodiscard]] Place PlaceOf(toml::node const & node) const;
    [[nodiscard]] std::string const & Prefix() const { return m_Prefix; }
    void Refuse(toml::node const & node, std::string_view key, std::string_view wanted);

private:
    toml::table const & m_Table;
    std::string m_Prefix;
    std::string const & m_File;
    MessageList & m_Messages;
    std::vector<std::string> m_Known;
};

/// A length such as "12pt" in points; false if it is none.
bool ReadLength(std::string_view text, double & points);

}
