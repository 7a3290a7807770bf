#include "content/SectionNumbering.h"

#include <gtest/gtest.h>

#include <limits>

namespace Book
{

void PrintTo(SectionChange const & change, std::ostream * stream)
{
    *stream << "page index " << change.startPageIndex << " -> " << change.number;
}

namespace
{

constexpr int Largest = std::numeric_limits<int>::max();
constexpr bool Restarts = true;
constexpr bool RunsOn = false;
constexpr bool Included = true;
constexpr bool Excluded = false;

struct RenumberCase
{
    char const * why;
    std::vector<SectionFacts> sections;
    int pageCount;
    bool isFirst;
    int startFromPage;
    int entered;
    std::vector<SectionChange> changes;
    int left;
};

class RenumberSectionsTest : public testing::TestWithParam<RenumberCase>
{
};

TEST_P(RenumberSectionsTest, GivesTheChangesAndTheNextNumber)
{
    RenumberCase const & row = GetParam();
    int pageNumber = row.entered;
    EXPECT_EQ(RenumberSections(row.sections, row.pageCount, row.isFirst, row.startFromPage, pageNumber), row.changes)
        << row.why;
    EXPECT_EQ(pageNumber, row.left) << row.why;
}

INSTANTIATE_TEST_SUITE_P(
    Rows, RenumberSectionsTest,
    testing::Values(
        RenumberCase{"one section takes the running number", {{0, 1, Restarts, Included}}, 12, false, 0, 25, {{0, 25}}, 37},
        RenumberCase{"in step already: nothing to do", {{0, 25, Restarts, Included}}, 12, false, 0, 25, {}, 37},
        RenumberCase{"the first included section counts as a start even if it runs on",
                     {{0, 7, RunsOn, Included}}, 4, false, 0, 10, {{0, 10}}, 14},
        RenumberCase{"a first chapter that starts where its section does", {{0, 1, Restarts, Included}}, 8, true, 1, 1, {}, 9},
        RenumberCase{"a first chapter that continues gets its change though the number is right",
                     {{0, 1, Restarts, Included}}, 8, true, 0, 1, {{0, 1}}, 9},
        RenumberCase{"a first chapter with another start page", {{0, 1, Restarts, Included}}, 8, true, 5, 5, {{0, 5}}, 13},
        RenumberCase{"a section that runs on is left to the document",
                     {{0, 1, Restarts, Included}, {4, 5, RunsOn, Included}}, 10, false, 0, 21, {{0, 21}}, 31},
        RenumberCase{"a restart out of step was meant, and the numbers go on from it",
                     {{0, 1, Restarts, Included}, {4, 100, Restarts, Included}}, 10, false, 0, 21, {{0, 21}}, 106},
        RenumberCase{"a restart in step with the new numbers follows the pages between",
                     {{0, 1, Restarts, Included}, {4, 25, Restarts, Included}}, 10, false, 0, 21, {{0, 21}}, 31},
        RenumberCase{"leading excluded pages take no numbers",
                     {{0, 1, Restarts, Excluded}, {3, 4, RunsOn, Included}}, 10, false, 0, 21, {{3, 21}}, 28},
        RenumberCase{"trailing excluded pages do not count, however many sections they are",
                     {{0, 1, Restarts, Included}, {6, 7, RunsOn, Excluded}, {8, 9, RunsOn, Excluded}},
                     10, false, 0, 21, {{0, 21}}, 27},
        RenumberCase{"excluded pages between included ones count",
                     {{0, 1, Restarts, Included}, {4, 5, RunsOn, Excluded}, {6, 7, RunsOn, Included}},
                     10, false, 0, 21, {{0, 21}}, 31},
        RenumberCase{"with nothing included the count is one more than the pages that are left",
                     {{0, 1, Restarts, Excluded}}, 10, false, 0, 21, {}, 22},
        RenumberCase{"no section at all", {}, 3, false, 0, 21, {}, 25},
        RenumberCase{"in a first chapter that starts as its section says, a restart in step follows",
                     {{0, 1, Restarts, Included}, {4, 5, Restarts, Included}}, 10, true, 1, 1, {}, 11},
        RenumberCase{"a first chapter's start counts, not what its section said before: a restart in step with that is meant",
                     {{0, 1, Restarts, Included}, {4, 5, Restarts, Included}}, 10, true, 7, 7, {{0, 7}}, 11},
        RenumberCase{"and one in step with the start is not",
                     {{0, 1, Restarts, Included}, {4, 11, Restarts, Included}}, 10, true, 7, 7, {{0, 7}}, 17},
        RenumberCase{"a first chapter that continues goes on from nothing: what looks like page 5 behind page 1 was meant",
                     {{0, 1, Restarts, Included}, {4, 5, Restarts, Included}}, 10, true, 0, 1, {{0, 1}}, 11},
        RenumberCase{"while page 4 is in step with page 0",
                     {{0, 1, Restarts, Included}, {4, 4, Restarts, Included}}, 10, true, 0, 1, {{0, 1}, {4, 5}}, 11},
        RenumberCase{"a first chapter behind pages that stay out",
                     {{0, 1, Restarts, Excluded}, {2, 3, RunsOn, Included}}, 10, true, 1, 1, {{2, 1}}, 9},
        RenumberCase{"behind a number that was meant the next restart in step follows that one",
                     {{0, 1, Restarts, Included}, {4, 100, Restarts, Included}, {6, 102, Restarts, Included}},
                     10, false, 0, 21, {{0, 21}}, 106},
        RenumberCase{"a tail that begins out of step counts from its first page",
                     {{0, 1, Restarts, Included}, {4, 50, Restarts, Excluded}}, 10, false, 0, 21, {{0, 21}}, 25}));

struct FollowCase
{
    char const * why;
    std::vector<SectionFacts> sections;
    int pageCount;
    int entered;
    int left;
};

class FollowSectionsTest : public testing::TestWithParam<FollowCase>
{
};

TEST_P(FollowSectionsTest, MovesTheNumberOn)
{
    FollowCase const & row = GetParam();
    int pageNumber = row.entered;
    FollowSections(row.sections, row.pageCount, pageNumber);
    EXPECT_EQ(pageNumber, row.left) << row.why;
}

INSTANTIATE_TEST_SUITE_P(
    Rows, FollowSectionsTest,
    testing::Values(FollowCase{"the chapter's own start fixes the number", {{0, 31, Restarts, Included}}, 12, 1, 43},
                    FollowCase{"the last restart counts, included or not",
                               {{0, 31, Restarts, Included}, {6, 80, Restarts, Excluded}}, 12, 1, 80},
                    FollowCase{"only the last excluded section counts as the tail",
                               {{0, 31, Restarts, Included}, {6, 37, RunsOn, Excluded}, {8, 39, RunsOn, Excluded}},
                               12, 1, 39},
                    FollowCase{"leading excluded pages are taken off",
                               {{0, 31, Restarts, Excluded}, {2, 33, RunsOn, Included}}, 12, 1, 41},
                    FollowCase{"nothing included", {{0, 31, Restarts, Excluded}}, 12, 1, 43},
                    FollowCase{"no restart: one more than the pages", {{0, 1, RunsOn, Included}}, 12, 5, 18},
                    FollowCase{"an included section ends the tail",
                               {{0, 31, Restarts, Included}, {6, 37, RunsOn, Excluded}, {8, 39, RunsOn, Included}},
                               12, 1, 43},
                    FollowCase{"numbers that no book has wrap", {{0, Largest, Restarts, Included}}, 12, 5,
                               std::numeric_limits<int>::min() + 11}));

}

}
