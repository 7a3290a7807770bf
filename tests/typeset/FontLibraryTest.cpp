#include "framework/typeset/FontLibrary.h"

#include "support/TemporaryFolder.h"
#include "typeset/TypesetSupport.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

using namespace Typeset;

namespace
{

FontLibrary & Library() { return FontLibrary::GetInstance(); }

struct CountingSink : OutlineSink
{
    void MoveTo(double, double) override { ++m_Contours; }
    void LineTo(double x, double y) override { Reach(x, y); }
    void QuadTo(double, double, double x, double y) override { Reach(x, y), ++m_Quads; }
    void CubicTo(double, double, double, double, double x, double y) override { Reach(x, y), ++m_Cubics; }
    void Close() override { ++m_Closes; }
    void Reach(double, double y) { m_Top = std::max(m_Top, y); }

    int m_Contours = 0;
    int m_Quads = 0;
    int m_Cubics = 0;
    int m_Closes = 0;
    double m_Top = 0;
};

}

TEST(FontLibraryTest, FamiliesAreFoundByNameStyleAndOpticalSize)
{
    struct Case
    {
        char const * m_Family;
        int m_Weight;
        bool m_Italic;
        double m_Size;
        char const * m_PostScriptName;
        bool m_FamilyFound;
        bool m_StyleFound;
    };
    for (Case const & row : {
             Case{"EB Garamond", 400, false, 11, "EBGaramond12-Regular", true, true},
             Case{"eb garamond", 400, true, 0, "EBGaramond12-Italic", true, true}, // Case does not matter.
             Case{"EB Garamond", 400, false, 8, "EBGaramond08-Regular", true, true},
             Case{"EB Garamond 12", 400, false, 8, "EBGaramond12-Regular", true, true}, // Asked for by its own name.
             Case{"EB Garamond", 700, false, 8, "EBGaramond12-Bold", true, true},
             Case{"EB Garamond", 700, true, 11, "EBGaramond12-Italic", true, false}, // No bold italic: slope first.
             Case{"Linux Libertine O", 600, true, 11, "LinLibertineOZI", true, true},
             Case{"DejaVu Serif", 400, false, 11, "DejaVuSerif", true, true}, // Not the condensed one.
             Case{"monospace", 400, false, 11, "DejaVuSansMono", true, true},
             Case{"No Such Sans", 700, false, 11, "NotoSans-Bold", false, true},
             Case{"No Such Family", 400, true, 11, "NotoSerif-Italic", false, true},
         }) {
        FontMatch const match = Library().Find(row.m_Family, row.m_Weight, row.m_Italic, row.m_Size);
        ASSERT_TRUE(match.m_Face) << row.m_Family;
        EXPECT_EQ(row.m_PostScriptName, match.m_Face->GetPostScriptName().ToStd()) << row.m_Family;
        EXPECT_EQ(row.m_FamilyFound, match.m_FamilyFound) << row.m_Family;
        EXPECT_EQ(row.m_StyleFound, match.m_StyleFound) << row.m_Family;
    }
}

TEST(FontLibraryTest, AListTakesItsFirstInstalledFamilyAndTellsThatTheFirstIsMissing)
{
    std::vector<String> const families{"No Such Family", "Liberation Serif"};
    FontMatch const match = Library().Find(families, 400, false);
    EXPECT_EQ("LiberationSerif", match.m_Face->GetPostScriptName().ToStd());
    EXPECT_FALSE(match.m_FamilyFound);
}

TEST(FontLibraryTest, APinnedFontIsTheFileWithThatContentOnly)
{
    Kernel::Counted<FontFace const> const face = Library().Find("EB Garamond", 400, false).m_Face;
    TemporaryFolder const folder;
    std::string const copy = (folder / "copy.otf").ToStd();
    std::filesystem::copy_file(face->GetPath().ToStd(), copy);
    EXPECT_EQ(face, Library().FromFileAndHash(copy, 0, face->GetHash())) << "a copy is the same face";

    std::fstream(copy, std::ios::in | std::ios::out | std::ios::binary).seekp(2000).put('x');
    Kernel::Counted<FontFace const> const changed = Library().FromFile(copy, 0);
    EXPECT_TRUE(!changed || changed->GetHash() != face->GetHash());
    EXPECT_EQ(nullptr, Library().FromFileAndHash(copy, 0, ContentHash{1, 2}).Get());

    std::ofstream(copy, std::ios::trunc) << "no font at all";
    EXPECT_EQ(nullptr, Library().FromFile(copy, 0).Get());
    EXPECT_EQ(nullptr, Library().FromFile(copy + "-missing", 0).Get());
    EXPECT_EQ(nullptr, Library().FromFile(face->GetPath(), 5).Get()) << "no such face in the file";
}

