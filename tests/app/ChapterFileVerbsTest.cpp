#include "ProgramTest.h"

#include "app/BookWatch.h"
#include "app/Console.h"
#include "app/Verbs.h"
#include "framework/document/DocumentController.h"
#include "framework/kernel/FileLock.h"
#include "support/OrdinaryUser.h"

#include <fstream>
#include <gmock/gmock.h>
#include <sstream>

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::Not;

namespace
{

constexpr char const * BookFile = "book/.korvane/book.kvbook";

/// A built book of a title page and three chapters, whose documents are moved about.
class ChapterVerbsTest : public ProgramTest
{
protected:
    void SetUp() override
    {
        WriteBook(3);
        ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    }
    [[nodiscard]] fs::path Document(int chapter) const
    {
        return m_Folder / "book/.korvane" / (std::to_string(chapter) + ".kvdoc");
    }
    void Move(int chapter, std::string const & folder) const
    {
        fs::create_directories(m_Folder / folder);
        fs::rename(Document(chapter), m_Folder / folder / Document(chapter).filename());
    }
    [[nodiscard]] std::string StatusOf(int chapter) const
    {
        return RunJson({"status", std::string("@") + BookFile, "--no-locate"})["chapters"][static_cast<std::size_t>(
            chapter)]["status"];
    }
    /// Runs the program with these answers to its questions, in turn; then nobody answers any more.
    Outcome RunWithAnswers(std::vector<std::string> const & arguments, std::vector<std::string> answers)
    {
        std::ostringstream out;
        std::ostringstream err;
        m_Questions.clear();
        Outcome outcome;
        outcome.m_Code = App::RunProgram(arguments, out, err, {},
                                         [&, next = std::size_t{0}](std::string const & question,
                                                                    std::string & answer) mutable {
                                             m_Questions.push_back(question);
                                             if (next == answers.size()) {
                                                 return false;
                                             }
                                             answer = answers[next++];
                                             return true;
                                         });
        outcome.m_Out = out.str();
        outcome.m_Err = err.str();
        return outcome;
    }

    std::vector<std::string> m_Questions;
};

using LocateTest = ChapterVerbsTest;
using WatchTest = ChapterVerbsTest;
using PreflightVerbTest = ChapterVerbsTest;

}

TEST_F(LocateTest, NamesOnePlaceOrAFolderAndFindsTheOthers)
{
    std::string const book = std::string("@") + BookFile;
    struct Row
    {
        char const * m_Why;
        std::vector<std::string> m_Arguments;
    };
    for (Row const & row :
         {Row{"a file for a file", {"@book/.korvane/1.kvdoc", "@elsewhere/1.kvdoc"}},
          Row{"a file and the folder that holds it now", {"@book/.korvane/3.kvdoc", "@elsewhere"}},
          Row{"a folder that has moved", {"@book/.korvane", "@elsewhere"}},
          Row{"by its name alone", {"1.kvdoc", "@elsewhere"}}}) {
        Move(1, "elsewhere");
        Move(3, "elsewhere");
        int code = -1;
        auto const found = RunJson({"locate", book, row.m_Arguments[0], row.m_Arguments[1]}, &code);
        EXPECT_EQ(code, 0) << row.m_Why << found.dump(1);
        EXPECT_EQ(found["located"].size(), 2u) << row.m_Why << found.dump(1);
        EXPECT_EQ(StatusOf(1), "ok") << row.m_Why << ": the book's file knows it";
        EXPECT_EQ(StatusOf(3), "ok") << row.m_Why;

        // And back, by the same verb.
        fs::rename(m_Folder / "elsewhere/1.kvdoc", Document(1));
        fs::rename(m_Folder / "elsewhere/3.kvdoc", Document(3));
        ASSERT_EQ(Run({"locate", book, "@elsewhere", "@book/.korvane"}).m_Code, 0) << row.m_Why;
    }
}

TEST_F(LocateTest, RefusesWhatMakesNoSenseAndLeavesTheBookAlone)
{
    Move(2, "elsewhere");
    Write("elsewhere/notes.txt", "no document");
    std::string const before = Read(BookFile);
    struct Row
    {
        std::vector<std::string> m_Arguments;
        char const * m_Says;
    };
    for (Row const & row :
         {Row{{"@book/.korvane/2.kvdoc", "@nowhere/2.kvdoc"}, "There is no such file"},
          Row{{"@book/.korvane/2.kvdoc", "@book"}, "There is no such file"},
          Row{{"@book/.korvane/1.kvdoc", "@elsewhere/2.kvdoc"}, "korvane replace"},
          Row{{"9.kvdoc", "@elsewhere"}, "No missing chapter"},
          Row{{"@book/.korvane/2.kvdoc"}, "Say both"},
          Row{{}, "Nobody can be asked here"}}) {
        std::vector<std::string> arguments{"locate", std::string("@") + BookFile};
        arguments.insert(arguments.end(), row.m_Arguments.begin(), row.m_Arguments.end());
        Outcome const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 1) << row.m_Says;
        EXPECT_THAT(outcome.m_Err, HasSubstr(row.m_Says));
        EXPECT_EQ(Read(BookFile), before) << row.m_Says;
    }
}

