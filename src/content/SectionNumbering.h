#pragma once

#include <vector>

namespace Book
{

/// What numbering needs to know of one section of a chapter document.
struct SectionFacts
{
    int startPageIndex = 0; ///< Zero-based index of its first page in the document.
    int number = 1;         ///< Page number of that page.
    bool restarts = false;  ///< It sets its own number rather than running on.
    bool included = true;   ///< Its pages count in the book.
};

/// A section's new number.
struct SectionChange
{
    int startPageIndex = 0;
    int number = 0;
    friend bool operator==(SectionChange const &, SectionChange const &) = default;
};

/// The sum of a page number and a count. A damaged document may number its pages beyond all numbers: then it wraps.
[[nodiscard]] int SumOfNumbers(int a, int b);

/// The changes that make a chapter's sections run on from `pageNumber`, which moves on to the number for the page after
/// the chapter. `sections` are in page order. `isFirst` marks the book's first chapter, and `startFromPage` is that
/// chapter's own start page, 0 if it has none.
///
/// The first included section takes the running number. A later section that restarts out of step with the pages before
/// it was numbered on purpose: it keeps its number, and the running number goes on from there.
std::vector<SectionChange> RenumberSections(std::vector<SectionFacts> const & sections, int pageCount, bool isFirst,
                                            int startFromPage, int & pageNumber);

/// Moves `pageNumber` over a chapter whose sections stay as they are.
void FollowSections(std::vector<SectionFacts> const & sections, int pageCount, int & pageNumber);

}
