#pragma once

#include "import/ChapterText.h"
#include "import/Message.h"

#include <string>

/// A chapter as text, one line a block, so that a failing test shows what was read:
/// `h1 Title`, `p one *two* [three](0)`, `- bullet`, `#1. numbered`. Objects are `<note 0>`, `<picture 0>`, `<anchor
/// id>`,
/// `<index A!B>`; looks stand in braces: `{em text}`, `{em+strong text}`.
std::string Describe(Import::ChapterText const & chapter);
std::string Describe(Import::ChapterText const & chapter, Import::InlineText const & text);

/// "line kind" of each message, one a line.
std::string Describe(Import::MessageList const & messages);

/// Reads Markdown and describes it; messages go to `messages` if it is not null.
std::string ReadAndDescribe(std::string const & markdown, std::string * messages = nullptr);
