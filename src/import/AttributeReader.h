#pragma once

#include "import/ChapterText.h"

#include <optional>
#include <string_view>

namespace Import
{

/// Reads `{#id .class key=value key="with spaces"}` at the start of `text`; `length` becomes the number of characters
/// that it takes. Nothing if no well-formed list stands there. `{}` is one too.
std::optional<Attributes> ReadAttributes(std::u16string_view text, std::size_t & length);

/// The same for a list that is known to be UTF-8.
std::optional<Attributes> ReadAttributes(std::string_view text, std::size_t & length);

/// A length such as "60%", "5cm", "40mm", "2in", "120pt", "300px" (96 to the inch): a share of the measure or points.
/// False if it is none of these or not above zero.
bool ReadWidth(std::string_view text, double & share, double & points);

/// A page of a PDF: a whole number from 1 on, in digits. False, and `page` as it was, if it is something else.
bool ReadPageNumber(std::string_view text, int & page);

}
