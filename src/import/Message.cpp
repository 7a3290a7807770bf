#include "import/Message.h"

#include "import/Text.h"

#include <algorithm>
#include <tuple>

namespace Import
{

std::string_view ToText(Severity severity)
{
    switch (severity) {
    case Severity::Note:
        return "note";
    case Severity::Warning:
        return "warning";
    case Severity::Error:
        break;
    }
    return "error";
}

namespace
{

std::string SeverityForPeople(Severity severity)
{
    switch (severity) {
    case Severity::Note:
        return Text("note", "Severity");
    case Severity::Warning:
        return Text("warning", "Severity");
    case Severity::Error:
        break;
    }
    return Text("error", "Severity");
}

}

std::string ToText(Message const & message)
{
    std::string text = message.m_Place.m_File;
    if (0 < message.m_Place.m_Line) {
        text += ':' + std::to_string(message.m_Place.m_Line);
        if (0 < message.m_Place.m_Column) {
            text += ':' + std::to_string(message.m_Place.m_Column);
        }
    }
    if (!text.empty()) {
        text += ": ";
    }
    return text + SeverityForPeople(message.m_Severity) + ": " + message.m_Text;
}

void MessageList::Add(Severity severity, std::string_view kind, Place place, std::string text)
{
    m_Messages.push_back({severity, std::string(kind), std::move(place), std::move(text)});
}

void MessageList::Note(std::string_view kind, Place place, std::string text)
{
    Add(Severity::Note, kind, std::move(place), std::move(text));
}

void MessageList::Warn(std::string_view kind, Place place, std::string text)
{
    Add(Severity::Warning, kind, std::move(place), std::move(text));
}

void MessageList::Error(std::string_view kind, Place place, std::string text)
{
    Add(Severity::Error, kind, std::move(place), std::move(text));
}

void MessageList::Append(MessageList const & other)
{
    m_Messages.insert(m_Messages.end(), other.m_Messages.begin(), other.m_Messages.end());
}

bool MessageList::HasErrors() const
{
    return std::any_of(m_Messages.begin(), m_Messages.end(),
                       [](Message const & message) { return Severity::Error == message.m_Severity; });
}

void MessageList::SortByPlace()
{
    std::stable_sort(m_Messages.begin(), m_Messages.end(), [](Message const & a, Message const & b) {
        return std::tie(a.m_Place.m_File, a.m_Place.m_Line, a.m_Place.m_Column) <
               std::tie(b.m_Place.m_File, b.m_Place.m_Line, b.m_Place.m_Column);
    });
}

}
