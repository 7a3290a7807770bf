#include "ProgramTest.h"

#include "app/BookFileLock.h"

#include <sys/stat.h>
#include <unistd.h>

namespace fs = std::filesystem;

/// Four documents a, b, c, d of one page each in the folder "docs", and a book of the first three.
class BookVerbsTest : public ProgramTest
{
protected:
    void SetUp() override
    {
        std::vector<std::string> import{"import"};
        for (std::string const name : {"a", "b", "c", "d"}) {
            Write(name + ".md", "# Chapter " + name + "\n\nText.\n");
            import.push_back("@" + name + ".md");
        }
        import.insert(import.end(), {"-o", "@docs"});
        ASSERT_EQ(Run(import).m_Code, 0);
        ASSERT_EQ(Run({"new", "@book.kvbook", "@docs/a.kvdoc", "@docs/b.kvdoc", "@docs/c.kvdoc"}).m_Code, 0);
    }

    /// "a@1 *b c": the chapters as the file has them, the key marked, with start pages that are fixed.
    std::string Chapters(std::string const & book = "@book.kvbook") const
    {
        std::string text;
        auto const shown = RunJson({"show", book});
        for (auto const & chapter : shown["chapters"]) {
            int const start = chapter["startFromPage"];
            text += (text.empty() ? "" : " ") + std::string(chapter["key"].get<bool>() ? "*" : "") +
                    chapter["name"].get<std::string>() + (0 == start ? "" : "@" + std::to_string(start));
        }
        return text;
    }

    /// What a failed verb must not touch.
    std::string Everything() const
    {
        std::string all;
        for (auto const & entry : fs::directory_iterator(m_Folder)) {
            std::string const name = entry.path().filename().string();
            all += name + (entry.is_regular_file() ? Read(name) : "") + "\n";
        }
        return all;
    }
};

TEST_F(BookVerbsTest, EachVerbChangesTheListAsItSays)
{
    struct Step
    {
        std::vector<std::string> m_Arguments;
        std::string m_Chapters;
    };
    ASSERT_EQ(Chapters(), "*a@1 b c");
    for (auto const & [arguments, chapters] : std::vector<Step>{
             {{"add", "@book.kvbook", "@docs/d.kvdoc", "--before", "2"}, "*a@1 d b c"},
             {{"move", "@book.kvbook", "d", "--end"}, "*a@1 b c d"},
             {{"move", "@book.kvbook", "4", "2", "--before", "a.kvdoc"}, "d@1 b *a c"},
             {{"move", "@book.kvbook", "1", "2", "--before", "2"}, "d@1 b *a c"},
             {{"key", "@book.kvbook", "@docs/b.kvdoc"}, "d@1 *b a c"},
             {{"start-page", "@book.kvbook", "3", "17"}, "d@1 *b a@17 c"},
             {{"start-page", "@book.kvbook", "3", "continue"}, "d@1 *b a c"},
             {{"remove", "@book.kvbook", "b", "2"}, "*d@1 a c"},
             {{"replace", "@book.kvbook", "3", "@docs/b.kvdoc"}, "*d@1 a b"},
             {{"remove", "@book.kvbook", "1", "2", "3"}, ""},
             {{"add", "@book.kvbook", "@docs/c.kvdoc"}, "*c@5"},
         }) {
        auto const outcome = Run(arguments);
        SCOPED_TRACE(testing::PrintToString(arguments) + outcome.m_Out + outcome.m_Err);
        EXPECT_EQ(outcome.m_Code, 0);
        EXPECT_EQ(Chapters(), chapters);
    }
    EXPECT_TRUE(Exists("docs/a.kvdoc")) << "documents of removed chapters stay";
}

TEST_F(BookVerbsTest, PageNumbersRunOnThroughTheChangedList)
{
    ASSERT_EQ(Run({"start-page", "@book.kvbook", "2", "30"}).m_Code, 0);
    auto const pages = [this] {
        std::string text;
        auto const status = RunJson({"status", "@book.kvbook"});
        for (auto const & chapter : status["chapters"]) {
            text += chapter["pages"].get<std::string>() + ", ";
        }
        return text;
    };
    EXPECT_EQ(pages(), "1 - 2, 30 - 30, 31 - 32, ");
    ASSERT_EQ(Run({"move", "@book.kvbook", "3", "--before", "1"}).m_Code, 0);
    EXPECT_EQ(pages(), "1 - 2, 3 - 4, 30 - 30, ");
}

