#include "framework/document/DocumentNode.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/PageShaper.h"
#include "support/DocumentBuilder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>

namespace
{

/// A spread as a string: each page L, R or S, in lower case if it is blank.
std::string Describe(std::vector<std::vector<SpreadPage>> const & spreads)
{
    std::string text;
    for (auto const & spread : spreads) {
        text += text.empty() ? "" : " ";
        for (SpreadPage const & page : spread) {
            char const letter = PageSide::Left == page.m_Side ? 'L' : PageSide::Right == page.m_Side ? 'R' : 'S';
            text += page.m_Blank ? static_cast<char>(letter - 'A' + 'a') : letter;
        }
    }
    return text;
}

}

TEST(DocumentSectionTest, NumbersAreFormattedByTheirSection)
{
    struct
    {
        PageNumberFormat m_Format;
        char const * m_Prefix;
        unsigned int m_Number;
        char const * m_Text;
    } const rows[] = {
        {PageNumberFormat::Decimal, "", 12, "12"},
        {PageNumberFormat::Decimal, "A-", 7, "A-7"},
        {PageNumberFormat::RomanLower, "", 1994, "mcmxciv"},
        {PageNumberFormat::RomanUpper, "", 48, "XLVIII"},
        {PageNumberFormat::RomanLower, "", 0, "0"},       // there is no Roman zero
        {PageNumberFormat::RomanLower, "", 4000, "4000"}, // nor four thousand in plain letters
        {PageNumberFormat::None, "A-", 3, ""},            // a title page shows nothing, prefix or not
    };
    for (auto const & row : rows) {
        DocumentSection::Values values;
        values.m_Format = row.m_Format;
        values.m_Prefix = row.m_Prefix;
        EXPECT_EQ(DocumentSection(values).FormatNumber(row.m_Number), row.m_Text);
    }
}

TEST(DocumentSectionTest, SectionsAreOrderedNumberedOnAndCutAtTheLastPage)
{
    Kernel::Counted<DocumentController> const document = DocumentBuilder().Paragraphs(30).Build();
    DocumentNode & node = *document->GetDocument();
    ASSERT_LT(4, node.GetPageCount());
    DocumentSection::Values third{4, 100, true, true, PageNumberFormat::Decimal, "X"};
    DocumentSection::Values second{2, 77, false, false, PageNumberFormat::Decimal, ""};
    DocumentSection::Values first{1, 9, false, true, PageNumberFormat::RomanLower, ""};
    DocumentSection::Values beyond{5000, 1, true, true, PageNumberFormat::Decimal, ""};
    node.SetSections({third, first, beyond, second});

    ASSERT_EQ(node.GetSections().size(), 3U);
    // The first section covers the document's first page, whatever was said, and sets its own number.
    EXPECT_EQ(node.GetSection(0)->GetStartPageIndex(), 0U);
    EXPECT_TRUE(node.GetSection(0)->RestartPageNumbering());
    EXPECT_EQ(node.GetSection(1)->GetStartNumberingAt(), 11U);
    EXPECT_EQ(node.GetFormattedPageNumber(0), "ix");
    EXPECT_EQ(node.GetFormattedPageNumber(3), "12");
    EXPECT_EQ(node.GetFormattedPageNumber(4), "X100");
    EXPECT_EQ(node.GetSectionFromPageNumber(2), node.GetSection(1));
    EXPECT_EQ(node.GetSection(3), nullptr);
    EXPECT_EQ(node.GetSection(-1), nullptr);
}

TEST(DocumentSectionTest, OnlyAnUntouchedSectionHasDefaultValues)
{
    DocumentNode const node(Kernel::MakeCounted<DocumentPictures>(Kernel::MakeCounted<DocumentStore>()));
    EXPECT_TRUE(node.GetSectionFromPageNumber(0)->HasDefaultValues());
    for (auto const change : std::initializer_list<void (*)(DocumentSection::Values &)>{
             [](DocumentSection::Values & values) { values.m_StartNumberingAt = 37; },
             [](DocumentSection::Values & values) { values.m_IncludeOnExport = false; },
             [](DocumentSection::Values & values) { values.m_Format = PageNumberFormat::None; },
             [](DocumentSection::Values & values) { values.m_Prefix = "A"; }}) {
        DocumentSection::Values values;
        values.m_RestartPageNumbering = true;
        EXPECT_TRUE(DocumentSection(values).HasDefaultValues());
        change(values);
        EXPECT_FALSE(DocumentSection(values).HasDefaultValues());
    }
}

TEST(PageShaperTest, PagesLieByTheirNumbers)
{
    struct
    {
        std::vector<unsigned int> m_Numbers;
        ChapterStart m_Start;
        bool m_Facing;
        char const * m_Shape;
    } const rows[] = {
        {{1}, ChapterStart::NextPage, true, "R"},
        {{1, 2, 3}, ChapterStart::NextPage, true, "R LR"},
        {{2, 3, 4}, ChapterStart::NextPage, true, "LR L"},
        {{1, 2, 3}, ChapterStart::RightPage, true, "R LR l"}, // ends on a left-hand page, so that the next begins right
        {{1, 2}, ChapterStart::RightPage, true, "R L"},
        {{4}, ChapterStart::RightPage, true, "L"},
        {{1, 2, 8, 9}, ChapterStart::NextPage, true, "R L LR"}, // a section that breaks the row breaks the spread
        {{1, 3, 5}, ChapterStart::NextPage, true, "R R R"},
        {{1, 2, 3}, ChapterStart::RightPage, false, "S S S"}, // single sheets have no sides
    };
    for (auto const & row : rows) {
        PageSetup setup;
        setup.m_FacingPages = row.m_Facing;
        setup.m_ChapterStart = row.m_Start;
        EXPECT_EQ(Describe(PageShaper::Shape(setup, row.m_Numbers)), row.m_Shape);
    }
}

TEST(PageShaperTest, TheRightPageLiesBesideTheLeftOneOrBelowIt)
{
    PageSetup setup;
    setup.m_PageSize = {100, 200};
    auto spreads = PageShaper::Shape(setup, {2, 3});
    EXPECT_EQ(spreads[0][1].m_Rect, (Kernel::Rect{100, 0, 200, 200}));
    setup.m_VerticalStack = true;
    spreads = PageShaper::Shape(setup, {2, 3});
    EXPECT_EQ(spreads[0][1].m_Rect, (Kernel::Rect{0, 200, 100, 400}));
    // A lone right-hand page stands at the origin, as merged output expects it.
    EXPECT_EQ(PageShaper::Shape(setup, {1})[0][0].m_Rect, (Kernel::Rect{0, 0, 100, 200}));
}
