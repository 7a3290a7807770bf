#pragma once

#include "app/TextTable.h"
#include "core/BookChapter.h"

namespace App
{

/// The names of the statuses in JSON: stable words, not the user's language.
[[nodiscard]] char const * NameOf(Book::BookChapter::Status status);
/// How the chapter stands, for people, in a word or two. A file that is there and can't be used is another matter than
/// one that is gone.
[[nodiscard]] TableCell Describe(Book::BookChapter const & chapter);
/// Why a chapter that is missing, unusable or locked is so, and what helps; empty for any other. Tries the file again,
/// since a state keeps no reasons.
[[nodiscard]] std::string Explain(Book::BookChapter const & chapter);

}