TEST_F(BookVerbsTest, WhatCannotBeDoneLeavesEverythingAsItWasAndNamesTheRemedy)
{
    struct Case
    {
        std::vector<std::string> m_Arguments;
        int m_Code;
        std::vector<std::string> m_Says;
    };
    Write("text.kvdoc", "hello");
    fs::create_directories(m_Folder / "folder");
    std::string const before = Everything();
    for (auto const & [arguments, code, says] : std::vector<Case>{
             {{"new", "@book.kvbook"}, 1, {"book.kvbook", "already"}},
             {{"new", "@book"}, 1, {"book.kvbook", "already"}},
             {{"new", "@nowhere/x"}, 1, {"nowhere does not exist"}},
             {{"new", "@folder"}, 1, {"This is a folder"}},
             {{"new", "@fresh", "@docs/a.kvdoc", "@gone.kvdoc"}, 1, {"gone.kvdoc", "no such file"}},
             {{"add", "@gone.kvbook", "@docs/d.kvdoc"}, 1, {"gone.kvbook", "korvane new"}},
             {{"add", "@book.kvbook", "@docs/d.kvdoc", "@a.md"}, 1, {"a.md", "korvane import"}},
             {{"add", "@book.kvbook", "@docs/d.kvdoc", "@text.kvdoc"}, 1, {"text.kvdoc", "no document"}},
             {{"add", "@book.kvbook", "@docs/d.kvdoc", "@docs/d.kvdoc"}, 1, {"named twice"}},
             {{"add", "@book.kvbook", "@docs/b.kvdoc"}, 1, {"already, as chapter 2 (b)"}},
             {{"add", "@book.kvbook", "@docs/d.kvdoc", "--before", "4"}, 1, {"no chapter 4", "3 chapters"}},
             {{"add", "@book.kvbook", "@book.kvbook"}, 1, {"This is a book"}},
             {{"add", "@book.kvbook", "@docs"}, 1, {"This is a folder"}},
             {{"add", "@text.kvdoc", "@docs/d.kvdoc"}, 1, {"text.kvdoc"}},
             {{"add", "@book.kvbook"}, 2, {"FILE"}},
             {{"remove", "@book.kvbook", "1", "x"}, 1, {"No chapter is called \"x\""}},
             {{"move", "@book.kvbook", "1"}, 2, {"--before"}},
             {{"move", "@book.kvbook", "1", "--end", "--before", "2"}, 2, {"--before"}},
             {{"move", "@book.kvbook", "9", "--end"}, 1, {"no chapter 9"}},
             {{"replace", "@book.kvbook", "1", "@docs/b.kvdoc"}, 1, {"already, as chapter 2"}},
             {{"key", "@book.kvbook", "0"}, 1, {"no chapter 0"}},
             {{"start-page", "@book.kvbook", "1", "0"}, 2, {"continue"}},
             {{"start-page", "@book.kvbook", "1", "-5"}, 2, {"continue"}},
             {{"start-page", "@book.kvbook", "1", "1000000"}, 2, {"999999"}},
             {{"start-page", "@book.kvbook", "1", "1.5"}, 2, {"continue"}},
             {{"set", "@book.kvbook", "--links", "perhaps"}, 2, {"perhaps", "yes|no"}},
             {{"set", "@book.kvbook", "--picture-dpi", "nan"}, 2, {"0-9600"}},
             {{"set", "@book.kvbook", "--marks-offset", "-1"}, 2, {"0-72"}},
             {{"set", "@book.kvbook", "--language", "d e"}, 2, {"TAG"}},
             {{"save-as", "@book.kvbook", "@book.kvbook", "--force"}, 1, {"the book itself"}},
             {{"save-as", "@book.kvbook", "@docs/b.kvdoc", "--force"}, 1, {"one of the book's documents"}},
             {{"save-as", "@book.kvbook", "@text.kvdoc"}, 1, {"--force"}},
             {{"save-as", "@book.kvbook", "@nowhere/x"}, 1, {"nowhere does not exist"}},
         }) {
        auto const outcome = Run(arguments);
        SCOPED_TRACE(testing::PrintToString(arguments));
        EXPECT_EQ(outcome.m_Code, code) << outcome.m_Err;
        EXPECT_EQ(outcome.m_Out, "");
        for (std::string const & text : says) {
            EXPECT_NE(outcome.m_Err.find(text), std::string::npos) << text << " is not in\n" << outcome.m_Err;
        }
        EXPECT_EQ(Everything(), before);
    }
}

