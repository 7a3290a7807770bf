#include "content/SectionNumbering.h"

namespace Book
{

namespace
{

constexpr int None = -1;

}

int SumOfNumbers(int a, int b)
{
    return static_cast<int>(static_cast<unsigned int>(a) + static_cast<unsigned int>(b));
}

std::vector<SectionChange> RenumberSections(std::vector<SectionFacts> const & sections, int pageCount, bool isFirst,
                                            int startFromPage, int & pageNumber)
{
    std::vector<SectionChange> changes;
    int lastNumber = None;
    int lastIndex = None;
    int trailing = 0;
    for (SectionFacts const & section : sections) {
        if (section.included) {
            trailing = 0;
        } else if (trailing == 0) {
            trailing = pageCount - section.startPageIndex;
        }
        bool const runsOn = !section.restarts && lastIndex != None;
        if (runsOn || !section.included) {
            continue;
        }
        int const number = section.number;
        int const index = section.startPageIndex;
        if (isFirst && startFromPage != number && lastNumber == None) {
            lastNumber = startFromPage;
            changes.push_back({index, pageNumber});
            lastIndex = index;
            continue;
        }
        bool const leadsChapter = lastNumber == None && !isFirst;
        if (!leadsChapter && lastNumber != SumOfNumbers(number, lastIndex - index)) {
            lastNumber = number;
            pageNumber = number;
            lastIndex = index;
            continue;
        }
        if (lastIndex != None) {
            pageNumber = SumOfNumbers(pageNumber, index - lastIndex);
        }
        if (pageNumber != number) {
            changes.push_back({index, pageNumber});
        }
        lastNumber = pageNumber;
        lastIndex = index;
    }
    // With no section to number, lastIndex is still -1 and the chapter counts one page more: following chapters have
    // always been numbered so, and books in print rely on it.
    pageNumber = SumOfNumbers(pageNumber, pageCount - trailing - lastIndex);
    return changes;
}

void FollowSections(std::vector<SectionFacts> const & sections, int pageCount, int & pageNumber)
{
    int firstIncluded = None;
    int trailing = 0;
    int lastRestart = None;
    for (SectionFacts const & section : sections) {
        if (section.included) {
            trailing = 0;
            if (firstIncluded == None) {
                firstIncluded = section.startPageIndex;
            }
        } else {
            // Unlike in renumbering, the last excluded section alone counts as the tail.
            trailing = pageCount - section.startPageIndex;
        }
        if (section.restarts) {
            pageNumber = section.number;
            lastRestart = section.startPageIndex;
        }
    }
    int const uncounted = firstIncluded == None ? 0 : trailing + firstIncluded;
    pageNumber = SumOfNumbers(pageNumber, pageCount - uncounted - lastRestart);
}

}
