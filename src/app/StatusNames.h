#pragma once

#include "app/TextTable.h"
#include "core/BookChapter.h"

namespace App
{

/// The names of the statuses in JSON: stable words, not the user's language.
[[nodiscard]] char const * NameOf(Book::BookChapter::Status status);
/// The same for people, in a word or two.
[[nodiscard]] TableCell Describe(Book::BookChapter::Status status);

}
