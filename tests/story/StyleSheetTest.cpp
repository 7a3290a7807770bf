#include "framework/story/ByteStream.h"
#include "framework/story/StyleSheet.h"

#include <gtest/gtest.h>

namespace
{

using namespace Story;

void Fill(StyleSheet & sheet)
{
    AttSet glyphs;
    AttSet paragraphs;
    glyphs.SetDouble(GlyphAtt::Size, 10);
    glyphs.SetString(GlyphAtt::Families, "First Face, \"Second Face\",,");
    paragraphs.SetDouble(ParagraphAtt::Leading, 13);
    sheet.SetDefaults(glyphs, paragraphs);

    TextStyle body{"Body", "", {}, {}};
    body.m_ParagraphAtts.SetInt(ParagraphAtt::Alignment, ParagraphAtt::Justify);
    TextStyle quote{"Quote", "Body", {}, {}};
    quote.m_GlyphAtts.SetDouble(GlyphAtt::SizeFactor, 0.5);
    quote.m_ParagraphAtts.SetDouble(ParagraphAtt::LeftIndent, 20);
    TextStyle deep{"Deep quote", "Quote", {}, {}};
    deep.m_GlyphAtts.SetDouble(GlyphAtt::SizeFactor, 0.5);
    deep.m_ParagraphAtts.SetInt(ParagraphAtt::Alignment, ParagraphAtt::Left);
    for (auto const & style : {deep, body, quote}) {
        sheet.SetParagraphStyle(style);
    }
    TextStyle ring1{"Ring 1", "Ring 2", {}, {}};
    ring1.m_GlyphAtts.SetInt(GlyphAtt::Weight, 700);
    TextStyle ring2{"Ring 2", "Ring 1", {}, {}};
    ring2.m_GlyphAtts.SetInt(GlyphAtt::Italic, 1);
    sheet.SetCharacterStyle(ring1);
    sheet.SetCharacterStyle(ring2);
}

TEST(StyleSheetTest, AStyleLaysItselfOverWhatItIsBasedOn)
{
    StyleSheet sheet;
    Fill(sheet);
    auto const & deep = sheet.ResolveParagraphStyle("Deep quote");
    EXPECT_DOUBLE_EQ(deep.m_Glyph.m_Size, 2.5);
    EXPECT_DOUBLE_EQ(deep.m_Paragraph.m_LeftIndent, 20);
    EXPECT_DOUBLE_EQ(deep.m_Paragraph.m_Leading, 13);
    EXPECT_EQ(deep.m_Paragraph.m_Alignment, ParagraphAtt::Left);
    EXPECT_EQ(deep.m_Glyph.m_Families, (std::vector<String>{"First Face", "Second Face"}));
    EXPECT_DOUBLE_EQ(sheet.ResolveParagraphStyle("No such style").m_Glyph.m_Size, 10);

    TextStyle body{"Body", "", {}, {}};
    body.m_GlyphAtts.SetDouble(GlyphAtt::Size, 40);
    sheet.SetParagraphStyle(body);
    EXPECT_DOUBLE_EQ(sheet.ResolveParagraphStyle("Deep quote").m_Glyph.m_Size, 10) << "a change shows at once";
}

TEST(StyleSheetTest, AStyleBasedOnItselfResolvesAsFarAsItGoes)
{
    StyleSheet sheet;
    Fill(sheet);
    auto const & atts = sheet.ResolveCharacterStyle("Ring 1");
    ASSERT_TRUE(atts.FindInt(GlyphAtt::Weight));
    ASSERT_TRUE(atts.FindInt(GlyphAtt::Italic));
}

TEST(StyleSheetTest, WildValuesAreBroughtIntoRange)
{
    GlyphFormat glyph;
    ParagraphFormat paragraph;
    AttSet glyphs;
    glyphs.SetDouble(GlyphAtt::Size, -5);
    glyphs.SetInt(GlyphAtt::Position, 77);
    AttSet paragraphs;
    paragraphs.SetDouble(ParagraphAtt::SpaceBefore, std::numeric_limits<double>::quiet_NaN());
    paragraphs.SetDouble(ParagraphAtt::Leading, 1e300);
    paragraphs.SetInt(ParagraphAtt::Widows, -1);
    glyph.Apply(glyphs);
    paragraph.Apply(paragraphs);
    EXPECT_GT(glyph.m_Size, 0);
    EXPECT_EQ(glyph.m_Position, GlyphAtt::OnBaseline);
    EXPECT_EQ(paragraph.m_SpaceBefore, 0);
    EXPECT_LT(paragraph.m_Leading, 1e6);
    EXPECT_EQ(paragraph.m_Widows, 1);
}

TEST(StyleSheetTest, ComesBackFromBytesAndRefusesDamage)
{
    StyleSheet sheet;
    Fill(sheet);
    ByteWriter out;
    sheet.SaveBytes(out);
    StyleSheet loaded;
    ByteReader in(out.GetBytes());
    ASSERT_TRUE(loaded.LoadBytes(in));
    EXPECT_TRUE(loaded.IsEqual(sheet));
    for (std::size_t size = 0; size < out.GetBytes().size(); ++size) {
        ByteReader part(std::span(out.GetBytes()).first(size));
        StyleSheet target;
        EXPECT_FALSE(target.LoadBytes(part)) << size;
    }
}

}
