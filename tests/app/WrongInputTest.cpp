#include "ProgramTest.h"

#include "app/BookFileLock.h"
#include "framework/kernel/DiskFault.h"
#include "support/OrdinaryUser.h"

#include <cerrno>
#include <sys/stat.h>
#include <unistd.h>

class WrongInputTest : public ProgramTest
{
};

namespace
{

struct Case
{
    char const * m_Why;
    std::vector<std::pair<std::string, std::string>> m_Files;
    int m_Code;
    /// What the messages have to contain.
    std::vector<std::string> m_Messages;
};

std::string Deep()
{
    std::string text;
    for (int level = 0; level < 20; ++level) {
        text += std::string(static_cast<std::size_t>(level) * 2, ' ') + "- level " + std::to_string(level) + "\n";
    }
    return text;
}

std::string WideTable()
{
    std::string head = "|";
    std::string rule = "|";
    for (int column = 0; column < 40; ++column) {
        head += " column" + std::to_string(column) + " |";
        rule += "---|";
    }
    return head + "\n" + rule + "\n" + head + "\n";
}

}

TEST_F(WrongInputTest, EachWrongSourceGetsItsSentenceAndAsMuchAsCanBeIsSet)
{
    std::string const png = "\x89PNG\r\n\x1a\n" + std::string(40, '\0');
    std::vector<Case> const cases{
        {"a chapter is missing",
         {{"book.toml", "chapters = ['a.md',\n'b.md']"}, {"a.md", "# A"}},
         1,
         {"book.toml:2:1: error: ", "b.md"}},
        {"a chapter is listed twice",
         {{"book.toml", "chapters = ['a.md', 'a.md']"}, {"a.md", "# A"}},
         0,
         {"book.toml:1:21: warning: "}},
        {"a syntax error", {{"book.toml", "title = \n"}, {"a.md", "# A"}}, 1, {"book.toml:1:"}},
        {"an unknown key", {{"book.toml", "colour = 'red'\n"}, {"a.md", "# A"}}, 0, {"book.toml:1:1: warning: "}},
        {"an unknown template", {{"book.toml", "template = 'nvoel'\n"}, {"a.md", "# A"}}, 1, {"nvoel", "novel"}},
        {"invalid UTF-8", {{"a.md", "# A\n\nx\xff"}, {"b.md", "# B"}}, 1, {"a.md:3:2: error: "}},
        {"zero bytes", {{"a.md", std::string("# A\0", 4)}, {"b.md", "# B"}}, 1, {"a.md:1:4: error: "}},
        {"UTF-16", {{"a.md", std::string("\xff\xfe#\0 \0A\0", 8)}}, 0, {"a.md: note: "}},
        {"an empty file", {{"a.md", ""}}, 0, {}},
        {"only headings", {{"a.md", "# A\n## B\n### C\n"}}, 0, {}},
        {"twenty levels of lists", {{"a.md", Deep()}}, 0, {}},
        {"a word longer than a line", {{"a.md", std::string(5000, 'w')}}, 0, {}},
        {"a table wider than the page", {{"a.md", WideTable()}}, 0, {}},
        {"a missing picture", {{"a.md", "x\n\n![P](gone.png)"}}, 0, {"a.md:3: warning: ", "gone.png"}},
        {"a picture cut short", {{"a.md", "![P](p.png)"}, {"p.png", png}}, 0, {"a.md:1: warning: ", "p.png"}},
        {"a picture that is none", {{"a.md", "![P](p.jpg)"}, {"p.jpg", "hello"}}, 0, {"a.md:1: warning: ", "p.jpg"}},
        {"links to nowhere",
         {{"a.md", "# A\n\n[x](#gone) [y](b.md#gone) [z](c.md)"}, {"b.md", "# B"}},
         0,
         {"a.md:3: warning: The link to #gone", "b.md has no anchor #gone", "The link to c.md"}},
        {"an anchor twice", {{"a.md", "# A {#x}\n\n# B {#x}\n"}}, 0, {"a.md:3: warning: "}},
        {"a file in place of the work folder", {{"a.md", "# A"}, {".korvane", "x"}}, 1, {"work folder"}},
        {"a folder in place of the output", {{"a.md", "# A"}, {"book.pdf/x", "x"}}, 1, {"book.pdf"}},
        {"a template with a mistake",
         {{"book.toml", "template = 'x.toml'"}, {"a.md", "# A"}, {"x.toml", "[page]\nsize = 'A0'"}},
         1,
         {"x.toml:2:"}},
    };
    for (Case const & row : cases) {
        SCOPED_TRACE(row.m_Why);
        std::filesystem::remove_all(m_Folder / "book");
        for (auto const & [name, text] : row.m_Files) {
            Write("book/" + name, text);
        }
        auto const outcome = Run({"build", "@book"});
        EXPECT_EQ(outcome.m_Code, row.m_Code) << outcome.m_Err;
        for (std::string const & text : row.m_Messages) {
            EXPECT_NE(outcome.m_Err.find(text), std::string::npos) << text << " is not in\n" << outcome.m_Err;
        }
        if (std::filesystem::is_regular_file(m_Folder / "book/book.pdf")) {
            EXPECT_TRUE(IsWholePdf(m_Folder / "book/book.pdf"));
        } else {
            EXPECT_EQ(row.m_Code, 1);
        }
    }
}

