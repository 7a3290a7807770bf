#include "ProgramTest.h"

#include "support/PdfProbe.h"

class BuildVerbTest : public ProgramTest
{
};

TEST_F(BuildVerbTest, AFolderBecomesABookAndASecondRunHasNothingToDo)
{
    WriteBook(3);
    int code = 0;
    auto const first = RunJson({"build", "@book", "-o", "@out.pdf"}, &code);
    ASSERT_EQ(code, 0) << first.dump(1);
    EXPECT_TRUE(IsWholePdf(m_Folder / "out.pdf"));
    EXPECT_EQ(first["chapters"].size(), 4u);
    EXPECT_EQ(CountPages(m_Folder / "out.pdf"), first["pages"].get<int>());
    EXPECT_FALSE(first["upToDate"].get<bool>());

    auto const documents = Documents();
    std::string const pdf = Read("out.pdf");
    EXPECT_TRUE(RunJson({"build", "@book", "-o", "@out.pdf"})["upToDate"].get<bool>());
    EXPECT_EQ(Documents(), documents);
    EXPECT_EQ(Read("out.pdf"), pdf);
}

TEST_F(BuildVerbTest, EachBuildTellsEveryFindingOnce)
{
    WriteBook(1);
    Write("book/1.md", "# One\n\n![gone](gone.png)\n");
    for (char const * const output : {"@a.pdf", "@a.pdf", "@b.pdf"}) {
        EXPECT_EQ(RunJson({"build", "@book", "-o", output})["messages"].size(), 1u) << output;
    }
}

TEST_F(BuildVerbTest, OnlyWhatChangedIsMadeAnewAndNumbersFollow)
{
    WriteBook(3);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    ASSERT_TRUE(Exists("book/book.pdf"));
    auto const before = Documents();

    Write("book/3.md", "# Chapter 3\n\nShort now.\n");
    auto const result = RunJson({"build", "@book"});
    auto const after = Documents();
    for (char const * name : {"title-page.kvdoc", "1.kvdoc", "2.kvdoc"}) {
        EXPECT_TRUE(before.at(name) == after.at(name)) << name;
    }
    EXPECT_FALSE(before.at("3.kvdoc") == after.at("3.kvdoc"));
    EXPECT_EQ(result["chapters"][1]["startPage"], 1);
    EXPECT_EQ(result["chapters"][3]["startPage"],
              result["chapters"][2]["startPage"].get<int>() + result["chapters"][2]["pageCount"].get<int>());
}

TEST_F(BuildVerbTest, TheBookFollowsItsList)
{
    WriteBook(4);
    auto const names = [&](std::string const & list) {
        Write("book/book.toml", "title-page = false\nchapters = [" + list + "]\n");
        int code = 0;
        auto const built = RunJson({"build", "@book"}, &code);
        EXPECT_EQ(code, 0) << built.dump(1);
        std::string text;
        auto const status = RunJson({"status", "@book/.korvane/book.kvbook"});
        int next = 1;
        for (auto const & chapter : status["chapters"]) {
            text += chapter["name"].get<std::string>().back();
            EXPECT_EQ(chapter["cachedStartPage"], next) << status.dump(1);
            EXPECT_EQ(chapter["status"], "ok");
            next += chapter["pageCount"].get<int>();
        }
        EXPECT_EQ(CountPages(m_Folder / "book/book.pdf"), next - 1);
        return text;
    };
    EXPECT_EQ(names("'1.md', '2.md', '3.md'"), "123");
    EXPECT_EQ(names("'3.md', '1.md', '2.md'"), "312");
    EXPECT_EQ(names("'3.md', '4.md', '2.md', '1.md'"), "3421");
    EXPECT_EQ(names("'2.md'"), "2");
    EXPECT_EQ(names("'1.md', '2.md', '3.md', '4.md'"), "1234");
}

TEST_F(BuildVerbTest, AnotherTemplateOrTitleMakesTheBookAnew)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    EXPECT_TRUE(RunJson({"build", "@book"})["upToDate"].get<bool>());
    EXPECT_FALSE(RunJson({"build", "@book", "--template", "report"})["upToDate"].get<bool>());
    Write("book/book.toml", "title = 'Another'\ntemplate = 'report'\n");
    auto const renamed = RunJson({"build", "@book"});
    EXPECT_FALSE(renamed["upToDate"].get<bool>());
    EXPECT_EQ(renamed["chapters"][0]["title"], "Another");
    EXPECT_TRUE(RunJson({"build", "@book"})["upToDate"].get<bool>());
    std::filesystem::remove(m_Folder / "book/book.pdf");
    EXPECT_FALSE(RunJson({"build", "@book"})["upToDate"].get<bool>());
    EXPECT_TRUE(Exists("book/book.pdf"));
}

