#include "framework/typeset/ParagraphBuilder.h"

#include "framework/typeset/FontLibrary.h"
#include "framework/typeset/ShapingContext.h"
#include "typeset/TypesetSupport.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <hb.h>

#include <cmath>

using namespace Typeset;
using testing::ElementsAre;

namespace
{

std::u16string const rabbits =
    u"All naturalists, with, as far as I know, a single exception, believe that the several domestic breeds of the "
    u"rabbit are descended from the common wild species; I shall therefore describe them more carefully than in the "
    u"previous cases.";

double RightEdge(LineArena const & arena, Line const & line)
{
    GlyphRun const & last = arena.m_Runs[line.m_FirstRun + line.m_RunCount - 1];
    return static_cast<double>(last.m_X) + last.m_Width;
}

std::vector<std::uint16_t> Glyphs(LineArena const & arena)
{
    std::vector<std::uint16_t> glyphs;
    for (PlacedGlyph const & glyph : arena.m_Glyphs) {
        glyphs.push_back(glyph.m_Glyph);
    }
    return glyphs;
}

}

TEST(ParagraphBuilderTest, KnownParagraphsBreakWhereTheyShould)
{
    SetParagraph garamond;
    garamond.m_Settings.m_FirstLineIndent = 12;
    EXPECT_THAT(garamond.Set(rabbits).Lines(), ElementsAre("All naturalists, with, as far as I know, a single exception, be-",
                            "lieve that the several domestic breeds of the rabbit are descended",
                            "from the common wild species; I shall therefore describe them",
                            "more carefully than in the previous cases."));

    SetParagraph liberation;
    liberation.m_Style.m_Families = {"Liberation Serif"};
    liberation.m_Settings.m_Width = 180;
    EXPECT_THAT(liberation.Set(rabbits).Lines(), ElementsAre("All naturalists, with, as far as I know,", "a single exception, believe that the sev-",
                            "eral domestic breeds of the rabbit are de-", "scended from the common wild species;",
                            "I shall therefore describe them more care-", "fully than in the previous cases."));

    liberation.m_Settings.m_Alignment = Alignment::Start;
    liberation.m_Settings.m_Hyphenate = false;
    EXPECT_THAT(liberation.Set(rabbits).Lines(), ElementsAre("All naturalists, with, as far as I know,", "a single exception, believe that the",
                            "several domestic breeds of the rabbit", "are descended from the common wild",
                            "species; I shall therefore describe them", "more carefully than in the previous cases."));
}

TEST(ParagraphBuilderTest, TotalFitSpacesMoreEvenlyThanFirstFit)
{
    auto const unevenness = [](BreakMode mode) {
        SetParagraph paragraph;
        paragraph.m_Settings.m_Mode = mode;
        paragraph.m_Settings.m_Hyphenate = false;
        double sum = 0;
        for (double width = 150; width < 350; width += 5) {
            paragraph.m_Settings.m_Width = width;
            paragraph.Set(rabbits + u" " + rabbits);
            for (Line const & line : paragraph.m_Arena.m_Lines) {
                sum += std::pow(std::abs(line.m_SpaceRatio), 3);
            }
        }
        return sum;
    };
    EXPECT_LT(unevenness(BreakMode::TotalFit), 0.7 * unevenness(BreakMode::Greedy));
}

TEST(ParagraphBuilderTest, JustifiedLinesFillTheirRoomAndTheLastDoesNot)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_FirstLineIndent = 12;
    paragraph.Set(rabbits);
    for (Line const & line : paragraph.m_Arena.m_Lines) {
        bool const first = (line.m_Flags & Line::FirstLine) != 0;
        EXPECT_NEAR(first ? 12 : 0, line.m_X, 1e-3);
        if (line.m_Flags & Line::LastLine) {
            EXPECT_NEAR(line.m_NaturalWidth, line.m_SetWidth, 0.01);
        } else {
            EXPECT_NEAR(250, RightEdge(paragraph.m_Arena, line), 0.01);
        }
    }
}