TEST_F(WrongInputTest, WrongUseIsToldFromFailure)
{
    struct Use
    {
        std::vector<std::string> m_Arguments;
        int m_Code;
        char const * m_Text;
    };
    for (auto const & [arguments, code, text] : {
             Use{{}, 2, "korvane build FOLDER"},
             Use{{"bind"}, 2, "no verb \"bind\""},
             Use{{"build", "@", "-o", ""}, 2, "--output"},
             Use{{"build", "@", "--password-file", "@"}, 2, "can't be read"},
             Use{{"build", "@", "--password-file", "/dev/zero"}, 2, "larger"},
             Use{{"status", ""}, 2, "BOOK"},
             Use{{"status", "@"}, 1, "This is a folder"},
             Use{{"export", "/dev/null", "-o", "@x.pdf"}, 1, "device"},
             Use{{"build"}, 2, "FOLDER"},
             Use{{"build", "@", "--colour"}, 2, "--colour"},
             Use{{"export", "x.kvbook"}, 2, "--output"},
             Use{{"--help"}, 0, "Example"},
             Use{{"build", "--help"}, 0, "Example"},
             Use{{"--version"}, 0, "korvane"},
             Use{{"build", "@nowhere"}, 1, "no such folder"},
             Use{{"build", "@"}, 1, "no Markdown file"},
             Use{{"status", "@gone.kvbook"}, 1, "gone.kvbook"},
             Use{{"show", "@gone.kvdoc"}, 1, "gone.kvdoc"},
             Use{{"export", "@gone.kvbook", "-o", "@x.pdf"}, 1, "gone.kvbook"},
             Use{{"import", "@gone.md"}, 1, "gone.md"},
         }) {
        auto const outcome = Run(arguments);
        std::string const all = outcome.m_Out + outcome.m_Err;
        EXPECT_EQ(outcome.m_Code, code) << all;
        EXPECT_NE(all.find(text), std::string::npos) << text << " is not in\n" << all;
    }
}

TEST_F(WrongInputTest, ForeignAndDamagedFilesAreRefused)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    std::string const document = Read("book/.korvane/1.kvdoc");
    std::string const book = Read("book/.korvane/book.kvbook");
    Write("text.kvdoc", "hello");
    Write("empty.kvbook", "");
    Write("cut.kvdoc", document.substr(0, document.size() * 2 / 3));
    Write("cut.kvbook", book.substr(0, book.size() * 2 / 3));
    Write("swapped.kvbook", document);
    for (char const * name : {"text.kvdoc", "empty.kvbook", "cut.kvdoc", "cut.kvbook"}) {
        auto const outcome = Run({"show", std::string("@") + name});
        EXPECT_EQ(outcome.m_Code, 1) << name;
        EXPECT_NE(outcome.m_Err.find(name), std::string::npos) << outcome.m_Err;
    }
    for (char const * name : {"empty.kvbook", "cut.kvbook", "swapped.kvbook"}) {
        EXPECT_EQ(Run({"status", std::string("@") + name}).m_Code, 1) << name;
        EXPECT_EQ(Run({"export", std::string("@") + name, "-o", "@x.pdf"}).m_Code, 1) << name;
        EXPECT_FALSE(Exists("x.pdf"));
    }
}

