// Books that go out spread by spread: what shares an output page, where it stands on it, and where links lead then.

#include "commands/SetStrayHandlingCommand.h"
#include "core/BookCollection.h"
#include "framework/render/FileExportOptions.h"
#include "framework/story/HyperlinkData.h"
#include "output/ExportBookCommand.h"
#include "support/BookBuilder.h"
#include "support/DocumentBuilder.h"
#include "support/PdfProbe.h"

#include <gtest/gtest.h>

#include <optional>

namespace Book
{
namespace
{

using Lines = std::vector<std::string>;

constexpr double Width = 400;
constexpr double Height = 500;

/// A chapter with the word "NAMEn" on its page n, which is a bookmark.
struct Sketch
{
    char const * name;
    int pages;
    /// Leading pages that stay out of the output.
    int hidden = 0;
    /// Odd numbers stand on right-hand pages.
    unsigned int firstNumber = 1;
    bool vertical = false;
    /// A link on each page.
    Kernel::Counted<Story::HyperlinkData const> link = nullptr;
    /// Under all of each page, its bleed included.
    std::optional<Raster::Colour> fill = std::nullopt;
};

class ExportSpreadsTest : public testing::Test
{
protected:
    void SetUp() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    void TearDown() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    String Write(Sketch const & sketch)
    {
        DocumentBuilder builder;
        DocumentSettings & settings = builder.Settings();
        settings.m_PageSetup.m_PageSize = {Width, Height};
        settings.m_PageSetup.m_VerticalStack = sketch.vertical;
        settings.m_PageSetup.m_Bleed = {9, 9, 9, 9};
        for (MasterSettings & master : settings.m_Masters) {
            for (MasterPageSettings * const page : {&master.m_Left, &master.m_Right}) {
                page->m_TextRect = {40, 40, Width - 40, Height - 40};
                page->m_RunningTexts.clear();
                if (sketch.fill) {
                    ShapeSettings shape;
                    shape.m_Rect = {-9, -9, Width + 9, Height + 9};
                    shape.m_Fill = sketch.fill;
                    page->m_Shapes.push_back(shape);
                }
            }
        }
        DocumentSection::Values section;
        section.m_StartNumberingAt = sketch.firstNumber;
        section.m_IncludeOnExport = sketch.hidden == 0;
        settings.m_Sections = {section};
        if (sketch.hidden != 0) {
            section.m_StartPageIndex = static_cast<unsigned int>(sketch.hidden);
            section.m_RestartPageNumbering = false;
            section.m_IncludeOnExport = true;
            settings.m_Sections.push_back(section);
        }
        for (int page = 1; page <= sketch.pages; ++page) {
            if (page > 1) {
                builder.PageBreak();
            }
            std::string const word = sketch.name + std::to_string(page);
            builder.Heading(word, page == 1 ? 1 : 2, "uid-" + word);
            if (sketch.link) {
                builder.Link("there", sketch.link);
            }
        }
        String const path = m_Builder.GetFolder() / (std::string(sketch.name) + ".kvdoc");
        builder.BuildFile(path);
        return path;
    }

    /// The book of these chapters, exported spread by spread.
    String const & Export(std::vector<Sketch> const & sketches, bool pad, bool merge)
    {
        return Export(sketches, pad, merge, Kernel::MakeCounted<Renderer::FileExportOptionsPDF>());
    }
    String const & Export(std::vector<Sketch> const & sketches, bool pad, bool merge,
                          Kernel::Counted<Renderer::FileExportOptions const> options)
    {
        std::vector<String> paths;
        for (Sketch const & sketch : sketches) {
            paths.push_back(Write(sketch));
        }
        auto const book = m_Builder.NewBook(paths);
        BookBuilder::Run(book, Kernel::MakeCounted<SetStrayHandlingCommand>(pad, merge));
        BookBuilder::Rest();
        std::vector<Kernel::Counted<BookChapter const>> chapters;
        book->GetChapters(chapters);
        m_Target = m_Builder.GetFolder() / "spreads.pdf";
        BookBuilder::Run(book,
                         Kernel::MakeCounted<ExportBookCommand>(
                             chapters, m_Target,
                             Kernel::Consolidated<Renderer::FileExportOptions>(std::move(options)),
                             Kernel::Size{}, false, false, false, false, nullptr));
        m_Builder.CloseBook(book);
        // A pass may still hold a file that the next book is to have at the same place.
        BookBuilder::Rest();
        return m_Target;
    }