TEST_F(BuildVerbTest, ThePreviewOfTheBookFollowsItsFirstPage)
{
    auto const preview = [&] {
        EXPECT_EQ(Run({"build", "@book"}).m_Code, 0);
        EXPECT_EQ(Run({"show", "@book/.korvane/book.kvbook", "--thumbnail", "@out.png"}).m_Code, 0);
        return Read("out.png");
    };
    WriteBook(2);
    for (char const * const titlePage : {"true", "false"}) {
        std::string const manifest = std::string("title-page = ") + titlePage + "\nchapters = [\"1.md\", \"2.md\"]\n";
        Write("book/book.toml", "title = \"A Title\"\n" + manifest);
        Write("book/1.md", "# A chapter\n\nText.\n");
        std::string const before = preview();
        Write("book/2.md", "# Another chapter\n\nText.\n");
        EXPECT_EQ(preview(), before) << "a later page";
        Write("book/book.toml", "title = \"Quite Another One\"\n" + manifest);
        Write("book/1.md", "# Quite another chapter\n\nText, and more of it.\n");
        EXPECT_NE(preview(), before) << "title page: " << titlePage;
        Write("book/2.md", "# Chapter 2\n\nText.\n");
    }

    // A key chapter that the user has chosen.
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    ASSERT_EQ(Run({"key", "@book/.korvane/book.kvbook", "2"}).m_Code, 0);
    std::string const before = preview();
    Write("book/2.md", "# Something else\n\nAltogether.\n");
    EXPECT_NE(preview(), before);
}

TEST_F(BuildVerbTest, AFixedTimeGivesTheSameBytes)
{
    WriteBook(2);
    ASSERT_EQ(Run({"build", "@book", "-o", "@a.pdf", "--work", "@w1", "--fixed-time", "1000000000"}).m_Code, 0);
    ASSERT_EQ(Run({"build", "@book", "-o", "@b.pdf", "--work", "@w1", "--fixed-time", "1000000000"}).m_Code, 0);
    EXPECT_TRUE(Read("a.pdf") == Read("b.pdf"));
}

TEST_F(BuildVerbTest, DamagedWorkFilesAreMadeAnew)
{
    WriteBook(2);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    struct Case
    {
        char const * m_File;
        std::string m_Content;
    };
    std::string const document = Read("book/.korvane/1.kvdoc");
    std::string const book = Read("book/.korvane/book.kvbook");
    for (auto const & [file, content] : {
             Case{"1.kvdoc", document.substr(0, document.size() / 2)},
             Case{"1.kvdoc", "no document"},
             Case{"1.kvdoc", book},
             Case{"book.kvbook", book.substr(0, book.size() / 3)},
             Case{"book.kvbook", document},
             Case{"book.kvbook", ""},
             Case{"import.json", "{\"version\": 1"},
         }) {
        SCOPED_TRACE(std::string(file) + " of " + std::to_string(content.size()) + " bytes");
        Write(std::string("book/.korvane/") + file, content);
        auto const outcome = Run({"build", "@book"});
        EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
        EXPECT_TRUE(IsWholePdf(m_Folder / "book/book.pdf"));
        EXPECT_TRUE(RunJson({"build", "@book"})["upToDate"].get<bool>());
    }
}

TEST_F(BuildVerbTest, InterruptingLeavesNothingHalfWritten)
{
    WriteBook(6);
    Write("out.pdf", "old");
    for (int const patience : {1, 2, 4, 8, 12, 16, 24}) {
        SCOPED_TRACE(patience);
        auto const outcome = [&] {
            ImpatientUser const user(patience);
            return Run({"build", "@book", "-o", "@out.pdf", "--force"});
        }();
        bool const isOld = Read("out.pdf") == "old";
        EXPECT_TRUE(isOld || IsWholePdf(m_Folder / "out.pdf"));
        if (outcome.m_Code != 0) {
            EXPECT_EQ(outcome.m_Code, 1);
            EXPECT_NE(outcome.m_Err.find("nterrupted"), std::string::npos) << outcome.m_Err;
        } else {
            EXPECT_FALSE(isOld);
        }
        Write("out.pdf", "old");
    }
    EXPECT_EQ(Run({"build", "@book", "-o", "@out.pdf"}).m_Code, 0);
    EXPECT_TRUE(IsWholePdf(m_Folder / "out.pdf"));
    for (auto const & entry : std::filesystem::directory_iterator(m_Folder / "book/.korvane")) {
        std::string const extension = entry.path().extension().string();
        EXPECT_TRUE(".kvdoc" == extension || ".kvbook" == extension || ".json" == extension) << entry.path();
    }
}

TEST_F(BuildVerbTest, ARunningHeadIsCutAtTheWordThatNoLongerFitsHoweverLongTheTitle)
{
    WriteBook(1);
    auto const headOf = [&](std::string const & title) {
        Write("book/book.toml", "title-page = false\ntitle = \"" + title + "\"\n");
        EXPECT_EQ(Run({"build", "@book", "-o", "@out.pdf"}).m_Code, 0);
        std::string const text = PdfProbe(String((m_Folder / "out.pdf").string())).Text(2);
        return text.substr(0, text.find('\n'));
    };
    std::string words;
    std::string few;
    for (int word = 1; word <= 20'000; ++word) {
        words += "w" + std::to_string(word) + " ";
        few = 60 == word ? words : few;
    }
    std::string const head = headOf(few + "end");
    EXPECT_TRUE(head.starts_with("w1 w2 w3 ")) << head;
    EXPECT_TRUE(head.ends_with("\u2026")) << head;
    EXPECT_EQ(headOf(words + "end"), head);
    std::string const word = headOf(std::string(20'000, 'x'));
    EXPECT_TRUE(word.starts_with("xx") && word.ends_with("\u2026")) << word;
    EXPECT_EQ(headOf("A short one"), "A short one");
}