TEST_F(LocateTest, AsksOnATerminalAndTakesOnlyFilesThatAreThere)
{
    Move(1, "elsewhere");
    Move(2, "elsewhere");
    std::string const book = (m_Folder / BookFile).string();
    Outcome const outcome =
        RunWithAnswers({"locate", book}, {(m_Folder / "nowhere").string(), (m_Folder / "elsewhere/1.kvdoc").string()});
    EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
    EXPECT_EQ(m_Questions.size(), 2u) << "the second chapter is found by the first one's move";
    EXPECT_THAT(outcome.m_Err, HasSubstr("There is no such file"));
    EXPECT_EQ(StatusOf(1), "ok");
    EXPECT_EQ(StatusOf(2), "ok");
}

TEST_F(LocateTest, TheSearchEndsWhenTheUserKnowsNothing)
{
    Move(1, "elsewhere");
    Move(2, "other");
    std::string const book = (m_Folder / BookFile).string();
    Outcome const outcome = RunWithAnswers({"locate", book}, {""});
    EXPECT_EQ(m_Questions.size(), 1u);
    EXPECT_THAT(outcome.m_Err, HasSubstr("Still missing"));
    // The same where an option says yes and nobody is there to name a file.
    EXPECT_THAT(Run({"status", std::string("@") + BookFile, "--locate"}).m_Out, HasSubstr("missing"));
}

TEST_F(LocateTest, AShutFileIsAskedAboutOnATerminal)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    std::string const book = (m_Folder / BookFile).string();
    fs::permissions(Document(2), fs::perms::none);
    Outcome outcome = RunWithAnswers({"status", book, "--no-locate"}, {"r", "a"});
    ASSERT_EQ(m_Questions.size(), 2u) << outcome.m_Err;
    EXPECT_THAT(m_Questions[0], HasSubstr(Document(2).string()));
    EXPECT_EQ(m_Questions[0], m_Questions[1]) << "it is still shut";
    EXPECT_THAT(outcome.m_Out, HasSubstr("locked"));
    outcome = RunWithAnswers({"status", book, "--no-locate"}, {});
    EXPECT_THAT(outcome.m_Err, HasSubstr("chmod"));
    fs::permissions(Document(2), fs::perms::owner_read);
    EXPECT_EQ(StatusOf(2), "ok");
}

TEST_F(ChapterVerbsTest, StatusSaysWhyAChapterIsNoGoodAndWhatHelps)
{
    std::string const whole = Read("book/.korvane/2.kvdoc");
    Kernel::Counted<Kernel::FileLock> lock;
    struct Row
    {
        std::function<void()> m_Deed;
        char const * m_State;
        char const * m_Helps;
    };
    for (Row const & row :
         {Row{[&] { Write("book/.korvane/2.kvdoc", whole.substr(0, whole.size() / 2)); }, "unusable", "backup"},
          Row{[&] { Write("book/.korvane/2.kvdoc", "no document"); }, "unusable", "not a"},
          Row{[&] { fs::remove(Document(2)); }, "missing", "korvane locate"},
          Row{[&] {
                  Write("book/.korvane/2.kvdoc", whole);
                  Kernel::FileLock::Result result{};
                  lock = Kernel::FileLock::Acquire(String(Document(2).string()), Kernel::FileLock::Kind::Exclusive,
                                                   result);
              },
              "locked", "Close it there"}}) {
        row.m_Deed();
        Outcome const outcome = Run({"status", std::string("@") + BookFile, "--no-locate"});
        EXPECT_EQ(outcome.m_Code, 0);
        EXPECT_THAT(outcome.m_Out, HasSubstr(row.m_State));
        EXPECT_THAT(outcome.m_Err, HasSubstr(Document(2).string())) << row.m_State;
        EXPECT_THAT(outcome.m_Err, HasSubstr(row.m_Helps)) << row.m_State;
        EXPECT_THAT(outcome.m_Err, Not(HasSubstr("1.kvdoc")));
    }
}

