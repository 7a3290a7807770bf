#include "ProgramTest.h"

#include "app/PasswordBook.h"
#include "support/DrawingBuilder.h"
#include "support/PdfProbe.h"

#include <algorithm>
#include <gmock/gmock.h>

class PlacedPicturesTest : public ProgramTest
{
protected:
    void WriteBytes(std::string const & name, Raster::Picture::Bytes const & bytes) const
    {
        Write(name, std::string(bytes->begin(), bytes->end()));
    }

    /// Kinds of the messages, each with its line.
    static std::vector<std::string> KindsOf(nlohmann::json const & result)
    {
        std::vector<std::string> kinds;
        for (auto const & message : result["messages"]) {
            kinds.push_back(message["kind"].get<std::string>() + ":" + std::to_string(message.value("line", 0)));
        }
        return kinds;
    }

    std::string TextOf(std::string const & name) const
    {
        PdfProbe const probe(String((m_Folder / name).string()));
        std::string text;
        for (int page = 1; page <= probe.PageCount(); ++page) {
            text += probe.Text(page);
        }
        std::replace(text.begin(), text.end(), '\n', ' ');
        return text;
    }
};

TEST_F(PlacedPicturesTest, PagesAndDrawingsAreSetAndWhatCannotBeIsSaidWithItsLine)
{
    PdfSketch sketch;
    for (char const * word : {"Firstpage", "Secondpage"}) {
        sketch.m_Pages.push_back(std::string("BT/F 9 Tf 5 5 Td(") + word + ")Tj ET");
    }
    sketch.m_Pages.erase(sketch.m_Pages.begin());
    sketch.m_Keys += "/Resources<</Font<</F<</Type/Font/Subtype/Type1/BaseFont/Helvetica>>>>>>";
    WriteBytes("book/figure.pdf", sketch.Make());
    WriteBytes("book/drawing.svg", SvgWith("<text x='5' y='30' font-family='Liberation Sans'>Drawnword</text>"));
    Write("book/broken.pdf", "%PDF-1.7\nnothing");
    Write("book/1.md", "# One\n\n"
                       "![](figure.pdf){page=2 width=50%}\n\n"
                       "![](drawing.svg)\n\n"
                       "![](figure.pdf){page=3}\n\n"
                       "![](figure.pdf){page=second}\n\n"
                       "![](drawing.svg){page=2}\n\n"
                       "![](broken.pdf)\n");
    int code = 0;
    auto const result = RunJson({"build", "@book", "-o", "@out.pdf"}, &code);
    EXPECT_EQ(code, 0);
    EXPECT_THAT(KindsOf(result), testing::UnorderedElementsAre("picture-page:7", "picture-page:9", "picture-page:11",
                                                               "picture-damaged:13"))
        << result["messages"].dump(1);
    EXPECT_TRUE(IsWholePdf(m_Folder / "out.pdf"));
    std::string const text = TextOf("out.pdf");
    EXPECT_NE(text.find("Secondpage"), std::string::npos);
    EXPECT_NE(text.find("Firstpage"), std::string::npos) << "for a page that is none, the first";
    EXPECT_NE(text.find("Drawnword"), std::string::npos);
    EXPECT_NE(text.find("its last one is 2"), std::string::npos) << "the box says why";

    EXPECT_TRUE(RunJson({"build", "@book", "-o", "@out.pdf"})["upToDate"].get<bool>());
    WriteBytes("book/drawing.svg", SvgWith("<text x='5' y='30' font-family='Liberation Sans'>Redrawn</text>"));
    EXPECT_FALSE(RunJson({"build", "@book", "-o", "@out.pdf"})["upToDate"].get<bool>());
    EXPECT_NE(TextOf("out.pdf").find("Redrawn"), std::string::npos);
}

TEST_F(PlacedPicturesTest, APasswordComesFromTheCommandLineOrAFileAndIsKeptNowhere)
{
    PdfSketch sketch;
    sketch.m_Pages = {"BT/F 9 Tf 5 5 Td(Hiddenword)Tj ET"};
    sketch.m_Keys += "/Resources<</Font<</F<</Type/Font/Subtype/Type1/BaseFont/Helvetica>>>>>>";
    sketch.m_Password = "op=en sesame";
    WriteBytes("book/plans/locked.pdf", sketch.Make());
    Write("book/1.md", "# One\n\n![](plans/locked.pdf)\n\n![](plans/locked.pdf){width=2cm}\n");
    struct Row
    {
        char const * m_Why;
        std::vector<std::string> m_Arguments;
        bool m_IsOpen;
        int m_Code;
    };
    Write("good", "# comment\r\n\r\nplans/locked.pdf=op=en sesame\r\n");
    Write("bad", "plans/locked.pdf\n");
    Row const rows[] = {
        {"without", {}, false, 0},
        {"wrong", {"--password", "locked.pdf=wrong"}, false, 0},
        {"of another file", {"--password", "ed.pdf=op=en sesame"}, false, 0},
        {"by name", {"--password", "locked.pdf=op=en sesame"}, true, 0},
        {"by file", {"--password-file", "@good"}, true, 0},
        {"no password in it", {"--password", "locked.pdf"}, false, 2},
        {"a file that is wrong", {"--password-file", "@bad"}, false, 2},
        {"a file that is missing", {"--password-file", "@none"}, false, 2},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_Why);
        std::filesystem::remove(m_Folder / "out.pdf");
        std::vector<std::string> arguments{"build", "@book", "-o", "@out.pdf"};
        arguments.insert(arguments.end(), row.m_Arguments.begin(), row.m_Arguments.end());
        Outcome const outcome = Run(arguments);
        EXPECT_EQ(outcome.m_Code, row.m_Code) << outcome.m_Err;
        EXPECT_EQ((outcome.m_Out + outcome.m_Err).find("sesame"), std::string::npos);
        if (0 == row.m_Code) {
            EXPECT_EQ(TextOf("out.pdf").find("Hiddenword") != std::string::npos, row.m_IsOpen);
            EXPECT_EQ(outcome.m_Err.find("--password") == std::string::npos, row.m_IsOpen) << outcome.m_Err;
        }
    }
    for (auto const & [name, content] : Documents()) {
        EXPECT_EQ(content.find("sesame"), std::string::npos) << name;
    }
    EXPECT_EQ(Read("book/.korvane/import.json").find("sesame"), std::string::npos);
    // The documents have its size by now: who exports them without the password gets the box and is told once.
    std::filesystem::remove(m_Folder / "out.pdf");
    Outcome const exported = Run({"export", "@book/.korvane/book.kvbook", "-o", "@out.pdf"});
    EXPECT_EQ(TextOf("out.pdf").find("Hiddenword"), std::string::npos) << exported.m_Err;
    EXPECT_EQ(exported.m_Err.find("--password FILE"), exported.m_Err.rfind("--password FILE")) << exported.m_Err;
    EXPECT_NE(exported.m_Err.find("--password FILE"), std::string::npos) << exported.m_Err;
}

