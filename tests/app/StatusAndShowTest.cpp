#include "ProgramTest.h"

class StatusAndShowTest : public ProgramTest
{
protected:
    static std::vector<std::string> KeysOf(nlohmann::json const & json)
    {
        std::vector<std::string> keys;
        for (auto const & [key, value] : json.items()) {
            keys.push_back(key);
        }
        return keys;
    }
};

using Keys = std::vector<std::string>;

TEST_F(StatusAndShowTest, StatusGivesTheKeysThatTheHandbookLists)
{
    WriteBook(2);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    auto const status = RunJson({"status", "@book/.korvane/book.kvbook"});
    EXPECT_EQ(KeysOf(status), (Keys{"book", "chapters", "messages", "name", "ok", "pageCount"}));
    ASSERT_EQ(status["chapters"].size(), 3u) << status.dump(1);
    auto const & title = status["chapters"][0];
    EXPECT_EQ(KeysOf(title), (Keys{"cachedStartPage", "index", "key", "name", "pageCount", "pages", "path", "preflight",
                                   "startFromPage", "status"}));
    EXPECT_EQ(title["key"], true);
    EXPECT_EQ(status["chapters"][1]["startFromPage"], 1);
    EXPECT_EQ(status["chapters"][2]["startFromPage"], 0);
    EXPECT_EQ(status["chapters"][2]["name"], "Chapter 2");
    EXPECT_EQ(status["chapters"][2]["status"], "ok");
    auto const lines = Run({"status", "@book/.korvane/book.kvbook"});
    EXPECT_NE(lines.m_Out.find("Chapter 2"), std::string::npos) << lines.m_Out;
}

TEST_F(StatusAndShowTest, ShowTellsADocumentFromAChapter)
{
    Write("book/a.md", "---\nlang: fr\nauthor: Ich\n---\n# Titel {#t}\n\nText mit Note[^1] und *Nachdruck*.\n\n- "
                       "eins\n\n|a|b|\n|-|-|\n|c|d|\n\n![Bild](weg.png)\n\n[^1]: Die Note.\n");
    ASSERT_EQ(Run({"import", "@book/a.md", "-o", "@docs"}).m_Code, 0);
    auto const show = RunJson({"show", "@docs/a.kvdoc"});
    EXPECT_EQ(show["kind"], "document");
    EXPECT_EQ(show["metadata"]["title"], "Titel");
    EXPECT_EQ(show["metadata"]["language"], "fr");
    EXPECT_EQ(show["metadata"]["author"], "Ich");
    ASSERT_EQ(show["sections"].size(), 1u);
    EXPECT_EQ(KeysOf(show["sections"][0]),
              (Keys{"format", "included", "prefix", "restart", "startNumber", "startPageIndex"}));
    EXPECT_EQ(show["spreads"][0]["pages"][0]["label"], "1");
    EXPECT_NEAR(show["spreads"][0]["pages"][0]["rect"]["right"].get<double>(), 419.528, 0.01);
    auto const & story = show["stories"][0];
    std::string styles;
    for (auto const & paragraph : story["paragraphs"]) {
        styles += paragraph["style"].get<std::string>() + "|";
    }
    EXPECT_EQ(styles, "Chapter title|First paragraph|List item|Table|Figure|Caption|");
    EXPECT_EQ(story["paragraphs"][1]["text"], "Text mit Note und Nachdruck.");
    EXPECT_EQ(story["paragraphs"][3]["table"]["rows"][1][0], "c\n");
    EXPECT_EQ(story["paragraphs"][4]["pictures"][0]["missing"], true);
    EXPECT_EQ(story["notes"][0]["paragraphs"][0]["text"], "Die Note.");
}

TEST_F(StatusAndShowTest, ReimportKeepsIdentityAndAnchors)
{
    Write("a.md", "# One\n\n## Two\n");
    ASSERT_EQ(Run({"import", "@a.md", "-o", "@docs"}).m_Code, 0);
    auto const before = RunJson({"show", "@docs/a.kvdoc"});
    Write("a.md", "# One\n\nNew text.\n\n## Two\n\n## Three\n");
    ASSERT_EQ(Run({"import", "@a.md", "-o", "@docs"}).m_Code, 0);
    auto const after = RunJson({"show", "@docs/a.kvdoc"});
    EXPECT_EQ(before["guid"], after["guid"]);
    auto const uidOf = [](nlohmann::json const & show, std::string const & text) {
        for (auto const & paragraph : show["stories"][0]["paragraphs"]) {
            if (paragraph["text"] == text) {
                return paragraph["anchors"].back()["uid"].get<std::string>();
            }
        }
        return std::string("none");
    };
    EXPECT_EQ(uidOf(before, "Two"), uidOf(after, "Two"));
    EXPECT_NE(uidOf(after, "Two"), uidOf(after, "Three"));
}

TEST_F(StatusAndShowTest, ShowTellsABookWithoutOpeningItsChapters)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    auto const documents = Documents();
    auto const show = RunJson({"show", "@book/.korvane/book.kvbook"});
    EXPECT_EQ(KeysOf(show),
              (Keys{"chapters", "kind", "mergeStrays", "messages", "name", "ok", "padStrays", "path", "synchronise"}));
    EXPECT_EQ(show["chapters"].size(), 2u);
    EXPECT_EQ(Documents(), documents);
}

TEST_F(StatusAndShowTest, ShowWritesThePreviewOfABookAndOfADocument)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    for (std::string const file : {"@book/.korvane/book.kvbook", "@book/.korvane/1.kvdoc"}) {
        std::string const shown = file.substr(1);
        if (!Exists(shown)) {
            ADD_FAILURE() << shown << " is not there";
            continue;
        }
        Outcome const outcome = Run({"show", file, "--thumbnail", "@out.png"});
        EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
        std::string const png = Read("out.png");
        ASSERT_GT(png.size(), 1000u) << file;
        EXPECT_EQ(png.substr(1, 3), "PNG");
        // One of the sides, big-endian, is the greatest that a preview has.
        std::string const greatest("\0\0\2\0", 4);
        EXPECT_TRUE(png.substr(16, 4) == greatest || png.substr(20, 4) == greatest) << file;
        std::filesystem::remove(m_Folder / "out.png");
    }
    // A target that can't be written, and a book without a picture.
    int code = 0;
    auto const failed = RunJson({"show", "@book/.korvane/book.kvbook", "--thumbnail", "@no folder/out.png"}, &code);
    EXPECT_EQ(code, 1);
    EXPECT_EQ(failed["messages"][0]["kind"], "folder-missing");
    ASSERT_EQ(Run({"new", "@empty.kvbook"}).m_Code, 0);
    auto const empty = RunJson({"show", "@empty.kvbook", "--thumbnail", "@out.png"}, &code);
    EXPECT_EQ(code, 1);
    EXPECT_EQ(empty["messages"][0]["kind"], "preview-missing");
    EXPECT_FALSE(Exists("out.png"));
}

TEST_F(StatusAndShowTest, ExportWritesTheBookAgain)
{
    WriteBook(2);
    auto const built = RunJson({"build", "@book"});
    int code = 0;
    auto const exported = RunJson({"export", "@book/.korvane/book.kvbook", "-o", "@again.pdf", "--marks"}, &code);
    EXPECT_EQ(code, 0) << exported.dump(1);
    EXPECT_EQ(exported["pages"], built["pages"]);
    EXPECT_TRUE(IsWholePdf(m_Folder / "again.pdf"));
    EXPECT_EQ(CountPages(m_Folder / "again.pdf"), built["pages"].get<int>());
}
