#include "app/Json.h"

namespace App
{

Json ToJson(Import::MessageList const & messages)
{
    Json list = Json::array();
    for (Import::Message const & message : messages.All()) {
        Json entry{{"severity", Import::ToText(message.m_Severity)}, {"kind", message.m_Kind}};
        if (!message.m_Place.m_File.empty()) {
            entry["file"] = message.m_Place.m_File;
        }
        if (0 < message.m_Place.m_Line) {
            entry["line"] = message.m_Place.m_Line;
        }
        if (0 < message.m_Place.m_Column) {
            entry["column"] = message.m_Place.m_Column;
        }
        entry["text"] = message.m_Text;
        list.push_back(std::move(entry));
    }
    return list;
}

std::string Print(Json const & json)
{
    return json.dump(2, ' ', false, Json::error_handler_t::replace);
}

std::string ToLine(Json const & json)
{
    return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

}
