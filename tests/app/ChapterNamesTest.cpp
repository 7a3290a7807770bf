#include "app/ChapterNames.h"

#include <gtest/gtest.h>

using App::ChapterLabel;

TEST(ChapterNamesTest, AChapterIsFoundByWhatPeopleCallIt)
{
    std::vector<ChapterLabel> const chapters{
        {"Arrival", "/b/docs/one.kvdoc"},  {"The storm", "/b/docs/storm.kvdoc"}, {"Interlude", "/b/x/intro.kvdoc"},
        {"Interlude", "/b/y/intro.kvdoc"}, {"1984", "/b/docs/orwell.kvdoc"},     {"one", "/b/docs/six.kvdoc"},
    };
    struct Case
    {
        char const * m_Why;
        std::string m_Text;
        int m_Index;
        /// What the problem names.
        std::vector<std::string> m_Says;
    };
    std::vector<Case> const cases{
        {"a number", "2", 1, {}},
        {"the last number", "6", 5, {}},
        {"the name that the book shows", "The storm", 1, {}},
        {"the file's name", "storm.kvdoc", 1, {}},
        {"the file's name without its extension", "orwell", 4, {}},
        {"a path from here", "docs/one.kvdoc", 0, {}},
        {"a roundabout path", "./docs/../y/intro.kvdoc", 3, {}},
        {"a full path settles what the name leaves open", "/b/x/intro.kvdoc", 2, {}},
        {"a number that only a name can mean", "1984", 4, {}},
        {"two files of one name", "intro", -1, {"3 (/b/x/intro.kvdoc)", "4 (/b/y/intro.kvdoc)"}},
        {"two chapters of one name", "Interlude", -1, {"3 (", "4 ("}},
        {"one chapter's file and another's name", "one", -1, {"1 (/b/docs/one.kvdoc)", "6 (/b/docs/six.kvdoc)"}},
        {"beyond the end", "7", -1, {"no chapter 7", "6 chapters"}},
        {"zero", "0", -1, {"no chapter 0"}},
        {"negative", "-1", -1, {"no chapter -1"}},
        {"larger than any number", "99999999999999999999", -1, {"no chapter 9999"}},
        {"a number with something behind it", "2nd", -1, {"\"2nd\"", "6 chapters"}},
        {"nearly a name", "STORM", -1, {"2 (/b/docs/storm.kvdoc)"}},
        {"nothing", "", -1, {}},
    };
    for (Case const & row : cases) {
        auto const found = App::FindChapter(chapters, row.m_Text, "/b");
        EXPECT_EQ(found.m_Index, row.m_Index) << row.m_Why << ": " << found.m_Problem;
        EXPECT_EQ(found.m_Problem.empty(), 0 <= row.m_Index) << row.m_Why;
        for (std::string const & text : row.m_Says) {
            EXPECT_NE(found.m_Problem.find(text), std::string::npos) << row.m_Why << ": " << found.m_Problem;
        }
    }
    EXPECT_NE(App::FindChapter({}, "1", "/").m_Problem.find("no chapters"), std::string::npos);
}

TEST(ChapterNamesTest, ManyCandidatesAreCutShort)
{
    std::vector<ChapterLabel> chapters;
    for (int at = 0; at < 40; ++at) {
        chapters.push_back({"Notes", "/b/" + std::to_string(at) + ".kvdoc"});
    }
    std::string const problem = App::FindChapter(chapters, "Notes", "/b").m_Problem;
    EXPECT_NE(problem.find("5 (/b/4.kvdoc), ..."), std::string::npos) << problem;
    EXPECT_EQ(problem.find("6 ("), std::string::npos) << problem;
}