TEST(ParagraphBuilderTest, AlignmentsAndRoomsPlaceTheLines)
{
    struct Case
    {
        Alignment m_Alignment;
        double m_Left; ///< Share of the room's rest that lies before the line.
    };
    for (Case const & row : {Case{Alignment::Start, 0}, Case{Alignment::Centre, 0.5}, Case{Alignment::End, 1},
                             Case{Alignment::Left, 0}, Case{Alignment::Right, 1}}) {
        SetParagraph paragraph;
        paragraph.m_Settings.m_Alignment = row.m_Alignment;
        paragraph.m_Settings.m_StartIndent = 10;
        paragraph.m_Settings.m_EndIndent = 20;
        paragraph.m_Settings.m_Rooms = {{100, 150}, {50, 100}};
        paragraph.Set(rabbits);
        double const lefts[] = {110, 60, 10};
        double const widths[] = {120, 70, 220};
        for (std::size_t i = 0; i < 3; ++i) {
            Line const & line = paragraph.m_Arena.m_Lines[i];
            EXPECT_NEAR(lefts[i] + row.m_Left * (widths[i] - line.m_SetWidth), line.m_X, 0.01) << "line " << i;
            EXPECT_LE(line.m_SetWidth, widths[i] + 0.01);
        }
    }
}

TEST(ParagraphBuilderTest, LigaturesHaveOneClusterAndBreakApartAtAHyphen)
{
    SetParagraph paragraph;
    paragraph.m_Style.m_Families = {"Linux Libertine O"};
    paragraph.Set(u"office");
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 4, 5));

    // Too narrow for the word: "of-fice" parts the ligature.
    paragraph.m_Settings.m_Width = 20;
    paragraph.Set(u"of\u00ADfice");
    EXPECT_THAT(paragraph.Lines(), ElementsAre("of\u00AD-", "fice"));
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 3));
    EXPECT_THAT(paragraph.Clusters(1), ElementsAre(3, 5, 6)) << "fi stays a ligature";
    EXPECT_EQ(PlacedGlyph::Synthetic, paragraph.m_Arena.GlyphsOf(paragraph.m_Arena.m_Runs[0]).back().m_Flags);

    paragraph.m_Settings.m_Width = 250;
    paragraph.Set(u"of\u00ADfice");
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 5, 6)) << "a soft hyphen that is not used is not there";
}

TEST(ParagraphBuilderTest, RightToLeftTextRunsFromRightToLeft)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_Alignment = Alignment::Start;
    // Hebrew, a number and Latin inside: the number and the Latin word read from left to right.
    paragraph.Set(u"אב 12 cd גד");
    EXPECT_TRUE(paragraph.m_Lines.m_RightToLeft);
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(10, 9, 8, 6, 7, 5, 3, 4, 2, 1, 0));
    EXPECT_NEAR(250, RightEdge(paragraph.m_Arena, paragraph.m_Arena.m_Lines[0]), 0.01);

    paragraph.Set(u"ab אב (גד) cd");
    EXPECT_FALSE(paragraph.m_Lines.m_RightToLeft);
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 2, 9, 8, 7, 6, 5, 4, 3, 10, 11, 12));

    paragraph.m_Settings.m_Direction = Direction::RightToLeft;
    paragraph.Set(u"ab!");
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(2, 0, 1));
}

TEST(ParagraphBuilderTest, ObjectsStandInTheTextOrAreNotThere)
{
    SetParagraph paragraph;
    paragraph.Set(u"rab\uFFFCbit");
    std::vector<std::uint16_t> const withAnchor = Glyphs(paragraph.m_Arena);
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 2, 4, 5, 6));
    paragraph.Set(u"rabbit");
    EXPECT_EQ(Glyphs(paragraph.m_Arena), withAnchor);

    paragraph.m_Objects = {{1, {}, 30, 40, 5}};
    paragraph.Set(u"a\uFFFCb");
    ASSERT_EQ(3U, paragraph.m_Arena.m_Runs.size());
    GlyphRun const & box = paragraph.m_Arena.m_Runs[1];
    EXPECT_TRUE(box.m_IsBox);
    EXPECT_EQ(0U, box.m_Object);
    EXPECT_FLOAT_EQ(30, box.m_Width);
    EXPECT_FLOAT_EQ(40, paragraph.m_Arena.m_Lines[0].m_Ascent);

    // A note's number sticks to its word; its glyphs all stand for the one character.
    paragraph.m_Objects = {{4, u"12", 0, 0, 0, true}};
    paragraph.m_Settings.m_Width = 0;
    paragraph.Set(u"dash\uFFFC up");
    EXPECT_THAT(paragraph.Lines().back(), "up");
    std::vector<std::uint32_t> clusters;
    for (std::size_t i = 0; i < paragraph.m_Arena.m_Lines.size(); ++i) {
        for (std::uint32_t const cluster : paragraph.Clusters(i)) {
            clusters.push_back(cluster);
        }
    }
    EXPECT_THAT(clusters, ElementsAre(0, 1, 2, 3, 4, 4, 6, 7));
}

