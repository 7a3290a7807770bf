#pragma once

#include "import/ChapterText.h"
#include "import/Message.h"

#include <string_view>

namespace Import
{

/// Reads a YAML block between `---` lines at the start of a chapter: `title`, `author` (a text or a list) and `lang`.
/// A small and safe part of YAML: plain, single- and double-quoted texts, lists in brackets or on lines with dashes.
/// Other keys are passed by in silence, since other tools own them; what cannot be read is a warning. Without such a
/// block `m_Lines` is 0; otherwise it is the number of lines to leave out.
FrontMatter ReadFrontMatter(std::string_view text, std::string const & shownName, MessageList & messages);

}
