#include "ProgramTest.h"

#include "app/PaperSize.h"
#include "support/PdfProbe.h"

class PrintVerbTest : public ProgramTest
{
protected:
    PrintVerbTest()
    {
        WriteBook(2);
        EXPECT_EQ(Run({"build", "@book"}).m_Code, 0);
        m_Book = (m_Folder / "book/.korvane/book.kvbook").string();
    }

    /// The sides of a plan, each the numbers of its pages from 1.
    std::vector<std::vector<int>> Sides(std::vector<std::string> const & options) const
    {
        std::vector<std::string> arguments{"plan", m_Book};
        arguments.insert(arguments.end(), options.begin(), options.end());
        auto const plan = RunJson(arguments);
        std::vector<std::vector<int>> sides;
        for (auto const & side : plan["sheets"]) {
            sides.emplace_back();
            for (auto const & target : side["targets"]) {
                sides.back().push_back(target["index"].get<int>() + 1);
            }
        }
        return sides;
    }

    std::string m_Book;
};

TEST_F(PrintVerbTest, EveryLayoutBecomesAWholePdf)
{
    int const pages = RunJson({"status", m_Book})["pageCount"];
    struct Row
    {
        std::vector<std::string> options;
        int sides;
        char const * media;
    };
    int const folded = (pages + 3) / 4 * 2;
    for (Row const & row : std::vector<Row>{
             {{"--layout", "single"}, pages, "[ 0 0 419.528 595.276 ]"},
             {{"--layout", "single", "--paper", "A4", "--fit", "fill"}, pages, "[ 0 0 595.276 841.89 ]"},
             {{"--layout", "nup", "--rows", "2", "--columns", "1", "--paper", "A4", "--pages", "1-4"}, 2, "[ 0 0 595.276 841.89 ]"},
             {{"--layout", "tiled", "--paper", "A5", "--scale", "200%", "--pages", "1"}, 4, "[ 0 0 419.528 595.276 ]"},
             {{"--layout", "booklet", "--paper", "A4"}, folded, "[ 0 0 841.89 595.276 ]"},
             {{"--layout", "book", "--vertical", "--paper", "A3"}, folded, "[ 0 0 841.89 1190.551 ]"},
         }) {
        std::vector<std::string> arguments{"print", m_Book, "-o", "@out.pdf", "--no-update"};
        arguments.insert(arguments.end(), row.options.begin(), row.options.end());
        int code = -1;
        auto const result = RunJson(arguments, &code);
        EXPECT_EQ(code, 0) << result.dump(1);
        EXPECT_TRUE(IsWholePdf(m_Folder / "out.pdf"));
        // A side of two blanks is not printed.
        EXPECT_LE(row.sides - CountPages(m_Folder / "out.pdf"), row.options[1] == "book" || row.options[1] == "booklet" ? 1 : 0);
        EXPECT_EQ(result["sheets"], CountPages(m_Folder / "out.pdf"));
        EXPECT_EQ(PdfProbe(String((m_Folder / "out.pdf").string())).Value("1/MediaBox"), row.media) << row.options[1];
    }
}

TEST_F(PrintVerbTest, FontsAreInTheFileOnce)
{
    ASSERT_EQ(Run({"export", m_Book, "-o", "@plain.pdf", "--no-update"}).m_Code, 0);
    ASSERT_EQ(Run({"print", m_Book, "-o", "@n.pdf", "--no-update", "--layout", "nup", "--repeat", "4"}).m_Code, 0);
    auto const lines = [&](char const * name) {
        std::string const fonts = PdfProbe(String((m_Folder / name).string())).Fonts();
        return std::count(fonts.begin(), fonts.end(), '\n');
    };
    EXPECT_EQ(lines("n.pdf"), lines("plain.pdf"));
    EXPECT_LT(std::filesystem::file_size(m_Folder / "n.pdf"), 2 * std::filesystem::file_size(m_Folder / "plain.pdf"))
        << "pages that are shown four times are there once";
}