    /// The words in a part of a page, in points from its top left corner.
    std::string WordsIn(int page, Kernel::Rect const & part) const
    {
        std::ostringstream command;
        command << "pdftotext -f " << page << " -l " << page << " -x " << part.left << " -y " << part.top << " -W "
                << part.Width() << " -H " << part.Height() << " '" << m_Target.ToStd() << "' - | tr -s '[:space:]' ' '";
        std::istringstream words(RunCommand(command.str()));
        std::string text;
        for (std::string word; words >> word;) {
            if (word != "\f" && word != "See" && word != "there" && word != "there.") {
                text += (text.empty() ? "" : " ") + word;
            }
        }
        return text;
    }

    /// One line an output page: what stands in its first and its second half, "a1|b1"; a lone page has one half.
    Lines Halves(PdfProbe const & pdf, bool vertical) const
    {
        Lines lines;
        for (int page = 1; page <= pdf.PageCount(); ++page) {
            Kernel::Rect const first{0, 0, Width, Height};
            Kernel::Rect const second = vertical ? first.Moved(0, Height) : first.Moved(Width, 0);
            std::ostringstream alone;
            alone << "[ 0 0 " << Width << ' ' << Height << " ]";
            bool const isAlone = pdf.Value(std::to_string(page) + "/MediaBox") == alone.str();
            lines.push_back(WordsIn(page, first) + (isAlone ? "" : "|" + WordsIn(page, second)));
        }
        return lines;
    }

