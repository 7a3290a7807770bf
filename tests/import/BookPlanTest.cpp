#include "import/BookPlan.h"

#include "Describe.h"
#include "import/NaturalOrder.h"
#include "import/SourceText.h"

#include <algorithm>
#include <fstream>
#include <gtest/gtest.h>

using namespace Import;

namespace
{

namespace fs = std::filesystem;

/// A folder of its own for each test, gone afterwards.
class BookPlanTest : public testing::Test
{
protected:
    BookPlanTest()
    {
        std::string pattern = (fs::temp_directory_path() / "korvane-plan-XXXXXX").string();
        m_Folder = mkdtemp(pattern.data());
    }
    ~BookPlanTest() override { fs::remove_all(m_Folder); }

    void Write(std::string const & name, std::string const & text) const
    {
        fs::create_directories((m_Folder / name).parent_path());
        std::ofstream(m_Folder / name, std::ios::binary) << text;
    }

    std::string Chapters()
    {
        m_Messages = {};
        m_Plan = ReadBookPlan(m_Folder, m_Messages);
        std::string text;
        for (PlannedChapter const & chapter : m_Plan ? m_Plan->m_Chapters : std::vector<PlannedChapter>()) {
            text += (text.empty() ? "" : " ") + chapter.m_Number +
                    (chapter.m_Part.empty() ? "" : "<" + chapter.m_Part + ">") + chapter.m_Name;
        }
        return text;
    }

    fs::path m_Folder;
    MessageList m_Messages;
    std::optional<BookPlan> m_Plan;
};

}

TEST_F(BookPlanTest, ManifestFactsAreRead)
{
    Write("a.md", "");
    Write("part/b.md", "");
    Write("book.toml",
          "title = 'T'\nsubtitle = 'S'\nauthor = ['A', 'B', 'C']\nlang = 'de'\ntemplate = 'manual'\nsmart = false\n"
          "chapters = ['part/b.md', './a.md']\n[output]\nfile = 'x.pdf'\nmarks = true\n");
    EXPECT_EQ(Chapters(), "part/b.md a.md");
    ASSERT_TRUE(m_Plan);
    EXPECT_EQ(m_Plan->AuthorsAsText(), "A, B and C");
    EXPECT_EQ(m_Plan->m_Title + m_Plan->m_Subtitle + m_Plan->m_Language + m_Plan->m_Template + m_Plan->m_OutputFile,
              "TSdemanualx.pdf");
    EXPECT_TRUE(!m_Plan->m_Smart && m_Plan->m_HasMarks && !m_Plan->m_IncludesBleed);
    EXPECT_EQ(Describe(m_Messages), "");
}

TEST_F(BookPlanTest, WrongManifestsAreToldWithTheirPlace)
{
    Write("a.md", "");
    struct Case
    {
        char const * m_Text;
        char const * m_Chapters;
        char const * m_Messages;
    };
    for (auto const & [text, chapters, messages] : {
             Case{"title = 'x\n", "", "1 toml-syntax\n"},
             Case{"\ntitle = 3\nchapters = ['a.md']\n", "", "2 toml-value\n"},
             Case{"chapters = 'a.md'\n", "", "1 toml-value\n"},
             Case{"chapters = ['a.md', 4]\n", "", "1 toml-value\n"},
             Case{"tittle = 'x'\nchapters = ['a.md']\n[output]\npaper = 1\n", "a.md", "4 toml-key\n1 toml-key\n"},
             Case{"chapters = [\n 'a.md',\n 'b.md',\n 'a.md' ]\n", "a.md", "3 chapter-missing\n4 chapter-twice\n"},
             Case{"chapters = ['b.md']\n", "", "1 chapter-missing\n"},
             Case{"output = 3\n", "", "1 toml-value\n"},
         }) {
        Write("book.toml", text);
        EXPECT_EQ(Chapters(), chapters) << text;
        EXPECT_EQ(Describe(m_Messages), messages) << text;
    }
    Write("book.toml", std::string("title = 'a\0b'", 13));
    EXPECT_EQ(Chapters(), "");
    EXPECT_EQ(Describe(m_Messages), "1 encoding\n");
}