TEST_F(PrintVerbTest, ThePlanTellsOutputPagesOrSheets)
{
    auto const plan = RunJson({"plan", m_Book});
    int const pages = RunJson({"status", m_Book})["pageCount"];
    ASSERT_EQ(plan["outputPages"].size(), static_cast<std::size_t>(pages)) << plan.dump(1);
    EXPECT_EQ(plan["outputPages"][0]["form"], "spread");
    EXPECT_EQ(plan["outputPages"][0]["pages"][0]["chapter"], 0);
    auto const spreads = RunJson({"plan", m_Book, "--spreads"});
    EXPECT_LT(spreads["outputPages"].size(), static_cast<std::size_t>(pages));
    EXPECT_NE(Run({"plan", m_Book, "--spreads"}).m_Out.find("Chapter 1"), std::string::npos);

    EXPECT_EQ(Sides({"--layout", "nup", "--rows", "1", "--pages", "3,1-2"}), (std::vector<std::vector<int>>{{3, 1}, {2}}));
    EXPECT_EQ(Sides({"--layout", "booklet", "--pages", "2"}).size(), 1u);
    std::vector<std::vector<int>> const second = Sides({"--layout", "single", "--chapters", "Chapter 2"});
    EXPECT_EQ(second, Sides({"--layout", "single", "--chapters", "3"}));
    EXPECT_EQ(second.size() + Sides({"--layout", "single", "--chapters", "1-2"}).size(), static_cast<std::size_t>(pages));
    EXPECT_NE(Run({"plan", m_Book, "--layout", "booklet", "--paper", "A4"}).m_Out.find("841.89 x 595.276"), std::string::npos);
}

TEST_F(PrintVerbTest, MarginsAndGapsHaveTheirSizeOnPaperWhateverTheScale)
{
    auto const plan = RunJson({"plan", m_Book, "--layout", "nup", "--paper", "A4", "--margins", "20pt", "--gaps", "10pt",
                               "--pages", "1-4"});
    auto const & side = plan["sheets"][0];
    EXPECT_LT(side["scale"].get<double>(), 1);
    EXPECT_NEAR(side["targets"][0]["onPaper"][0].get<double>(), 20, 1e-6);
    EXPECT_NEAR(side["targets"][0]["onPaper"][1].get<double>(), 20, 1e-6);
    EXPECT_NEAR(side["targets"][1]["onPaper"][0].get<double>() - side["targets"][0]["onPaper"][2].get<double>(), 10, 1e-6);
    double const right = side["paper"][0].get<double>() - side["targets"][1]["onPaper"][2].get<double>();
    double const bottom = side["paper"][1].get<double>() - side["targets"][2]["onPaper"][3].get<double>();
    EXPECT_NEAR(std::min(right, bottom), 20, 1e-6) << "as large as what the margins leave";
}

TEST_F(PrintVerbTest, AProofIsDrawnWithoutAPdf)
{
    auto const outcome = Run({"print", m_Book, "--preview", "@proof.png", "--layout", "booklet", "--marks"});
    EXPECT_EQ(outcome.m_Code, 0) << outcome.m_Err;
    EXPECT_TRUE(Read("proof.png").starts_with("\x89PNG"));
    EXPECT_FALSE(Exists("proof.pdf"));
}

struct WrongUse
{
    std::vector<std::string> options;
    int code;
    /// Has to stand in the message.
    char const * message;
};

TEST_F(PrintVerbTest, InterruptingLeavesTheOldFilesOrWholeNewOnes)
{
    for (int const patience : {1, 2, 3, 4, 6, 8, 12, 16, 24}) {
        SCOPED_TRACE(patience);
        Write("out.pdf", "old");
        Write("out.png", "old");
        auto const outcome = [&] {
            ImpatientUser const user(patience);
            return Run({"print", m_Book, "-o", "@out.pdf", "--preview", "@out.png", "--layout", "booklet"});
        }();
        bool const isOldPdf = Read("out.pdf") == "old";
        bool const isOldPicture = Read("out.png") == "old";
        EXPECT_TRUE(isOldPdf || IsWholePdf(m_Folder / "out.pdf"));
        EXPECT_TRUE(isOldPicture || (Read("out.png").starts_with("\x89PNG") && Read("out.png").ends_with("\xAE\x42\x60\x82")));
        if (outcome.m_Code != 0) {
            EXPECT_EQ(outcome.m_Code, 1);
            EXPECT_NE(outcome.m_Err.find("nterrupted"), std::string::npos) << outcome.m_Err;
            EXPECT_TRUE(isOldPicture) << "the picture comes last";
        } else {
            EXPECT_FALSE(isOldPdf || isOldPicture);
        }
        for (auto const & entry : std::filesystem::recursive_directory_iterator(m_Folder)) {
            EXPECT_NE(entry.path().extension(), ".kvtmp") << entry.path();
        }
        EXPECT_FALSE(Exists("book/.korvane/book.kvbook.lock"));
    }
    EXPECT_EQ(Run({"print", m_Book, "-o", "@out.pdf"}).m_Code, 0);
    EXPECT_TRUE(IsWholePdf(m_Folder / "out.pdf"));
}

TEST_F(PrintVerbTest, InterruptingAnExportLeavesTheOldFileOrAWholeNewOne)
{
    for (int const patience : {1, 2, 3, 4, 6, 8, 12, 16, 24}) {
        SCOPED_TRACE(patience);
        Write("out.pdf", "old");
        auto const outcome = [&] {
            ImpatientUser const user(patience);
            return Run({"export", m_Book, "-o", "@out.pdf"});
        }();
        bool const isOld = Read("out.pdf") == "old";
        EXPECT_TRUE(isOld || IsWholePdf(m_Folder / "out.pdf"));
        EXPECT_EQ(outcome.m_Code, isOld ? 1 : outcome.m_Code);
        EXPECT_TRUE(outcome.m_Code == 0 || outcome.m_Err.find("nterrupted") != std::string::npos) << outcome.m_Err;
    }
}