TEST_F(BookVerbsTest, ADocumentThatCannotBeReadStaysOut)
{
    std::string const whole = Read("docs/d.kvdoc");
    Write("docs/cut.kvdoc", whole.substr(0, whole.size() * 2 / 3));
    std::string const before = Read("book.kvbook");
    for (auto const & arguments :
         std::vector<std::vector<std::string>>{{"add", "@book.kvbook", "@docs/d.kvdoc", "@docs/cut.kvdoc"},
                                               {"replace", "@book.kvbook", "1", "@docs/cut.kvdoc"},
                                               {"new", "@fresh", "@docs/cut.kvdoc"}}) {
        auto const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 1);
        EXPECT_NE(outcome.m_Err.find("cut.kvdoc: error: "), std::string::npos) << outcome.m_Err;
        EXPECT_TRUE(Read("book.kvbook") == before);
    }
    EXPECT_FALSE(Exists("fresh.kvbook"));
}

TEST_F(BookVerbsTest, SettingsStayInTheBookAndEachHasItsOwnPlace)
{
    auto const defaults = RunJson({"set", "@book.kvbook"})["settings"];
    ASSERT_GE(defaults.size(), 22u) << defaults.dump(1);
    std::string const before = Read("book.kvbook");
    ASSERT_EQ(Run({"set", "@book.kvbook"}).m_Code, 0);
    EXPECT_TRUE(Read("book.kvbook") == before) << "looking changes nothing";
    for (auto const & [name, value] : defaults.items()) {
        // Another value than it has, and no other row may follow.
        std::string const text = value.is_boolean()  ? (value.get<bool>() ? "no" : "yes")
                                 : value.is_string() ? "de-AT"
                                                     : "7";
        ASSERT_EQ(Run({"set", "@book.kvbook", "--" + name, text}).m_Code, 0) << name;
        auto const changed = RunJson({"set", "@book.kvbook"})["settings"];
        auto expected = defaults;
        expected[name] = value.is_boolean()  ? nlohmann::json(!value.get<bool>())
                         : value.is_string() ? nlohmann::json("de-AT")
                                             : nlohmann::json(7);
        EXPECT_EQ(changed, expected) << name;
        std::string const back = value.is_boolean()  ? (value.get<bool>() ? "yes" : "no")
                                 : value.is_string() ? value.get<std::string>()
                                                     : value.dump();
        ASSERT_EQ(Run({"set", "@book.kvbook", "--" + name, back}).m_Code, 0) << name << back;
        EXPECT_EQ(RunJson({"set", "@book.kvbook"})["settings"], defaults) << name;
    }
}

TEST_F(BookVerbsTest, TheExportFollowsTheBooksOwnOptions)
{
    ASSERT_EQ(Run({"export", "@book.kvbook", "-o", "@plain.pdf", "--fixed-time", "0"}).m_Code, 0);
    ASSERT_EQ(Run({"set", "@book.kvbook", "--crop-marks", "yes", "--bleed", "yes"}).m_Code, 0);
    ASSERT_EQ(Run({"export", "@book.kvbook", "-o", "@kept.pdf", "--fixed-time", "0"}).m_Code, 0);
    ASSERT_EQ(Run({"set", "@book.kvbook", "--crop-marks", "no", "--bleed", "no"}).m_Code, 0);
    ASSERT_EQ(Run({"export", "@book.kvbook", "-o", "@asked.pdf", "--marks", "--fixed-time", "0"}).m_Code, 0);
    EXPECT_TRUE(Read("kept.pdf") == Read("asked.pdf"));
    EXPECT_FALSE(Read("kept.pdf") == Read("plain.pdf"));
}

