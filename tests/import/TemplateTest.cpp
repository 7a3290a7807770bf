#include "import/Template.h"

#include "Describe.h"
#include "framework/story/StyleSheet.h"

#include <gtest/gtest.h>

using namespace Import;

namespace
{

Story::ResolvedStyle const & StyleOf(Template const & t, char const * name)
{
    return t.m_Settings.m_Styles->ResolveParagraphStyle(name);
}

}

TEST(TemplateTest, ShippedTemplatesHaveNoMessagesAndEveryStyleThatTextUses)
{
    for (char const * name : {"novel", "manual", "report"}) {
        SCOPED_TRACE(name);
        MessageList messages;
        auto const path = FindTemplate(name, ".", messages);
        ASSERT_TRUE(path);
        auto const read = ReadTemplate(*path, messages);
        ASSERT_TRUE(read) << Describe(messages);
        EXPECT_EQ(Describe(messages), "");
        for (char const * style : {StyleName::Body,
                                   StyleName::First,
                                   StyleName::ChapterTitle,
                                   StyleName::PartTitle,
                                   "Heading 1",
                                   "Heading 6",
                                   StyleName::Quotation,
                                   StyleName::ListItem,
                                   StyleName::LooseListItem,
                                   StyleName::Code,
                                   StyleName::Figure,
                                   StyleName::Caption,
                                   StyleName::FileName,
                                   StyleName::Rule,
                                   StyleName::TableText,
                                   StyleName::TableHead,
                                   StyleName::MarkedBox,
                                   StyleName::BookTitle,
                                   StyleName::BookSubtitle,
                                   StyleName::BookAuthor,
                                   Story::StyleSheet::NotesHeadingStyle,
                                   Story::StyleSheet::NoteTextStyle,
                                   Story::StyleSheet::MissingPictureStyle,
                                   "Running head",
                                   "Folio"}) {
            EXPECT_TRUE(read->m_Settings.m_Styles->FindParagraphStyle(style)) << style;
        }
        // A line of text holds 60 to 75 characters at 0.42 to 0.53 of the size each, so 26 to 36 times the size.
        double const size = StyleOf(*read, StyleName::Body).m_Glyph.m_Size;
        EXPECT_GT(read->m_Measure / size, 26);
        EXPECT_LT(read->m_Measure / size, 37);
        EXPECT_GT(StyleOf(*read, "Heading 1").m_Glyph.m_Size, StyleOf(*read, "Heading 2").m_Glyph.m_Size);
    }
}

TEST(TemplateTest, FacingPagesMirrorTheirMarginsAndOutsideFollowsThePage)
{
    MessageList messages;
    auto const read = ReadTemplateText(R"(
[page]
size = ["100mm", "200mm"]
[page.margins]
top = 10
bottom = 10
inside = "10mm"
outside = "30mm"
[[master.body.running]]
text = "Page {page}"
align = "outside"
)",
                                       "t.toml", messages);
    ASSERT_TRUE(read) << Describe(messages);
    auto const & body = read->m_Settings.m_Masters.front();
    double const mm = 72 / 25.4;
    EXPECT_NEAR(body.m_Right.m_TextRect.left, 10 * mm, 1e-9);
    EXPECT_NEAR(body.m_Left.m_TextRect.left, 30 * mm, 1e-9);
    EXPECT_NEAR(read->m_Measure, 60 * mm, 1e-9);
    ASSERT_EQ(body.m_Left.m_RunningTexts.size(), 1u);
    EXPECT_EQ(body.m_Left.m_RunningTexts[0].m_Alignment, RunningTextAlignment::Left);
    EXPECT_EQ(body.m_Right.m_RunningTexts[0].m_Alignment, RunningTextAlignment::Right);
    ASSERT_EQ(body.m_Right.m_RunningTexts[0].m_Parts.size(), 2u);
    EXPECT_EQ(body.m_Right.m_RunningTexts[0].m_Parts[1].m_Field, RunningTextField::PageNumber);
    EXPECT_EQ(read->m_Settings.m_PageSetup.m_FirstMaster, String("first"));
}

TEST(TemplateTest, WrongTemplatesAreRefusedWithTheirPlace)
{
    struct Case
    {
        char const * m_Text;
        char const * m_Expected;
    };
    for (auto const & [text, expected] : {
             Case{"[page\n", "1 toml-syntax\n"},
             Case{"[page]\nsize = \"A9\"\n", "2 toml-value\n"},
             Case{"[paragraph.Body]\nsize = \"big\"\n", "2 toml-value\n"},
             Case{"[paragraph.Body]\nbased-on = \"Nobody\"\n", "2 toml-value\n"},
             Case{"[paragraph.Body]\ncolour = \"#12345\"\n", "2 toml-value\n"},
             Case{"[paragraph.Body]\nborder = [\"up\"]\n", "2 toml-value\n"},
             Case{"[page]\nsize = \"A6\"\n[page.margins]\ninside = \"60mm\"\noutside = \"60mm\"\n", "1 toml-value\n"},
             Case{"[[master.body.running]]\ntext = \"{pages}\"\n", "1 toml-value\n"},
             Case{"[page]\nfacing = 1\n", "2 toml-value\n"},
         }) {
        MessageList messages;
        EXPECT_FALSE(ReadTemplateText(text, "t.toml", messages)) << text;
        EXPECT_EQ(Describe(messages), expected) << text;
    }
    MessageList messages;
    EXPECT_TRUE(ReadTemplateText("[paragraph.Body]\nsice = 3\n", "t.toml", messages));
    EXPECT_EQ(Describe(messages), "2 toml-key\n");
}

TEST(TemplateTest, AnUnknownNameTellsTheKnownOnes)
{
    MessageList messages;
    EXPECT_FALSE(FindTemplate("nvoel", ".", messages));
    ASSERT_EQ(messages.All().size(), 1u);
    EXPECT_NE(messages.All()[0].m_Text.find("manual, novel, report"), std::string::npos) << messages.All()[0].m_Text;
}