TEST(ParagraphBuilderTest, ForcedBreaksEndLinesAndOneAtTheEndOpensNone)
{
    SetParagraph paragraph;
    paragraph.Set(u"one\u2028two\r\n\u000Bthree\n");
    EXPECT_THAT(paragraph.Lines(), ElementsAre("one", "two\r\n", "\v", "three\n"));
    EXPECT_TRUE(paragraph.m_Arena.m_Lines[0].m_Flags & Line::ForcedBreak);
    EXPECT_FLOAT_EQ(paragraph.m_Arena.m_Lines[0].m_NaturalWidth, paragraph.m_Arena.m_Lines[0].m_SetWidth);
    EXPECT_EQ(0U, paragraph.m_Arena.m_Lines[2].m_RunCount);
    EXPECT_GT(paragraph.m_Arena.m_Lines[2].m_Ascent, 5);
}

TEST(ParagraphBuilderTest, AnEmptyParagraphIsOneLineOfItsStylesHeight)
{
    SetParagraph paragraph;
    for (char16_t const * text : {u"", u"\n", u"\uFFFC", u"\u0000"}) {
        paragraph.Set(text);
        ASSERT_EQ(1U, paragraph.m_Lines.m_LineCount);
        Line const & line = paragraph.m_Arena.m_Lines[0];
        EXPECT_EQ(0U, line.m_RunCount);
        EXPECT_FLOAT_EQ(10.5F, line.m_FontSize);
        EXPECT_NEAR(10.5, line.m_Ascent + line.m_Descent, 0.01);
    }
}

TEST(ParagraphBuilderTest, WordsWiderThanTheLineBreakBetweenClusters)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_Width = 40;
    paragraph.Set(u"a xxxxxxxxxxxxxxxxe\u0301xxxxxxx b");
    EXPECT_GT(paragraph.m_Lines.m_LineCount, 3U);
    for (Line const & line : paragraph.m_Arena.m_Lines) {
        EXPECT_LE(line.m_SetWidth, 40.01);
        EXPECT_NE(u'\u0301', paragraph.m_Text[line.m_TextStart]) << "an accent parted from its letter";
        EXPECT_FALSE(line.m_Flags & Line::Hyphenated);
    }
}

TEST(ParagraphBuilderTest, WebAddressesBreakWithoutHyphens)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_Width = 90;
    paragraph.m_Settings.m_Alignment = Alignment::Start;
    paragraph.Set(u"https://www.example.org/a-long-directory/another-page.html");
    for (Line const & line : paragraph.m_Arena.m_Lines) {
        EXPECT_FALSE(line.m_Flags & Line::Hyphenated);
        if (line.m_TextStart > 0) {
            char16_t const before = paragraph.m_Text[line.m_TextStart - 1];
            EXPECT_TRUE(before == u'/' || paragraph.m_Text[line.m_TextStart] == u'.') << line.m_TextStart;
        }
    }
}

TEST(ParagraphBuilderTest, CodeKeepsItsSpacesAndMarksWrappedLines)
{
    SetParagraph paragraph;
    paragraph.m_Style.m_Families = {"DejaVu Sans Mono"};
    paragraph.m_Style.m_Hyphenate = false;
    paragraph.m_Settings.m_Mode = BreakMode::Code;
    paragraph.m_Settings.m_Width = 110;
    paragraph.Set(u"    if (a  == b)\u2028        return something_very_long_indeed(a);");
    LineArena const & arena = paragraph.m_Arena;
    ASSERT_GE(arena.m_Lines.size(), 3U);
    double const character = arena.m_Glyphs[0].m_Advance;
    EXPECT_NEAR(16 * character, arena.m_Lines[0].m_SetWidth, 0.01);
    EXPECT_TRUE(arena.m_Glyphs[3].m_Flags & PlacedGlyph::Space);
    Line const & wrapped = arena.m_Lines[1];
    EXPECT_TRUE(wrapped.m_Flags & Line::Wrapped);
    GlyphRun const & sign = arena.m_Runs[wrapped.m_FirstRun + wrapped.m_RunCount - 1];
    EXPECT_NEAR(110, sign.m_X + sign.m_Width, 0.01);
    EXPECT_EQ(PlacedGlyph::Synthetic, arena.GlyphsOf(sign)[0].m_Flags);
    EXPECT_FALSE(arena.m_Lines.back().m_Flags & Line::Wrapped);
}

TEST(ParagraphBuilderTest, TabsLeadToTheirStops)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_Tabs = {{50}, {200, TabAlignment::End, U'.'}};
    paragraph.Set(u"a\tChapter\t123");
    std::vector<GlyphRun> const & runs = paragraph.m_Arena.m_Runs;
    ASSERT_EQ(4U, runs.size());
    EXPECT_NEAR(50, runs[1].m_X, 0.01);
    EXPECT_NEAR(200, runs[3].m_X + runs[3].m_Width, 0.01);
    EXPECT_GT(runs[2].m_GlyphCount, 10U) << "leaders";
    EXPECT_EQ(paragraph.m_Arena.m_Faces[0]->GetGlyph(U'.'), paragraph.m_Arena.GlyphsOf(runs[2])[0].m_Glyph);
}