TEST_F(WatchTest, EachThingThatHappensToAFileIsTold)
{
    std::ostringstream out;
    std::ostringstream err;
    App::Console console(out, err, {}, {});
    App::Listener listener(console, nullptr, {});
    App::BookSession session(console, listener);
    Import::MessageList messages;
    ASSERT_TRUE(session.Open((m_Folder / BookFile).string(), messages));
    App::BookWatch watch(console, session, listener, false);
    watch.Begin();
    EXPECT_THAT(out.str(), HasSubstr("3. Chapter 2  ok"));
    out.str({});
    EXPECT_FALSE(watch.Look()) << "nothing has happened";

    fs::path const aside = Document(2).string() + ".aside";
    Kernel::Counted<Kernel::FileLock> lock;
    struct Row
    {
        char const * m_Why;
        std::function<void()> m_Deed;
        char const * m_Says;
    };
    for (Row const & row :
         {Row{"it vanishes", [&] { fs::rename(Document(2), aside); }, "3. Chapter 2  missing"},
          Row{"it comes back", [&] { fs::rename(aside, Document(2)); }, "3. Chapter 2  ok  pages"},
          Row{"somebody takes it",
              [&] {
                  Kernel::FileLock::Result result{};
                  lock = Kernel::FileLock::Acquire(String(Document(2).string()), Kernel::FileLock::Kind::Exclusive,
                                                   result);
              },
              "3. Chapter 2  locked"},
          Row{"and lets it go", [&] { lock.Reset(); }, "3. Chapter 2  ok"},
          Row{"it is touched",
              [&] { fs::last_write_time(Document(2), fs::last_write_time(Document(2)) + std::chrono::seconds(5)); },
              "3. Chapter 2  changed"},
          Row{"another takes its place, with the same time",
              [&] {
                  auto const time = fs::last_write_time(Document(2));
                  fs::copy_file(Document(3), aside);
                  fs::last_write_time(aside, time);
                  fs::rename(aside, Document(2));
              },
              "3. Chapter 2  changed  pages"}}) {
        row.m_Deed();
        EXPECT_TRUE(watch.Look()) << row.m_Why;
        EXPECT_THAT(out.str(), HasSubstr(row.m_Says)) << row.m_Why;
        EXPECT_THAT(out.str(), Not(HasSubstr("Chapter 1"))) << row.m_Why;
        out.str({});
        EXPECT_FALSE(watch.Look()) << row.m_Why << ": told once";
    }
}

TEST_F(WatchTest, PagesRunOnAnewWhereTheUserWantsIt)
{
    std::string const book = std::string("@") + BookFile;
    for (bool const renumbers : {false, true}) {
        auto const before = RunJson({"status", book})["chapters"];
        int const start = before[3]["cachedStartPage"];
        std::ostringstream out;
        std::ostringstream err;
        {
            App::Console console(out, err, {}, {});
            App::Listener listener(console, nullptr, {});
            App::BookSession session(console, listener);
            Import::MessageList messages;
            ASSERT_TRUE(session.Open((m_Folder / BookFile).string(), messages));
            App::BookWatch watch(console, session, listener, renumbers);
            watch.Begin();
            // A longer chapter takes the place of the second.
            Write("long.md", Read("book/2.md") + Read("book/2.md") + Read("book/2.md"));
            ASSERT_EQ(Run({"import", "@long.md", "-o", "@long"}).m_Code, 0);
            fs::copy_file(m_Folder / "long/long.kvdoc", Document(2), fs::copy_options::overwrite_existing);
            EXPECT_TRUE(watch.Look());
            watch.Look();
        }
        auto const after = RunJson({"status", book})["chapters"];
        if (renumbers) {
            EXPECT_GT(after[3]["cachedStartPage"].get<int>(), start) << out.str();
            EXPECT_EQ(after[2]["status"], "ok") << "the book's file has been saved";
        } else {
            EXPECT_EQ(after[3]["cachedStartPage"], start) << out.str();
        }
    }
}

TEST_F(PreflightVerbTest, TellsEachFindingAndEndsWithOne)
{
    std::string const book = std::string("@") + BookFile;
    int code = -1;
    auto clean = RunJson({"preflight", book}, &code);
    EXPECT_EQ(code, 0) << clean.dump(1);
    EXPECT_EQ(clean["ok"], true);
    ASSERT_EQ(clean["chapters"].size(), 4u);
    EXPECT_EQ(clean["chapters"][2]["checked"], true);

    Write("bad.md", "# Bad\n\n![gone](gone.png)\n\nSee [there](#nowhere).\n");
    ASSERT_EQ(Run({"import", "@bad.md", "-o", "@bad"}).m_Code == 2, false);
    fs::copy_file(m_Folder / "bad/bad.kvdoc", Document(2), fs::copy_options::overwrite_existing);
    fs::remove(Document(3));
    auto const found = RunJson({"preflight", book, "--no-locate"}, &code);
    EXPECT_EQ(code, 1);
    auto const & chapter = found["chapters"][2];
    ASSERT_FALSE(chapter["findings"].empty()) << found.dump(1);
    EXPECT_EQ(chapter["findings"][0]["problem"], "missing-picture") << found.dump(1);
    EXPECT_EQ(chapter["findings"][0]["severity"], "error");
    EXPECT_EQ(chapter["findings"][0]["pageIndex"], 0);
    EXPECT_EQ(found["chapters"][3]["checked"], false) << "what cannot be opened cannot be checked";
    Outcome const lines = Run({"preflight", book, "--no-locate"});
    EXPECT_EQ(lines.m_Code, 1);
    EXPECT_THAT(lines.m_Out, HasSubstr("3. Chapter 2"));
    EXPECT_THAT(lines.m_Out, HasSubstr("gone.png"));
    EXPECT_THAT(lines.m_Out, HasSubstr("not checked: missing. "));
}
