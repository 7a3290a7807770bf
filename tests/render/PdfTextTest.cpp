#include "PageWriter.h"

#include "framework/render/PdfText.h"

#include <cmath>

using namespace Renderer;
using namespace Renderer::RenderTree;

namespace
{

TEST(PdfTextTest, NumbersAreShortAndNeverDependOnTheLocale)
{
    struct Row
    {
        double m_Value;
        char const * m_Text;
    };
    Row const rows[] = {
        {0, "0"},         {-0.0, "0"},       {0.0004, "0"},     {0.0005, "0.001"}, {-0.25, "-0.25"},
        {1.5, "1.5"},     {12.3456, "12.346"}, {100, "100"},    {0.1 + 0.2, "0.3"}, {-1e300, "-32767"},
        {NAN, "0"},       {INFINITY, "32767"},
    };
    for (Row const & row : rows) {
        std::string text;
        AppendNumber(text, row.m_Value);
        EXPECT_EQ(text, row.m_Text) << row.m_Value;
    }
}

TEST(PdfTextTest, WhatIsDrawnComesOutAsTheSameText)
{
    struct Row
    {
        char const * m_Why;
        char const * m_Font;
        std::u16string_view m_Text;
        char const * m_Extracted;
        int m_Level;
    };
    char const * const garamond = "/usr/share/fonts/opentype/ebgaramond/EBGaramond12-Regular.otf";
    char const * const liberation = "/usr/share/fonts/truetype/liberation2/LiberationSerif-Regular.ttf";
    Row const rows[] = {
        {"CFF outlines, ligatures, spaces", garamond, u"The first office of affine fjords", "The first office of affine fjords", 0},
        {"TrueType outlines, Greek and Cyrillic", liberation, u"\u039Aalo, \u0441\u0432\u043E\u0431\u043E\u0434\u0430", "\u039Aalo, \u0441\u0432\u043E\u0431\u043E\u0434\u0430", 0},
        {"one glyph for two characters: micro sign and mu", "/usr/share/fonts/truetype/dejavu/DejaVuSans.ttf",
         u"a\u00B5 b\u03BC c\u2126 d\u03A9", "a\u00B5 b\u03BC c\u2126 d\u03A9", 0},
        {"a composed letter set as base and mark", garamond, u"x\u0301y q\u0308z", "x\u0301y q\u0308z", 0},
        {"beyond the first plane", "/usr/share/fonts/truetype/dejavu/DejaVuSans.ttf", u"a\U0001D538b", "a\U0001D538b", 0},
        {"brackets, backslash and glyph ids with special bytes", liberation, u"(a\\b) *+-[]", "(a\\b) *+-[]", 0},
        {"right to left", "/usr/share/fonts/truetype/noto/NotoSansHebrew-Regular.ttf",
         u"\u05E9\u05DC\u05D5\u05DD \u05E2\u05D5\u05DC\u05DD", "\u05E9\u05DC\u05D5\u05DD \u05E2\u05D5\u05DC\u05DD", 1},
        {"right to left with joined letters", "/usr/share/fonts/truetype/noto/NotoNaskhArabic-Regular.ttf",
         u"\u0633\u0644\u0627\u0645 \u0639\u0644\u064A\u0643\u0645", "\u0633\u0644\u0627\u0645 \u0639\u0644\u064A\u0643\u0645", 1},
        {"conjuncts and reordered vowels", "/usr/share/fonts/truetype/noto/NotoSansDevanagari-Regular.ttf",
         u"\u0939\u093F\u0928\u094D\u0926\u0940 \u0915\u094D\u0937\u0924\u094D\u0930\u093F\u092F", "\u0939\u093F\u0928\u094D\u0926\u0940 \u0915\u094D\u0937\u0924\u094D\u0930\u093F\u092F", 0},
    };
    for (Row const & row : rows) {
        PageWriter writer;
        DisplayList list;
        DrawText(list, FaceAt(row.m_Font), 12, {20, 40}, row.m_Text, row.m_Level);
        writer.Write(list);
        std::string text = writer.Probe().Text(1);
        // Direction marks that pdftotext puts round right-to-left lines.
        for (char const * mark : {"\u202A", "\u202B", "\u202C"}) {
            for (std::size_t at; (at = text.find(mark)) != std::string::npos;) {
                text.erase(at, 3);
            }
        }
        EXPECT_EQ(text.substr(0, text.find('\n')), row.m_Extracted) << row.m_Why << "\n" << writer.Probe().Content(1);
    }
}

TEST(PdfTextTest, HyphensOfTheComposerJoinAndLeadersAreNotText)
{
    PageWriter writer;
    DisplayList list;
    Kernel::Counted<Typeset::FontFace const> const face = Garamond();
    auto const draw = [&](double y, std::u16string_view text, char16_t added) {
        std::vector<Typeset::PlacedGlyph> glyphs;
        for (std::uint32_t i = 0; i <= text.size(); ++i) {
            Typeset::PlacedGlyph glyph;
            bool const synthetic = i == text.size();
            glyph.m_Glyph = static_cast<std::uint16_t>(face->GetGlyph(synthetic ? added : text[i]));
            glyph.m_Flags = static_cast<std::uint16_t>(synthetic ? Typeset::PlacedGlyph::Synthetic : 0);
            glyph.m_Cluster = synthetic ? i - 1 : i;
            glyph.m_Advance = static_cast<float>(face->GlyphAdvance(glyph.m_Glyph) * 12.0 / face->GetUnitsPerEm());
            glyphs.push_back(glyph);
        }
        GlyphRun run;
        run.m_Face = face;
        run.m_Size = 12;
        run.m_Origin = {20, y};
        list.DrawGlyphs(run, glyphs, text, 0);
    };
    draw(40, u"an extra", u'-');
    draw(54, u"ordinary word", u'.');
    writer.Write(list);
    EXPECT_EQ(writer.Probe().Text(1), "an extraordinary word\n\n") << writer.Probe().Content(1);
}

TEST(PdfTextTest, FontsAreSubsetEmbeddedAndMapped)
{
    PageWriter writer;
    DisplayList list;
    DrawText(list, Garamond(), 12, {20, 40}, u"Hamburgefonts", 0);
    DrawText(list, Liberation(), 12, {20, 60}, u"Hamburgefonts", 0);
    writer.Write(list);
    std::string const fonts = writer.Probe().Fonts();
    EXPECT_NE(fonts.find("+EBGaramond12-Regular"), std::string::npos) << fonts;
    EXPECT_NE(fonts.find("CID Type 0C"), std::string::npos) << fonts;
    EXPECT_NE(fonts.find("+LiberationSerif"), std::string::npos) << fonts;
    EXPECT_NE(fonts.find("CID TrueType"), std::string::npos) << fonts;
    EXPECT_EQ(fonts.find(" no "), std::string::npos) << "not embedded, not subset or not mapped:\n" << fonts;
    EXPECT_LT(writer.Finish().size(), 40000U) << "the subsets hold more than a dozen glyphs";
}

TEST(PdfTextTest, AReadersPenStaysWithTheComposersOverALongLine)
{
    // Advances that no width in the file equals, as on a justified line.
    PageWriter writer;
    DisplayList list;
    Kernel::Counted<Typeset::FontFace const> const face = Liberation();
    std::vector<Typeset::PlacedGlyph> glyphs(200);
    std::u16string const text(200, u'l');
    for (std::uint32_t i = 0; i < glyphs.size(); ++i) {
        glyphs[i].m_Glyph = static_cast<std::uint16_t>(face->GetGlyph('l'));
        glyphs[i].m_Cluster = i;
        glyphs[i].m_Advance = 1.3571F;
    }
    GlyphRun run;
    run.m_Face = face;
    run.m_Size = 4;
    run.m_Origin = {10, 40};
    list.DrawGlyphs(run, glyphs, text, 0);
    writer.Write(list);
    // Sum what a reader adds up: widths less the adjustments.
    std::string const content = writer.Probe().Content(1);
    std::size_t const array = content.find('[');
    double pen = 0;
    double const width = std::round(face->GlyphAdvance(glyphs[0].m_Glyph) * 1e5 / face->GetUnitsPerEm()) / 1e5;
    for (std::size_t at = array + 1; content[at] != ']';) {
        if (content[at] == '(') {
            std::size_t const close = content.find(')', at);
            pen += static_cast<double>((close - at - 1) / 2) * width * 4;
            at = close + 1;
        } else {
            std::size_t used = 0;
            pen -= std::stod(content.substr(at), &used) / 1000 * 4;
            at += used;
        }
    }
    EXPECT_NEAR(pen - width * 4, 199 * 1.3571, 0.01);
}

TEST(PdfTextTest, RunsShareAFontSettingAndMoveRelativeToEachOther)
{
    PageWriter writer;
    DisplayList list;
    DrawText(list, Liberation(), 10, {20, 40}, u"A", 0);
    DrawText(list, Liberation(), 10, {30.5, 52}, u"B", 0);
    writer.Write(list);
    EXPECT_EQ(writer.Probe().Content(1), std::string("BT\n/F1 10 Tf\n20 360 Td\n[(\0$)]TJ\n10.5 -12 Td\n[(\0%)]TJ\nET\n", 56));
}

}