TEST_F(BookVerbsTest, SaveAsLeavesTheOldBookAlone)
{
    std::string const before = Read("book.kvbook");
    ASSERT_EQ(Run({"save-as", "@book.kvbook", "@other"}).m_Code, 0);
    EXPECT_TRUE(Read("book.kvbook") == before);
    EXPECT_EQ(Chapters("@other.kvbook"), "*a@1 b c");
    ASSERT_EQ(Run({"remove", "@book.kvbook", "1"}).m_Code, 0);
    ASSERT_EQ(Run({"save-as", "@book.kvbook", "@other", "--force"}).m_Code, 0);
    EXPECT_EQ(Chapters("@other.kvbook"), "*b@3 c");
    EXPECT_FALSE(Exists("other.kvbook.lock"));
}

TEST_F(BookVerbsTest, APackageIsWholeOrNotThere)
{
    std::string const before = Read("book.kvbook");
    fs::create_directories(m_Folder / "empty");
    for (std::string const target : {"@package", "@empty", "@slash/"}) {
        auto const outcome = Run({"package", "@book.kvbook", target});
        ASSERT_EQ(outcome.m_Code, 0) << outcome.m_Err;
    }
    EXPECT_TRUE(Read("book.kvbook") == before);

    // On another machine the old documents are not there.
    fs::create_directories(m_Folder / "moved");
    fs::rename(m_Folder / "package", m_Folder / "moved/package");
    fs::rename(m_Folder / "docs", m_Folder / "elsewhere");
    EXPECT_EQ(Chapters("@moved/package/book.kvbook"), "*a@1 b c");
    auto const status = RunJson({"status", "@moved/package/book.kvbook"});
    for (auto const & chapter : status["chapters"]) {
        EXPECT_EQ(chapter["status"], "ok") << chapter.dump();
        EXPECT_TRUE(chapter["path"].get<std::string>().starts_with((m_Folder / "moved/package").string()));
    }

    auto const full = Run({"package", "@book.kvbook", "@moved"});
    EXPECT_EQ(full.m_Code, 1);
    auto const missing = Run({"package", "@book.kvbook", "@incomplete", "--no-locate"});
    EXPECT_EQ(missing.m_Code, 1) << "chapters are missing";
    // Where it would work, somebody else's things lie.
    fs::create_directories(m_Folder / "theirs.partial");
    Write("theirs.partial/letter", "dear");
    for (std::string const target : {"@theirs", "@moved"}) {
        fs::create_directories(m_Folder / "moved.partial");
        EXPECT_EQ(Run({"package", "@moved/package/book.kvbook", target}).m_Code, 1);
        EXPECT_TRUE(Exists("moved.partial"));
    }
    EXPECT_EQ(Read("theirs.partial/letter"), "dear");
    fs::remove_all(m_Folder / "theirs.partial");
    fs::remove_all(m_Folder / "moved.partial");
    auto const nowhere = Run({"package", "@moved/package/book.kvbook", "@nowhere/package"});
    EXPECT_EQ(nowhere.m_Code, 1);
    EXPECT_NE(nowhere.m_Err.find("cannot be made"), std::string::npos) << nowhere.m_Err;
    for (auto const & entry : fs::directory_iterator(m_Folder)) {
        std::string const name = entry.path().filename().string();
        EXPECT_FALSE(name.starts_with("incomplete") || name.ends_with(".partial")) << name;
    }
}

