#include "framework/render/PrintPages.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace
{

struct ChoiceRow
{
    char const * text;
    int pageCount;
    std::vector<int> expected;
    /// The part that can't be read; empty if there is none.
    char const * problem = "";
};

TEST(PrintPagesTest, AChoiceOfPagesBecomesIndices)
{
    for (ChoiceRow const & row : {
             ChoiceRow{"", -1, {}},
             ChoiceRow{" , ;\t", -1, {}},
             ChoiceRow{"3", -1, {2}},
             ChoiceRow{"1-4,9", -1, {0, 1, 2, 3, 8}},
             ChoiceRow{"2, 2 2", -1, {1, 1, 1}},
             ChoiceRow{"-3", -1, {0, 1, 2}},
             ChoiceRow{"5-2", -1, {4, 3, 2, 1}},
             ChoiceRow{" 1 - 3 , 7", -1, {0, 1, 2, 6}},
             ChoiceRow{"3-", 5, {2, 3, 4}},
             ChoiceRow{"2-9999999999", 4, {1, 2, 3}},
             ChoiceRow{"9999999999-3", 5, {4, 3, 2}},
             ChoiceRow{"7-9", 5, {6}},
             ChoiceRow{"0", -1, {}, "0"},
             ChoiceRow{"1,all,3", -1, {0, 2}, "all"},
             ChoiceRow{"1-2-3", -1, {}, "1-2-3"},
             ChoiceRow{"--5", -1, {}, "--5"},
             ChoiceRow{"-", -1, {}, "-"},
             ChoiceRow{"-0", -1, {}, "-0"},
             ChoiceRow{"+1", -1, {}, "+1"},
         }) {
        EXPECT_EQ(ParsePrintPages(row.text, row.pageCount, {0}), row.expected) << row.text;
        String problem;
        EXPECT_EQ(CheckPrintPages(row.text, problem), row.problem[0] == '\0') << row.text;
        EXPECT_EQ(problem, row.problem) << row.text;
    }
    EXPECT_EQ(ParsePrintPages("1-2", -1, {0, 10}), (std::vector<int>{0, 1, 10, 11})) << "counted from each beginning";
    EXPECT_TRUE(ParsePrintPages("1-2", -1, {}).empty());
}

TEST(PrintPagesTest, HugeChoicesAreLimited)
{
    EXPECT_EQ(ParsePrintPages("2-", -1, {0}).size(), 100'000u);
    EXPECT_EQ(ParsePrintPages("9999999999-", -1, {0}).size(), 1u) << "no page, but not no choice either";
    EXPECT_EQ(ParsePrintPages("9999999999-1", -1, {0}).size(), 100'000u);
    String many;
    for (int i = 0; i < 20; ++i) {
        many = many + "1-,";
    }
    std::vector<int> const indices = ParsePrintPages(many, -1, {2'000'000'000, -5});
    EXPECT_EQ(indices.size(), 1'000'000u);
    EXPECT_TRUE(std::all_of(indices.begin(), indices.end(), [](int index) { return index >= 0; }));
}

}
