#pragma once

#include "import/Message.h"

#include <nlohmann/json.hpp>

namespace App
{

/// JSON whose keys keep the order in which they were set, so that people can read it.
using Json = nlohmann::ordered_json;

/// Messages as a list of objects: severity, kind, file, line, column, text; what is not known is left out.
Json ToJson(Import::MessageList const & messages);

/// The text of a JSON document, indented by two. Bytes that are not UTF-8 become U+FFFD.
std::string Print(Json const & json);

/// The same on one line, for output that is read as it comes.
std::string ToLine(Json const & json);

}
