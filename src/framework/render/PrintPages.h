#pragma once

#include <vector>

#include "framework/kernel/StringT.h"

/// Reads a user's choice of pages: numbers from 1 and ranges, separated by commas or spaces, such as "1-8,3".
///
/// "5-" goes to the end, "-3" begins at the first page, "5-2" goes backwards. What comes twice is kept twice. Parts that
/// can't be read are left out; `CheckPrintPages` tells of them.
///
/// \param pageCount pages there are, where ranges end; -1 if that is not known
/// \param firsts where counting begins, as page indices: numbers count from each of these, and the result has the whole
///        choice for each, one after the other
/// \return page indices from 0. At most 100,000 for a range and 1,000,000 in all; a range that begins beyond its limit
///         gives its first page alone, so that a choice of pages that don't exist is not taken for no choice.
[[nodiscard]] std::vector<int> ParsePrintPages(String text, int pageCount, std::vector<int> const & firsts);

/// True if every part of the text can be read. Otherwise the first part that can't is in `problem`. An empty text is
/// fine: it chooses nothing.
[[nodiscard]] bool CheckPrintPages(String const & text, String & problem);
