#pragma once

#include "framework/story/StyleSheet.h"
#include "import/TomlReader.h"

#include <map>

namespace Import
{

using ColourTable = std::map<std::string, Story::Colour, std::less<>>;

/// "#8a1c1c", "grey(0.4)", "rgb(0.5, 0, 0)", "cmyk(0, 0.9, 0.8, 0.2)", or a name in `colours`; nothing otherwise.
std::optional<Story::Colour> ReadColour(std::string_view text, ColourTable const & colours);

/// Reads the attributes of one style out of its table. `paragraphAtts` is null for a character style.
void ReadStyleAttributes(TomlReader & reader, ColourTable const & colours, Story::AttSet & glyphAtts,
                         Story::AttSet * paragraphAtts);

}