TEST_F(PrintVerbTest, WrongWishesGetTheirSentenceAndWriteNothing)
{
    for (WrongUse const & row : std::vector<WrongUse>{
             {{"--layout", "origami"}, 2, "single, tiled, nup, book, booklet"},
             {{"--paper", "A99"}, 2, "A0 to A8"},
             {{"--paper", "0x0"}, 2, "is not a paper"},
             {{"--paper", "nanxinf"}, 2, "is not a paper"},
             {{"--pages", "five"}, 2, "1-8,3"},
             {{"--pages", "0"}, 2, "1-8,3"},
             {{"--pages", "2,x"}, 2, "1-8,3"},
             {{"--pages", "9999999999-"}, 1, "chooses none of them"},
             {{"--scale", "0"}, 2, "between 1% and 10000%"},
             {{"--fit", "stretch"}, 2, "actual, shrink, fill"},
             {{"--fit", "fill"}, 2, "--paper A4"},
             {{"--fit", "fill", "--paper", "A4", "--scale", "2"}, 2, "--fit actual"},
             {{"--rows", "2"}, 2, "nup"},
             {{"--layout", "nup", "--rows", "0"}, 2, "--rows"},
             {{"--layout", "nup", "--vertical"}, 2, "booklet"},
             {{"--layout", "nup", "--paper", "A4", "--margins", "200mm"}, 1, "leave no room"},
             {{"--layout", "tiled"}, 2, "--paper"},
             {{"--layout", "tiled", "--paper", "20x20pt", "--overlap", "20pt"}, 1, "Not one page"},
             {{"--layout", "tiled", "--paper", "1x1pt"}, 1, "fewer pages"},
             {{"--chapters", "Chapter 9"}, 1, "Chapter 9"},
         }) {
        std::vector<std::string> arguments{"print", m_Book, "-o", "@out.pdf", "--no-update"};
        arguments.insert(arguments.end(), row.options.begin(), row.options.end());
        auto const outcome = Run(arguments);
        std::string const shown = testing::PrintToString(row.options) + outcome.m_Out + outcome.m_Err;
        EXPECT_EQ(outcome.m_Code, row.code) << shown;
        EXPECT_NE((outcome.m_Out + outcome.m_Err).find(row.message), std::string::npos) << shown;
        EXPECT_FALSE(Exists("out.pdf")) << shown;
    }
    EXPECT_EQ(Run({"print", m_Book}).m_Code, 2) << "nothing to make";
    EXPECT_EQ(Run({"plan", m_Book, "--spreads", "--layout", "single"}).m_Code, 2);
    EXPECT_EQ(Run({"print", "@nowhere.kvbook", "-o", "@out.pdf"}).m_Code, 1);
    EXPECT_EQ(Run({"plan", "@nowhere.kvbook"}).m_Code, 1);
    EXPECT_EQ(Run({"print", m_Book, "-o", "@none/out.pdf"}).m_Code, 1);
}

TEST(PaperSizeTest, PapersAndLengthsAreReadWithTheirUnits)
{
    using namespace App;
    struct Row
    {
        char const * text;
        std::optional<Kernel::Size> expected;
    };
    double const mm = 72 / 25.4;
    for (Row const & row : {Row{"a4", Kernel::Size{210 * mm, 297 * mm}}, Row{"LETTER", Kernel::Size{612, 792}},
                            Row{"100x200", Kernel::Size{100, 200}}, Row{"2x3in", Kernel::Size{144, 216}},
                            Row{"10mm x 2in", Kernel::Size{10 * mm, 144}}, Row{"1.5x2.5cm", Kernel::Size{15 * mm, 25 * mm}},
                            Row{"100", {}}, Row{"100x", {}}, Row{"x100", {}}, Row{"1e9x1e9", {}}, Row{"-1x5", {}},
                            Row{"5x5furlong", {}}, Row{"999999999x5mm", {}}, Row{"", {}}, Row{"0.5x5pt", {}}}) {
        EXPECT_EQ(ReadPaper(row.text), row.expected) << row.text;
    }
    EXPECT_EQ(ReadLengths("3mm"), (Kernel::Size{3 * mm, 3 * mm}));
    EXPECT_EQ(ReadScale("70%"), 0.7);
    EXPECT_EQ(ReadScale("7"), 7.0);
    EXPECT_FALSE(ReadScale("7x").has_value());
}