TEST(PasswordBookTest, TheUserIsAskedOnceForAFileAndAgainIfItWasWrong)
{
    App::PasswordBook book;
    std::vector<std::string> answers{"third", "second", "first"};
    int asked = 0;
    book.SetAsk([&](std::string const & question, std::string & answer) {
        EXPECT_NE(question.find("/a/plan.pdf"), std::string::npos);
        ++asked;
        answer = answers.back();
        answers.pop_back();
        return true;
    });
    EXPECT_EQ(book.Find("/a/plan.pdf", false), "first");
    EXPECT_EQ(book.Find("/a/plan.pdf", false), "first");
    EXPECT_EQ(asked, 1);
    EXPECT_EQ(book.Find("/a/plan.pdf", true), "second");
    EXPECT_EQ(book.Find("/a/plan.pdf", true), "third");
    EXPECT_EQ(book.Find("/a/plan.pdf", true), "") << "three attempts";
    EXPECT_EQ(asked, 3);

    App::PasswordBook refused;
    int refusals = 0;
    refused.SetAsk([&refusals](std::string const &, std::string &) {
        ++refusals;
        return false;
    });
    EXPECT_EQ(refused.Find("/b.pdf", false), "");
    EXPECT_EQ(refused.Find("/b.pdf", false), "");
    EXPECT_EQ(refusals, 1);
}

TEST(PasswordBookTest, PasswordsInArgumentsAreOverwritten)
{
    std::string arguments[] = {"korvane", "build", "--password", "a.pdf=secret", "--password=b.pdf=hidden", "folder"};
    std::vector<char *> pointers;
    for (std::string & argument : arguments) {
        pointers.push_back(argument.data());
    }
    App::HidePasswords(static_cast<int>(pointers.size()), pointers.data());
    EXPECT_EQ(arguments[3], "************");
    EXPECT_EQ(arguments[4], "--password=************");
    EXPECT_EQ(arguments[5], "folder");
}

TEST_F(PlacedPicturesTest, APackageOnAnotherMachineGivesTheSamePdfToTheByte)
{
    // Two chapters of one file name, from folders whose names are no plain words, with pictures of one name.
    std::vector<std::string> book{"new", "@book.kvbook"};
    int shade = 0;
    for (std::string const folder : {"sources/\u00E4 \u00F6", "sources/two\nlines"}) {
        std::string const fill = "<rect width='" + std::to_string(++shade * 20) + "' height='40'/>";
        WriteBytes(folder + "/inner.svg", SvgWith(fill));
        WriteBytes(folder + "/drawing.svg", SvgWith("<image href='inner.svg' x='5' y='5' width='50' height='25'/>"));
        PdfSketch figure;
        figure.m_Pages = {std::to_string(shade) + " w 0 0 m 50 50 l S"};
        WriteBytes(folder + "/figure.pdf", figure.Make());
        Write(folder + "/text.md", "# Text\n\n![](drawing.svg)\n\n![](figure.pdf)\n");
        auto const imported = Run({"import", "@" + folder + "/text.md", "-o", "@" + folder + "/docs"});
        ASSERT_EQ(imported.m_Code, 0) << imported.m_Err;
        book.push_back("@" + folder + "/docs/text.kvdoc");
    }
    ASSERT_EQ(Run(book).m_Code, 0);
    auto const exported = [this](std::string const & from, std::string const & target) {
        auto const outcome = Run({"export", "@" + from, "-o", "@" + target, "--fixed-time", "1"});
        EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
        return Read(target);
    };
    std::string const here = exported("book.kvbook", "here.pdf");
    auto const packaged = Run({"package", "@book.kvbook", "@package"});
    ASSERT_EQ(packaged.m_Code, 0) << packaged.m_Err;
    EXPECT_EQ(packaged.m_Err, "");
    std::filesystem::remove_all(m_Folder / "sources");
    std::filesystem::create_directories(m_Folder / "there");
    std::filesystem::rename(m_Folder / "package", m_Folder / "there/package");
    EXPECT_TRUE(exported("there/package/book.kvbook", "there.pdf") == here);
    // The drawings hold all that they show: where an inner one is missing, the page is another one.
    for (std::string const folder : {"drawing", "drawing-2"}) {
        EXPECT_TRUE(std::filesystem::remove(m_Folder / "there/package/Pictures" / folder / "inner.svg"));
    }
    EXPECT_FALSE(exported("there/package/book.kvbook", "less.pdf") == here);
}