TEST_F(WrongInputTest, NoOutputReplacesWhatIsNoOutput)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    std::string const book = "@book/.korvane/book.kvbook";
    std::vector<std::vector<std::string>> const writers{{"build", "@book", "--force", "-o"},
                                                        {"export", book, "-o"},
                                                        {"print", book, "-o"},
                                                        {"print", book, "--preview"},
                                                        {"show", book, "--thumbnail"}};
    for (std::string const target : {"book/1.md", "book/.korvane/1.kvdoc", "book/.korvane/book.kvbook"}) {
        std::string const before = Read(target);
        for (std::vector<std::string> arguments : writers) {
            arguments.push_back("@" + target);
            auto const outcome = Run(arguments);
            EXPECT_EQ(outcome.m_Code, 1) << arguments[0] << " " << target;
            EXPECT_NE(outcome.m_Err.find("not replaced"), std::string::npos) << outcome.m_Err;
            EXPECT_EQ(Read(target), before) << arguments[0] << " " << target;
        }
    }
    // What a verb wrote before, it may write again; so may it what only has the name.
    Write("old.pdf", "old");
    EXPECT_EQ(Run({"export", book, "-o", "@old.pdf"}).m_Code, 0);
    std::filesystem::rename(m_Folder / "old.pdf", m_Folder / "old");
    EXPECT_EQ(Run({"export", book, "-o", "@old"}).m_Code, 0);

    // The book's own PDF has the name of a drawing that it places.
    std::filesystem::copy_file(m_Folder / "old", m_Folder / "book/book.pdf",
                               std::filesystem::copy_options::overwrite_existing);
    std::string const drawing = Read("book/book.pdf");
    Write("book/1.md", "# A\n\n![The plan](book.pdf)\n");
    auto const outcome = Run({"build", "@book"});
    EXPECT_EQ(outcome.m_Code, 1);
    EXPECT_NE(outcome.m_Err.find("places this file"), std::string::npos) << outcome.m_Err;
    EXPECT_EQ(Read("book/book.pdf"), drawing);
}

TEST_F(WrongInputTest, SourcesWithoutAnEndOrAPlaceAreRefusedAtOnce)
{
    Write("book/a.md", "# A");
    ASSERT_EQ(mkfifo((m_Folder / "book/b.md").c_str(), 0600), 0);
    std::filesystem::create_symlink("/dev/zero", m_Folder / "book/c.md");
    std::filesystem::create_symlink("d.md", m_Folder / "book/d.md");
    auto const outcome = Run({"build", "@book"});
    EXPECT_EQ(outcome.m_Code, 1);
    for (char const * text :
         {"b.md: error: This is a device or a pipe", "c.md: error: This is a device or a pipe", "d.md: error: "}) {
        EXPECT_NE(outcome.m_Err.find(text), std::string::npos) << text << " is not in\n" << outcome.m_Err;
    }
    EXPECT_EQ(outcome.m_Err.find("Unexpected"), std::string::npos) << outcome.m_Err;
}

TEST_F(WrongInputTest, NoNameOfAFileCommandsTheTerminal)
{
    Write("book/\x1b]0;x\x07.md", "# A\n\n[x](gone\x1b[2J.md) \xC2\x9B" "31m\n");
    auto const outcome = Run({"build", "@book", "-o", "@\x1b[8m.pdf"});
    EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
    for (std::string const & text : {outcome.m_Out, outcome.m_Err}) {
        EXPECT_EQ(text.find_first_of("\x1b\x07"), std::string::npos) << text;
        EXPECT_EQ(text.find("\xC2\x9B"), std::string::npos) << text;
    }
}

TEST_F(WrongInputTest, AFolderThatMayNotBeWrittenLeavesTheTargetAlone)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    WriteBook(1);
    Write("shut/out.pdf", "old");
    chmod((m_Folder / "shut").c_str(), 0555);
    auto const outcome = Run({"build", "@book", "-o", "@shut/out.pdf"});
    chmod((m_Folder / "shut").c_str(), 0755);
    EXPECT_EQ(outcome.m_Code, 1);
    EXPECT_NE(outcome.m_Err.find("out.pdf"), std::string::npos) << outcome.m_Err;
    EXPECT_EQ(Read("shut/out.pdf"), "old");
}