TEST(ParagraphBuilderTest, SuperscriptsComeFromTheFontOrAreScaled)
{
    SetParagraph paragraph;
    paragraph.Set(u"12");
    std::vector<std::uint16_t> const plain = Glyphs(paragraph.m_Arena);
    paragraph.m_Style.m_Position = ScriptPosition::Superscript;
    paragraph.Set(u"12");
    EXPECT_NE(plain, Glyphs(paragraph.m_Arena));
    EXPECT_FLOAT_EQ(10.5F, paragraph.m_Arena.m_Runs[0].m_Size);
    EXPECT_FLOAT_EQ(0, paragraph.m_Arena.m_Runs[0].m_Rise);

    paragraph.m_Style.m_Families = {"DejaVu Serif"};
    paragraph.Set(u"12");
    EXPECT_LT(paragraph.m_Arena.m_Runs[0].m_Size, 7.5);
    EXPECT_GT(paragraph.m_Arena.m_Runs[0].m_Rise, 2);
}

TEST(ParagraphBuilderTest, CapitalsKeepTheOffsetsOfTheText)
{
    SetParagraph paragraph;
    paragraph.m_Style.m_Language = "de";
    paragraph.m_Style.m_Ligatures = false;
    paragraph.Set(u"STRASSE");
    std::vector<std::uint16_t> const capitals = Glyphs(paragraph.m_Arena);
    paragraph.m_Style.m_Capitals = Capitals::AllCaps;
    paragraph.Set(u"straße");
    EXPECT_EQ(capitals, Glyphs(paragraph.m_Arena));
    EXPECT_THAT(paragraph.Clusters(0), ElementsAre(0, 1, 2, 3, 4, 4, 5));

    paragraph.m_Style.m_Capitals = Capitals::SmallCaps;
    paragraph.m_Style.m_Families = {"DejaVu Serif"}; // Without small capitals of its own.
    paragraph.Set(u"Ab");
    ASSERT_EQ(2U, paragraph.m_Arena.m_Runs.size());
    EXPECT_FLOAT_EQ(10.5F, paragraph.m_Arena.m_Runs[0].m_Size);
    EXPECT_FLOAT_EQ(8.4F, paragraph.m_Arena.m_Runs[1].m_Size);
}

TEST(ParagraphBuilderTest, RunsCarryTheirStylesBack)
{
    auto const style = [](double size) {
        TextStyle made;
        made.m_Families = {"EB Garamond"};
        made.m_Size = size;
        return Kernel::Counted<TextStyle const>(new TextStyle(made));
    };
    std::vector<Kernel::Counted<TextStyle const>> const styles{style(10), style(20), style(10)};
    std::vector<StyleRun> const runs{{3, 2}, {5, 1}, {5, 0}, {6, 1}};
    ParagraphInput input;
    input.m_Text = u"abcdef gh";
    input.m_Styles = styles;
    input.m_Runs = runs;
    LineArena arena;
    ParagraphSettings settings;
    settings.m_Width = 300;
    input.m_Settings = &settings;
    ParagraphBuilder().Build(input, arena);
    std::vector<std::uint32_t> found;
    for (GlyphRun const & run : arena.m_Runs) {
        found.insert(found.end(), {run.m_TextStart, run.m_TextEnd, run.m_Style});
    }
    EXPECT_THAT(found, ElementsAre(0, 3, 2, 3, 9, 1));
    EXPECT_FLOAT_EQ(20, arena.m_Lines[0].m_FontSize);
}

TEST(ParagraphBuilderTest, PunctuationHangsIntoTheMarginWhenAsked)
{
    SetParagraph paragraph;
    paragraph.m_Settings.m_Protrusion = 1;
    paragraph.Set(u"“" + rabbits + u" " + rabbits);
    EXPECT_LT(paragraph.m_Arena.m_Lines[0].m_X, -1);
    int hanging = 0;
    for (Line const & line : paragraph.m_Arena.m_Lines) {
        char16_t last = paragraph.m_Text[line.m_TextEnd - 1];
        last = last == u' ' ? paragraph.m_Text[line.m_TextEnd - 2] : last;
        if ((line.m_Flags & Line::Hyphenated) || last == u',') {
            EXPECT_GT(RightEdge(paragraph.m_Arena, line), 251);
            ++hanging;
        }
    }
    EXPECT_GT(hanging, 0);
}