TEST_F(BookVerbsTest, ABookThatAnotherProgramHasIsLeftToIt)
{
    App::BookFileLock lock;
    std::string problem;
    ASSERT_TRUE(lock.Take(m_Folder / "book.kvbook", problem)) << problem;
    std::string const before = Read("book.kvbook");
    for (auto const & arguments : std::vector<std::vector<std::string>>{{"remove", "@book.kvbook", "1"},
                                                                        {"set", "@book.kvbook", "--links", "no"}}) {
        auto const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 1);
        EXPECT_NE(outcome.m_Err.find("process " + std::to_string(getpid())), std::string::npos) << outcome.m_Err;
    }
    for (auto const & arguments : std::vector<std::vector<std::string>>{{"status", "@book.kvbook"},
                                                                        {"set", "@book.kvbook"},
                                                                        {"save-as", "@book.kvbook", "@x"},
                                                                        {"package", "@book.kvbook", "@y"}}) {
        auto const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 0) << "reading takes nothing away: " << outcome.m_Err;
    }
    EXPECT_TRUE(Read("book.kvbook") == before);
}

TEST_F(BookVerbsTest, InterruptingLeavesTheOldBookOrTheNewOne)
{
    for (int patience = 1; patience <= 16; patience += 3) {
        SCOPED_TRACE(patience);
        fs::remove(m_Folder / "copy.kvbook");
        ASSERT_EQ(Run({"save-as", "@book.kvbook", "@copy"}).m_Code, 0);
        for (auto const & arguments : std::vector<std::vector<std::string>>{
                 {"add", "@copy.kvbook", "@docs/d.kvdoc", "--before", "1"},
                 {"package", "@copy.kvbook", "@package"},
             }) {
            std::string const before = Chapters("@copy.kvbook");
            auto const outcome = [&] {
                ImpatientUser const user(patience);
                return Run(arguments);
            }();
            if (0 == outcome.m_Code) {
                EXPECT_TRUE("package" != arguments[0] || Exists("package/copy.kvbook"));
                EXPECT_TRUE("add" != arguments[0] || "d@1 *a@1 b c" == Chapters("@copy.kvbook"));
            } else {
                EXPECT_EQ(outcome.m_Code, 1);
                EXPECT_NE(outcome.m_Err.find("nterrupted"), std::string::npos) << outcome.m_Err;
                EXPECT_EQ(Chapters("@copy.kvbook"), before);
                EXPECT_TRUE("package" != arguments[0] || !Exists("package"));
            }
            EXPECT_FALSE(Exists("package.partial"));
            EXPECT_FALSE(Exists("copy.kvbook.lock"));
            fs::remove_all(m_Folder / "package");
        }
    }
}

TEST_F(BookVerbsTest, ResultsAreForMachinesToo)
{
    int code = 0;
    auto const added = RunJson({"add", "@book.kvbook", "@docs/d.kvdoc"}, &code);
    EXPECT_EQ(code, 0);
    EXPECT_EQ(added["ok"], true);
    EXPECT_EQ(added["chapters"][3]["name"], "d");
    EXPECT_EQ(added["chapters"][3]["index"], 3);
    auto const failed = RunJson({"remove", "@book.kvbook", "e"}, &code);
    EXPECT_EQ(code, 1);
    EXPECT_EQ(failed["ok"], false);
    EXPECT_EQ(failed["messages"][0]["kind"], "chapter-unknown");
    EXPECT_EQ(failed["chapters"].size(), 4u);
    auto const quiet = Run({"move", "@book.kvbook", "1", "--end", "--quiet"});
    EXPECT_EQ(quiet.m_Out + quiet.m_Err, "");
}

TEST_F(BookVerbsTest, EveryVerbShowsAnExampleInItsHelp)
{
    std::string const help = Run({"--help"}).m_Out;
    for (std::size_t at = help.find("Verbs:\n") + 7; at < help.size() && "  " == help.substr(at, 2);) {
        std::string const verb = help.substr(at + 2, help.find(' ', at + 2) - at - 2);
        auto const outcome = Run({verb, "--help"});
        EXPECT_EQ(outcome.m_Code, 0) << verb;
        EXPECT_NE(outcome.m_Out.find("Example:\n  korvane " + verb), std::string::npos) << outcome.m_Out;
        at = help.find('\n', at) + 1;
        // A purpose that found no room stands on a line of its own.
        for (; at < help.size() && "    " == help.substr(at, 4); at = help.find('\n', at) + 1) {
        }
    }
    EXPECT_NE(help.find("  start-page"), std::string::npos) << help;
}
