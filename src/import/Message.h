#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Import
{

/// A place in a file that the user wrote. Line and column count from 1; 0 means not known.
struct Place
{
    std::string m_File;
    int m_Line = 0;
    int m_Column = 0;

    friend bool operator==(Place const &, Place const &) = default;
};

/// How much a message weighs: a note informs, a warning says that something is set other than written, an error
/// means that the work cannot be done.
enum class Severity
{
    Note,
    Warning,
    Error
};

/// One sentence for the user about a place in a source.
struct Message
{
    Severity m_Severity = Severity::Warning;
    /// Short word for the kind of problem ("link-target", "picture-missing"): stable, so that scripts may look for it.
    std::string m_Kind;
    Place m_Place;
    std::string m_Text;

    friend bool operator==(Message const &, Message const &) = default;
};

/// "file:line:column: warning: text", leaving out what is not known.
std::string ToText(Message const & message);
/// The word for it in JSON and scripts, never translated.
std::string_view ToText(Severity severity);

/// Messages in the order in which they arose. A plain value, used by one thread.
class MessageList
{
public:
    void Add(Severity severity, std::string_view kind, Place place, std::string text);
    void Note(std::string_view kind, Place place, std::string text);
    void Warn(std::string_view kind, Place place, std::string text);
    void Error(std::string_view kind, Place place, std::string text);
    void Append(MessageList const & other);

    [[nodiscard]] std::vector<Message> const & All() const { return m_Messages; }
    [[nodiscard]] bool Empty() const { return m_Messages.empty(); }
    [[nodiscard]] bool HasErrors() const;
    /// Sorts by file and line, keeping the order of what stands in one place.
    void SortByPlace();

private:
    std::vector<Message> m_Messages;
};

}