TEST(ParagraphBuilderTest, WhatCannotBeSetIsReported)
{
    SetParagraph paragraph;
    paragraph.m_Style.m_Families = {"No Such Family"};
    paragraph.Set(u"ok \U0010FFFD\U0010FFFD");
    ASSERT_EQ(2U, paragraph.m_Arena.m_Problems.size());
    EXPECT_EQ(LayoutProblem::Kind::MissingFamily, paragraph.m_Arena.m_Problems[0].m_Kind);
    EXPECT_EQ(LayoutProblem::Kind::MissingCharacter, paragraph.m_Arena.m_Problems[1].m_Kind);
    EXPECT_EQ(3U, paragraph.m_Arena.m_Problems[1].m_Position);
    EXPECT_EQ(U'\U0010FFFD', paragraph.m_Arena.m_Problems[1].m_Character);
    EXPECT_TRUE(paragraph.m_Arena.m_Glyphs.back().m_Flags & PlacedGlyph::Missing);
}

TEST(ParagraphBuilderTest, TextCutIntoWordsLooksAsIfShapedInOneGo)
{
    std::vector<std::u16string> texts = ReadCorpus("prose-variation");
    texts.resize(std::min<std::size_t>(texts.size(), 300));
    texts.push_back(rabbits);
    texts.push_back(u"AV To Wave, “Ta” f. (f) To, V. A quick fjord of officers");
    struct Case
    {
        char const * m_Family;
        bool m_Italic;
        ShapingMode m_Mode; ///< How this font's text is cut.
    };
    for (Case const & row : {Case{"EB Garamond", false, ShapingMode::Words},
                             Case{"EB Garamond", true, ShapingMode::SpacedWords}, // Forms at the ends of words.
                             Case{"Liberation Serif", false, ShapingMode::SpacedWords}, // Kerned spaces.
                             Case{"Liberation Serif", true, ShapingMode::SpacedWords},
                             Case{"Linux Libertine O", false, ShapingMode::Words}}) {
        SetParagraph paragraph;
        paragraph.m_Style.m_Families = {row.m_Family};
        paragraph.m_Style.m_Italic = row.m_Italic;
        paragraph.m_Settings.m_Width = 1e6;
        paragraph.m_Settings.m_Alignment = Alignment::Start;
        Kernel::Counted<FontFace const> const face =
            FontLibrary::GetInstance().Find(row.m_Family, 400, row.m_Italic).m_Face;
        hb_buffer_t * buffer = hb_buffer_create();
        ShapingContext const context(face, {}, HB_SCRIPT_LATIN, hb_language_from_string("en", -1), false, buffer);
        EXPECT_EQ(row.m_Mode, context.GetMode()) << row.m_Family;
        for (std::u16string text : texts) {
            text.erase(text.find_last_not_of(u' ') + 1);
            paragraph.Set(text);
            if (paragraph.m_Arena.m_Faces.size() != 1) {
                continue; // Characters that this font has not.
            }
            hb_buffer_clear_contents(buffer);
            hb_buffer_add_utf16(buffer, reinterpret_cast<std::uint16_t const *>(text.data()),
                                static_cast<int>(text.size()), 0, -1);
            hb_buffer_set_direction(buffer, HB_DIRECTION_LTR);
            hb_buffer_set_script(buffer, HB_SCRIPT_LATIN);
            hb_buffer_set_language(buffer, hb_language_from_string("en", -1));
            hb_shape(face->GetHbFont(), buffer, nullptr, 0);
            unsigned count = 0;
            hb_glyph_info_t const * infos = hb_buffer_get_glyph_infos(buffer, &count);
            hb_glyph_position_t const * positions = hb_buffer_get_glyph_positions(buffer, &count);
            ASSERT_EQ(count, paragraph.m_Arena.m_Glyphs.size()) << ToUtf8(text);
            double ours = 0;
            double theirs = 0;
            for (unsigned i = 0; i < count; ++i) {
                ASSERT_EQ(infos[i].codepoint, paragraph.m_Arena.m_Glyphs[i].m_Glyph)
                    << row.m_Family << " at " << i << " of " << ToUtf8(text);
                ours += paragraph.m_Arena.m_Glyphs[i].m_Advance;
                theirs += positions[i].x_advance * 10.5 / face->GetUnitsPerEm();
                ASSERT_NEAR(theirs, ours, 0.02) << row.m_Family << " at " << i << " of " << ToUtf8(text);
            }
        }
        hb_buffer_destroy(buffer);
    }
}