TEST(FontLibraryTest, FallbackFollowsScriptLanguageAndKind)
{
    struct Case
    {
        char32_t m_Character;
        char const * m_Language;
        char const * m_Beside;
        char const * m_Family;
    };
    for (Case const & row : {
             Case{U'ش', "ar", "EB Garamond", "Noto Naskh Arabic"},
             Case{U'א', "he", "EB Garamond", "Noto Serif Hebrew"},
             Case{U'א', "he", "Noto Sans", "Noto Sans Hebrew"},
             Case{U'द', "hi", "EB Garamond", "Noto Serif Devanagari"},
             Case{U'直', "zh", "EB Garamond", "Noto Serif CJK SC"},
             Case{U'直', "ja", "Liberation Sans", "Noto Sans CJK JP"},
             Case{U'か', "", "EB Garamond", "Noto Serif CJK JP"},
             Case{U'한', "en", "EB Garamond", "Noto Serif CJK KR"},
         }) {
        Kernel::Counted<FontFace const> const beside = Library().Find(row.m_Beside, 400, false).m_Face;
        Kernel::Counted<FontFace const> const face = Library().FindFallback(row.m_Character, row.m_Language, *beside);
        ASSERT_TRUE(face) << row.m_Family;
        EXPECT_EQ(row.m_Family, face->GetFamily().ToStd());
        EXPECT_TRUE(face->HasGlyph(row.m_Character));
    }
    Kernel::Counted<FontFace const> const beside = Library().Find("EB Garamond", 400, false).m_Face;
    EXPECT_FALSE(Library().FindFallback(U'\U0010FFFD', "en", *beside)) << "a character for private use";
}

TEST(FontFaceTest, MetricsAndRightsComeFromTheTables)
{
    Kernel::Counted<FontFace const> const face = Library().Find("EB Garamond", 400, false).m_Face;
    FaceMetrics const & metrics = face->GetMetrics();
    EXPECT_EQ(1000, metrics.m_UnitsPerEm);
    EXPECT_EQ(650, metrics.m_CapHeight);
    EXPECT_EQ(400, metrics.m_XHeight);
    EXPECT_GT(metrics.m_Ascent, metrics.m_CapHeight);
    EXPECT_GT(metrics.m_Descent, 0);
    EXPECT_LT(metrics.m_UnderlinePosition, 0);
    EXPECT_TRUE(face->MayEmbed());
    EXPECT_TRUE(face->MaySubset());
    EXPECT_TRUE(face->HasFeature("smcp"));
    EXPECT_FALSE(face->HasFeature("xxxx"));
    EXPECT_EQ(HashContent(face->GetData().data(), face->GetData().size()), face->GetHash());
}

TEST(FontFaceTest, OutlinesAreClosedAndReachTheirHeight)
{
    for (char const * family : {"EB Garamond", "Liberation Serif"}) {
        Kernel::Counted<FontFace const> const face = Library().Find(family, 400, false).m_Face;
        CountingSink sink;
        face->DrawGlyph(face->GetGlyph(U'O'), sink);
        EXPECT_EQ(2, sink.m_Contours) << family;
        EXPECT_EQ(2, sink.m_Closes) << family;
        EXPECT_EQ(face->HasCffOutlines(), sink.m_Cubics > 0) << family;
        EXPECT_EQ(face->HasCffOutlines(), sink.m_Quads == 0) << family;
        EXPECT_NEAR(face->GetMetrics().m_CapHeight, sink.m_Top, face->GetUnitsPerEm() * 0.03) << family;
        CountingSink space;
        face->DrawGlyph(face->GetGlyph(U' '), space);
        EXPECT_EQ(0, space.m_Contours) << family;
    }
}

TEST(FontFaceTest, ALetterThatNobodyHasDrawnCountsAsMissing)
{
    // This face names letters of Greek and Cyrillic without an outline; what is blank by nature is there all the same.
    Kernel::Counted<FontFace const> const face = Library().Find("EB Garamond", 400, true, 8).m_Face;
    ASSERT_EQ(face->GetPostScriptName(), "EBGaramond08-Italic");
    for (char32_t const blank : U"\u0435\u043E\u03B1") {
        EXPECT_EQ(0u, blank ? face->GetGlyph(blank) : 0u) << static_cast<unsigned>(blank);
    }
    for (char32_t const drawn : {U'a', U' ', U'\u00A0', U'\u200B'}) {
        EXPECT_NE(0u, face->GetGlyph(drawn)) << static_cast<unsigned>(drawn);
    }
}

TEST(ContentHashTest, MatchesThePublishedFunction)
{
    // Reference values of MurmurHash3_x64_128 with seed 0.
    EXPECT_EQ("e34bbc7bbc071b6c7a433ca9c49a9347",
              HashContent("The quick brown fox jumps over the lazy dog", 43).ToString().ToStd());
    EXPECT_FALSE(HashContent("", 0).IsNull());
}