    BookBuilder m_Builder;
    String m_Target;
};

TEST_F(ExportSpreadsTest, EachPageStandsOnItsOwnSideOfTheOutputPage)
{
    struct Row
    {
        char const * why;
        std::vector<Sketch> chapters;
        bool pad;
        bool merge;
        Lines pages;
    };
    for (Row const & row : {
             Row{"alone", {{"a", 2}, {"b", 1}}, false, false, {"a1", "a2", "b1"}},
             Row{"two chapters share a spread", {{"a", 2}, {"b", 3}}, false, true, {"a1", "a2|b1", "b2|b3"}},
             Row{"the second begins on the right of a spread whose left-hand page stays out",
                 {{"a", 2}, {"b", 2, 1, 2}}, false, true, {"a1", "a2|b2"}},
             Row{"blanks behind and in front", {{"a", 2}, {"b", 3}}, true, false, {"a1", "a2|", "|b1", "b2|b3"}},
             Row{"a blank in the place of a page that stays out", {{"a", 3}, {"b", 2, 1, 2}}, true, false,
                 {"a1", "a2|a3", "|b2"}},
             Row{"a lone right-hand page of a spread stands alone", {{"a", 3}, {"b", 2, 1, 2}}, false, false,
                 {"a1", "a2|a3", "b2"}},
         }) {
        SCOPED_TRACE(row.why);
        PdfProbe const pdf(Export(row.chapters, row.pad, row.merge));
        EXPECT_EQ(pdf.Check(), "");
        EXPECT_EQ(Halves(pdf, false), row.pages);
    }
}

TEST_F(ExportSpreadsTest, StackedPagesStandOneBelowTheOther)
{
    PdfProbe const pdf(Export({{"a", 2, 0, 1, true}, {"b", 3, 0, 1, true}}, true, false));
    EXPECT_EQ(Halves(pdf, true), (Lines{"a1", "a2|", "|b1", "b2|b3"}));

    // Shared pages go by the chapter before the one that they begin in: with none before it, side by side.
    PdfProbe const shared(Export({{"a", 2, 0, 1, true}, {"b", 4, 0, 1, true}, {"c", 1, 0, 1, true}}, false, true));
    ASSERT_EQ(shared.PageCount(), 4);
    EXPECT_EQ(shared.Value("2/MediaBox"), "[ 0 0 800 500 ]");
    EXPECT_EQ(Halves(shared, false)[1], "a2|b1");
    EXPECT_EQ(shared.Value("4/MediaBox"), "[ 0 0 400 1000 ]");
    EXPECT_EQ(Halves(shared, true)[3], "b4|c1");
}

TEST_F(ExportSpreadsTest, TheBleedOfAPageEndsWhereAnotherBegins)
{
    unsigned const red = 0xFF0000;
    unsigned const blue = 0x0000FF;
    unsigned const white = 0xFFFFFF;
    struct Row
    {
        bool pad;
        bool merge;
        bool vertical;
        int page;
        unsigned first;
        unsigned second;
    };
    for (Row const & row : {Row{false, true, false, 2, red, blue}, Row{true, false, false, 2, red, white},
                            Row{true, false, false, 3, white, blue}, Row{true, false, true, 2, red, white},
                            Row{true, false, true, 3, white, blue}}) {
        SCOPED_TRACE(testing::Message() << row.pad << row.merge << row.vertical << ", page " << row.page);
        auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
        options->SetIncludeBleed(true);
        PdfProbe const pdf(Export({{"a", 2, 0, 1, row.vertical, nullptr, Raster::Colour::Rgb(1, 0, 0)},
                                   {"b", 1, 0, 1, row.vertical, nullptr, Raster::Colour::Rgb(0, 0, 1)}},
                                  row.pad, row.merge, options));
        PdfProbe::Image const image = pdf.Draw(row.page);
        auto const at = [&](int along) { return row.vertical ? image.At(200, 9 + along) : image.At(9 + along, 250); };
        int const fold = static_cast<int>(row.vertical ? Height : Width);
        EXPECT_EQ(at(-5), row.first) << "the bleed outside";
        EXPECT_EQ(at(fold - 5), row.first);
        EXPECT_EQ(at(fold + 5), row.second);
        EXPECT_EQ(at(2 * fold + 5), row.second) << "the bleed outside";
    }
}

TEST_F(ExportSpreadsTest, MarksStandOutsideOfABleedThatIsWiderThanTheirDistance)
{
    Renderer::FileExportOptionsPDF::Settings settings;
    settings.m_PrintersMarks.m_CropMarks = true;
    settings.m_PrintersMarks.m_Offset = 4;
    settings.m_PrintersMarks.m_Length = 14;
    for (bool const includeBleed : {true, false}) {
        auto const options = Kernel::MakeCounted<Renderer::FileExportOptionsPDF>();
        options->SetSettings(settings);
        options->SetIncludeBleed(includeBleed);
        PdfProbe const pdf(Export({{"a", 2}, {"b", 1}}, false, true, options));
        // The shared page has its bleed of 9 and its marks all round, and no bleed between its halves.
        EXPECT_EQ(pdf.Value("2/MediaBox"), includeBleed ? "[ 0 0 846 546 ]" : "[ 0 0 836 536 ]");
        EXPECT_EQ(pdf.Value("2/BleedBox"), includeBleed ? "[ 14 14 832 532 ]" : "[ 18 18 818 518 ]");
        EXPECT_EQ(pdf.Value("2/TrimBox"), includeBleed ? "[ 23 23 823 523 ]" : "[ 18 18 818 518 ]");
        PdfProbe::Image const image = pdf.Draw(2);
        auto const isDark = [&](int x, int y) { return (image.At(x, y) & 0xFF) < 0xC0; };
        int const trim = includeBleed ? 23 : 18;
        EXPECT_TRUE(isDark(7, trim) || isDark(7, trim - 1)) << "the top left mark";
        EXPECT_FALSE(isDark(trim - 3, trim) || isDark(trim - 3, trim - 1)) << "ends clear of the page";
    }
}

TEST_F(ExportSpreadsTest, LinksAndBookmarksLeadToTheirHalfOfASharedPage)
{
    Story::HyperlinkData::Fields fields;
    fields.m_Type = Story::HyperlinkData::Type::Page;
    fields.m_PageIndex = 2;
    auto const toThirdPage = Kernel::MakeCounted<Story::HyperlinkData const>(fields);
    PdfProbe const pdf(Export({{"a", 2, 0, 1, false, Story::HyperlinkData::ToAnchor("uid-b1", "#b1")},
                                 {"b", 3, 0, 1, false, toThirdPage}},
                                false, true));
    ASSERT_EQ(Halves(pdf, false), (Lines{"a1", "a2|b1", "b2|b3"}));
    auto const targets = [&](int page) {
        Lines found;
        std::istringstream lines(pdf.Links(page));
        for (std::string line; std::getline(lines, line);) {
            found.push_back(line.substr(line.find("-> ")));
        }
        return found;
    };
    EXPECT_EQ(targets(1), (Lines{"-> page 2 (440, 458)"})) << "to the right-hand half, where b begins";
    ASSERT_EQ(targets(2).size(), 2u);
    EXPECT_EQ(targets(2)[0], "-> page 2 (440, 458)");
    EXPECT_EQ(targets(2)[1], "-> page 3 (0, 500)") << "the third page of its own chapter";
    EXPECT_EQ(pdf.Outline(), "a -> page 1 (0, 500)\n"
                             "  a1 -> page 1 (40, 458)\n"
                             "    a2 -> page 2 (40, 460)\n"
                             "b -> page 2 (400, 500)\n"
                             "  b1 -> page 2 (440, 458)\n"
                             "    b2 -> page 3 (40, 460)\n"
                             "    b3 -> page 3 (440, 460)\n");
}

TEST_F(ExportSpreadsTest, EachKindOfLinkLeadsToItsOutputPageOrIsLeftOut)
{
    using Type = Story::HyperlinkData::Type;
    struct Row
    {
        char const * why;
        Type type;
        int page;
        int section;
        int chapter;
        char const * path;
        char const * target;
    };
    for (Row const & row : {
             Row{"a page of its own document", Type::Page, 1, 0, 0, "", "page 2 (0, 500)"},
             Row{"a page that there is not", Type::Page, 2, 0, 0, "", ""},
             Row{"a section", Type::Section, 0, 0, 0, "", "page 1 (0, 500)"},
             Row{"a section that there is not", Type::Section, 0, 1, 0, "", ""},
             Row{"a page of another chapter", Type::ChapterPage, 2, 0, 1, "", "page 3 (0, 500)"},
             Row{"behind that chapter's end", Type::ChapterPage, 3, 0, 1, "", ""},
             Row{"before its begin", Type::ChapterPage, -1, 0, 1, "", ""},
             Row{"a chapter that there is not", Type::ChapterPage, 0, 0, 2, "", ""},
             Row{"an anchor that there is not", Type::Anchor, 0, 0, 0, "", ""},
             Row{"the endnotes of a book without any", Type::Anchor, 0, 0, 0, "endnotes", ""},
             Row{"mail", Type::Mail, 0, 0, 0, "who@example.org", "mailto:who@example.org"},
             Row{"an address without a protocol", Type::Web, 0, 0, 0, "example.org/a\\", "https://example.org/a"},
             Row{"another PDF", Type::File, 0, 0, 0, "more/other.pdf", "file more/other.pdf"},
             Row{"one in capitals is any file", Type::File, 0, 0, 0, "OTHER.PDF", "OTHER.PDF"},
         }) {
        SCOPED_TRACE(row.why);
        Story::HyperlinkData::Fields fields;
        fields.m_Type = row.type;
        fields.m_PageIndex = row.page;
        fields.m_SectionIndex = row.section;
        fields.m_ChapterIndex = row.chapter;
        fields.m_Path = row.path;
        fields.m_AnchorUid = "nowhere";
        fields.m_IsEndnotes = std::string_view(row.path) == "endnotes";
        PdfProbe const pdf(Export({{"a", 2, 0, 1, false, Kernel::MakeCounted<Story::HyperlinkData const>(fields)}, {"b", 3}},
                                  false, true));
        ASSERT_EQ(pdf.PageCount(), 3);
        std::string const links = pdf.Links(1);
        std::size_t const at = links.find("-> ");
        EXPECT_EQ(at == std::string::npos ? "" : links.substr(at + 3), row.target + std::string(*row.target ? "\n" : ""));
    }
}

TEST_F(ExportSpreadsTest, BookmarksBelowOneThatStaysOutStandBesideTheChapters)
{
    PdfProbe const pdf(Export({{"a", 3, 1}}, false, false));
    EXPECT_EQ(pdf.Outline(), "a -> page 1 (0, 500)\n"
                             "a2 -> page 1 (40, 460)\n"
                             "a3 -> page 1 (440, 460)\n");
}

TEST_F(ExportSpreadsTest, PagesThatStayOutLeaveNoLinksBehind)
{
    auto const away = Story::HyperlinkData::ToWeb("example.org");
    PdfProbe const pdf(Export({{"a", 2}, {"b", 2, 1, 2, false, away}}, false, true));
    ASSERT_EQ(Halves(pdf, false), (Lines{"a1", "a2|b2"}));
    std::string const links = pdf.Links(2);
    EXPECT_EQ(std::count(links.begin(), links.end(), '\n'), 1) << links;
    EXPECT_GT(std::stod(links), Width) << "on b's own half: " << links;
}

}
}