TEST_F(BookPlanTest, SummaryInMdBookLayoutIsRead)
{
    for (char const * name : {"pre.md", "a.md", "a/one.md", "a/two.md", "b.md", "c d.md", "post.md"}) {
        Write(name, "");
    }
    Write("SUMMARY.md",
          "# The Title\n\n[Pre](pre.md)\n\n- [A `x`](a.md)\n  - [One](a/one.md)\n  - [Draft]()\n  - [Two](a/two.md)\n\n"
          "# Part\n\n- [B](b.md#sec)\n- [C](c%20d.md)\n\n---\n\n[Post](post.md)\n[Web](http://x.org)\n\n# Empty\n");
    EXPECT_EQ(Chapters(), "pre.md 1a.md 1.1a/one.md 1.3a/two.md 2<Part>b.md 3c d.md post.md");
    ASSERT_TRUE(m_Plan);
    EXPECT_EQ(m_Plan->m_Title, "The Title");
    EXPECT_EQ(m_Plan->m_Chapters[1].m_Title, "A x");
    EXPECT_EQ(Describe(m_Messages), "7 draft-chapter\n12 chapter-anchor\n18 chapter-remote\n20 empty-part\n");
}

TEST_F(BookPlanTest, MdBookManifestLeadsToItsSources)
{
    Write("book.toml", "[book]\ntitle = 'R'\nauthors = ['X']\nlanguage = 'fr'\n[output.html]\ngit-repository-url = "
                       "'x'\n[build]\nx = 1\n");
    Write("src/SUMMARY.md", "- [A](a.md)\n");
    Write("src/a.md", "");
    EXPECT_EQ(Chapters(), "1a.md");
    ASSERT_TRUE(m_Plan);
    EXPECT_EQ(m_Plan->m_Title + m_Plan->m_Language, "Rfr");
    EXPECT_EQ(Describe(m_Messages), "");
}

TEST_F(BookPlanTest, WithoutAListTheFilesComeInNaturalOrder)
{
    for (char const * name : {"ch10.md", "ch2.md", "Ch1.markdown", "notes.txt", ".hidden.md", "ch02b.md"}) {
        Write(name, "");
    }
    fs::create_directory(m_Folder / "folder.md");
    EXPECT_EQ(Chapters(), "Ch1.markdown ch2.md ch02b.md ch10.md");
    EXPECT_EQ(m_Plan->m_Title, m_Folder.filename().string());
}

TEST_F(BookPlanTest, AFolderWithoutChaptersIsRefused)
{
    EXPECT_EQ(Chapters(), "");
    EXPECT_EQ(Describe(m_Messages), "0 no-chapters\n");
    MessageList messages;
    EXPECT_FALSE(ReadBookPlan(m_Folder / "nowhere", messages));
    EXPECT_EQ(Describe(messages), "0 no-folder\n");
}

TEST(NaturalOrderTest, NumbersCountByValue)
{
    std::vector<std::string> const ordered{"a",
                                           "a1",
                                           "a01",
                                           "a2",
                                           "a2b",
                                           "a10",
                                           "A11",
                                           "b",
                                           "chapter 9",
                                           "chapter 10",
                                           "z99999999999999999999999",
                                           "z100000000000000000000000"};
    for (std::size_t i = 0; i < ordered.size(); ++i) {
        for (std::size_t j = 0; j < ordered.size(); ++j) {
            EXPECT_EQ(ComesBefore(ordered[i], ordered[j]), i < j) << ordered[i] << " and " << ordered[j];
        }
    }
}

TEST(SourceTextTest, EncodingsAreRecognisedOrRefusedWithTheirPlace)
{
    struct Case
    {
        char const * m_Why;
        std::string m_Bytes;
        char const * m_Text;
        int m_Line;
        int m_Column;
    };
    for (auto const & row : std::vector<Case>{
             {"mark",
              "\xEF\xBB\xBF"
              "a",
              "a", 0, 0},
             {"UTF-16, little",
              std::string("\xFF\xFE"
                          "a\0\xe9\0",
                          6),
              "aé", 0, 0},
             {"UTF-16, big, with a pair", std::string("\xFE\xFF\xD8\x3D\xDE\0", 6), "😀", 0, 0},
             {"bad byte", "a\nbé\xE9 c", nullptr, 2, 3},
             {"overlong", "\xC0\x80", nullptr, 1, 1},
             {"surrogate", "\xED\xA0\x80", nullptr, 1, 1},
             {"cut off", "aaaaaaaaaaaaaaaaaaaaaa\xE2\x82", nullptr, 1, 23},
             {"zero byte", std::string("abcdefgh\0x", 10), nullptr, 1, 9},
         }) {
        SCOPED_TRACE(row.m_Why);
        MessageList messages;
        auto const text = DecodeSourceText(row.m_Bytes, "a.md", messages);
        ASSERT_EQ(text.has_value(), nullptr != row.m_Text);
        if (text) {
            EXPECT_EQ(*text, row.m_Text);
        } else {
            ASSERT_EQ(messages.All().size(), 1u);
            EXPECT_EQ(messages.All()[0].m_Place, (Place{"a.md", row.m_Line, row.m_Column}));
        }
    }
}
