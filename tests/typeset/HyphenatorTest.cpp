#include "framework/typeset/Hyphenator.h"

#include "typeset/TypesetSupport.h"

#include <gtest/gtest.h>

using namespace Typeset;

namespace
{

std::string Hyphenated(char const * language, std::string_view word)
{
    Hyphenator const * hyphenator = Hyphenator::Get(language);
    if (!hyphenator) {
        return "no dictionary";
    }
    std::u16string text = ToUtf16(word);
    std::vector<std::uint16_t> positions;
    hyphenator->Hyphenate(text, positions);
    for (std::size_t i = positions.size(); i-- > 0;) {
        text.insert(positions[i], u"-");
    }
    return ToUtf8(text);
}

}

TEST(HyphenatorTest, WordsAreDividedByTheRulesOfTheirLanguage)
{
    struct Case
    {
        char const * m_Language;
        char const * m_Word;
        char const * m_Expected;
    };
    for (Case const & row : {
             Case{"en", "hyphenation", "hy-phen-ation"},
             Case{"en-US", "typographical", "ty-po-graph-i-cal"},
             Case{"en-GB", "typographical", "ty-po-graph-ical"}, // Another dictionary than the American one.
             Case{"en", "HYPHENATION", "HY-PHEN-ATION"},         // Capitals are looked up as small letters.
             Case{"en", "only", "only"},                         // Two letters before, three after.
             Case{"de", "Silbentrennung", "Sil-ben-tren-nung"},
             Case{"de-AT", "Übergröße", "Über-grö-ße"}, // An 8-bit dictionary; a region that has only the language's.
             Case{"de", "Straßenbahn", "Stra-ßen-bahn"},
             Case{"fr", "typographie", "ty-po-gra-phie"},
             Case{"fr", "l’électricité", "l’élec-tri-cité"}, // The typographic apostrophe is one; three letters after.
             Case{"ru", "предложение", "пред-ложе-ние"},
             Case{"el", "τυπογραφία", "τυ-πο-γρα-φία"},
             Case{"el-polyton", "ἀναγνώριση", "ἀνα-γνώρι-ση"}, // Breathings, which the dictionary does not know.
             Case{"de", "日本語日本語", "日本語日本語"},        // Nothing the dictionary could say.
             Case{"en", "", ""},
         }) {
        EXPECT_EQ(row.m_Expected, Hyphenated(row.m_Language, row.m_Word)) << row.m_Language;
    }
}

TEST(HyphenatorTest, LanguagesWithoutDictionaryAndOddTagsGiveNone)
{
    for (char const * language : {"", "xx", "zh-Hans", "../etc/passwd", "e", "-"}) {
        EXPECT_EQ(nullptr, Hyphenator::Get(language)) << language;
    }
    EXPECT_EQ(Hyphenator::Get("de"), Hyphenator::Get("de"));
}
