#include "ProgramTest.h"

/// The real program, with streams as a shell may hand them over.
class StreamsTest : public ProgramTest
{
protected:
    StreamsTest()
    {
        WriteBook(1);
        EXPECT_EQ(Run({"build", "@book"}).m_Code, 0);
    }

    /// A line of bash in the test's folder, in which $korvane is the program.
    Outcome Bash(std::string const & line) const
    {
        return Shell("cd '" + m_Folder.string() + "'; export LC_ALL=C korvane='" + g_Program + "'; " + line);
    }
};

TEST_F(StreamsTest, EachStreamThatIsNotThereHasItsOwnEnd)
{
    struct Case
    {
        char const * m_Why;
        std::string m_Line;
        std::string m_Says;
    };
    std::string const gone = "exec 3> >(true); wait $!; ";
    std::string const book = "book/.korvane/book.kvbook";
    for (auto const & [why, line, says] : {
             Case{"a reader that has seen enough is no failure", gone + "$korvane status " + book + " >&3; echo $?", "0\n"},
             Case{"nor is one of the help", gone + "$korvane --help >&3; echo $?", "0\n"},
             Case{"watching for nobody ends", gone + "timeout -k 1 30 $korvane watch " + book + " >&3; echo $?", "0\n"},
             Case{"a full disk is a failure", "$korvane --help >/dev/full; echo $?",
                  "korvane: error: The output could not be written.\n1\n"},
             Case{"so is a stream that was closed", "$korvane status " + book + " >&-; echo $?",
                  "korvane: error: The output could not be written.\n1\n"},
             Case{"a pipe that nobody reads", "mkfifo p; timeout -k 1 30 $korvane print " + book + " --no-update -q -o p; echo $?",
                  m_Folder.string() + "/p: error: "},
         }) {
        auto const outcome = Bash(line);
        EXPECT_EQ(outcome.m_Out.substr(0, says.size()), says) << why << ":\n" << outcome.m_Out;
    }
}

TEST_F(StreamsTest, NoFileOfABookTakesThePlaceOfAClosedStream)
{
    EXPECT_EQ(Bash("$korvane build book --force <&- >&- 2>&-; echo $?").m_Out, "1\n");
    EXPECT_TRUE(IsWholePdf(m_Folder / "book/book.pdf"));
    EXPECT_EQ(Run({"status", "@book/.korvane/book.kvbook"}).m_Code, 0);
}
