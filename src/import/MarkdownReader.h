#pragma once

#include "import/ChapterText.h"
#include "import/Message.h"

#include <string>
#include <string_view>

namespace Import
{

/// How a chapter is to be read.
struct ReadOptions
{
    /// What messages call the file.
    std::string m_ShownName;
    /// Language if the front matter names none.
    std::string m_Language = "en";
    bool m_Smart = true;
};

/// Reads one chapter of CommonMark with tables, footnotes, strikethrough, task lists and bare links, pandoc's attribute
/// lists and front matter, and the common tags of inline HTML.
///
/// The text must be valid UTF-8. It never fails: what cannot be honoured is set as plain text or as a marked box, and
/// told in `messages` with its line. Looks at no file. Any thread; linear in the text for sane input.
ChapterText ReadMarkdown(std::string_view text, ReadOptions const & options, MessageList & messages);

}