TEST_F(WrongInputTest, APdfThatCannotBeWrittenIsToldWithItsCauseAndRemedy)
{
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    std::string const book = (m_Folder / "book/.korvane/book.kvbook").string();
    Write("folder/file", "");
    Write("out.pdf", "old");
    struct FailureCase
    {
        char const * m_Target;
        /// Part of the path of files that find no room; null for none.
        char const * m_Full;
        std::vector<char const *> m_Said;
    };
    for (FailureCase const & row : std::vector<FailureCase>{
             {"@folder", nullptr, {"is a folder"}},
             {"/dev/full", nullptr, {"No space left"}},
             {"@out.pdf", ".out.pdf-", {"out.pdf", "No space left"}},
             {"@out.pdf", "/korvane-", {"out.pdf", "No space left", "TMPDIR"}},
             {"@out.pdf", "", {"out.pdf", "No space left", "TMPDIR"}},
         }) {
        for (char const * const verb : {"export", "print"}) {
            if (row.m_Full && std::string("/korvane-") == row.m_Full && std::string("print") == verb) {
                continue; // It writes beside its target.
            }
            SCOPED_TRACE(std::string(verb) + " " + row.m_Target + " " + (row.m_Full ? row.m_Full : ""));
            if (row.m_Full) {
                Kernel::DiskFault::SetHandler([&](Kernel::DiskOperation operation, String const & path) {
                    std::string const where = row.m_Full;
                    std::string const own = m_Folder.string();
                    std::string const place = path.ToStd();
                    bool const isMeant = where.empty() ? place.empty() : place.rfind(where) != std::string::npos;
                    // The test's own folder begins like the program's temporary files.
                    bool const isFolder = where == "/korvane-" && place.starts_with(own);
                    return Kernel::DiskOperation::Write == operation && isMeant && !isFolder ? ENOSPC : 0;
                });
            }
            auto const outcome = Run({verb, book, "-o", row.m_Target, "--no-update"});
            Kernel::DiskFault::SetHandler({});
            EXPECT_EQ(outcome.m_Code, 1);
            for (char const * const said : row.m_Said) {
                EXPECT_NE(outcome.m_Err.find(said), std::string::npos) << outcome.m_Err;
            }
            EXPECT_EQ(outcome.m_Err.find("error:"), outcome.m_Err.rfind("error:")) << "told once: " << outcome.m_Err;
            EXPECT_EQ(Read("out.pdf"), "old");
        }
    }
    for (auto const & entry : std::filesystem::directory_iterator(m_Folder / "book/.korvane")) {
        if (entry.path().extension() == ".kvdoc") {
            std::filesystem::remove(entry.path());
        }
    }
    auto const outcome = Run({"export", book, "-o", "@out.pdf", "--no-update", "--no-locate"});
    EXPECT_EQ(outcome.m_Code, 1);
    EXPECT_NE(outcome.m_Err.find("None of the book's chapters can be opened"), std::string::npos) << outcome.m_Err;
    EXPECT_EQ(Read("out.pdf"), "old");
}

TEST_F(WrongInputTest, WhatNoFontHasIsToldWithItsPageWhereverItIsWritten)
{
    Write("book/one.md", "# One\n\nPlain.\n\n# Two\n\nA \xF4\x8F\xBF\xBD that no font has.\n");
    std::string const book = (m_Folder / "book/.korvane/book.kvbook").string();
    for (auto const & arguments : std::vector<std::vector<std::string>>{
             {"build", "@book"}, {"export", book, "-o", "@out.pdf"}, {"print", book, "-o", "@out.pdf", "--layout", "booklet"}}) {
        auto const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
        std::size_t const at = outcome.m_Err.find("a character that no installed font contains. This is on page ");
        EXPECT_NE(at, std::string::npos) << arguments[0] << ": " << outcome.m_Err;
    }
}

TEST_F(WrongInputTest, ABookInAFolderThatMayNotBeWrittenCanBeReadAndPutOut)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    WriteBook(1);
    ASSERT_EQ(Run({"build", "@book"}).m_Code, 0);
    std::filesystem::path const work = m_Folder / "book/.korvane";
    chmod(work.c_str(), 0555);
    chmod((work / "1.kvdoc").c_str(), 0);
    auto const shut = Run({"show", "@book/.korvane/1.kvdoc"});
    EXPECT_EQ(shut.m_Code, 1);
    EXPECT_NE(shut.m_Err.find("permission"), std::string::npos) << shut.m_Err;
    chmod((work / "1.kvdoc").c_str(), 0444);
    std::string const book = "@book/.korvane/book.kvbook";
    for (std::vector<std::string> const & arguments :
         {std::vector<std::string>{"status", book}, {"preflight", book}, {"plan", book},
          {"export", book, "--no-update", "-o", "@a.pdf"}, {"print", book, "--no-update", "-o", "@b.pdf"}}) {
        auto const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, 0) << arguments[0] << ": " << outcome.m_Err;
    }
    chmod(work.c_str(), 0755);
}

TEST_F(WrongInputTest, AFileOfAnotherProgramIsNoBookAndTheUserLearnsWhatToDo)
{
    Write("notes.txt", std::string(200, 'x'));
    for (char const * const verb : {"status", "preflight", "plan"}) {
        auto const outcome = Run({verb, "@notes.txt"});
        EXPECT_EQ(outcome.m_Code, 1) << verb;
        EXPECT_NE(outcome.m_Err.find("is not a file of this program. Choose another one."), std::string::npos)
            << verb << ": " << outcome.m_Err;
    }
}

TEST_F(WrongInputTest, ASecondProgramIsToldWhoHasTheBook)
{
    WriteBook(1);
    std::filesystem::create_directories(m_Folder / "book/.korvane");
    App::BookFileLock lock;
    std::string problem;
    ASSERT_TRUE(lock.Take(m_Folder / "book/.korvane/book.kvbook", problem)) << problem;
    auto const outcome = Run({"build", "@book"});
    EXPECT_EQ(outcome.m_Code, 1);
    EXPECT_NE(outcome.m_Err.find("process " + std::to_string(getpid())), std::string::npos) << outcome.m_Err;
}
