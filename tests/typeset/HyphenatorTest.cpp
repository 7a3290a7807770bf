#include "framework/typeset/Hyphenator.h"

#include "typeset/TypesetSupport.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <hyphen.h>
#include <unicode/uchar.h>
#include <unicode/ucnv.h>

#include <chrono>
#include <set>

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

TEST(HyphenPatternsTest, WordsAreDividedAsLibhyphenDividesThem)
{
    std::set<std::u16string> words;
    for (char const * folder : {"prose-variation", "scripts"}) {
        for (std::u16string const & text : ReadCorpus(folder)) {
            std::u16string word;
            for (char16_t unit : text + u" ") {
                unit = unit == u'\u2019' ? u'\'' : static_cast<char16_t>(u_tolower(unit));
                if (u_isalpha(unit) || unit == u'\'') {
                    word += unit;
                } else {
                    words.insert(word);
                    word.clear();
                }
            }
        }
    }
    // German is left out here: libhyphen needs seconds to load it.
    for (char const * name : {"en_US", "en_GB", "fr", "ru_RU", "el_GR"}) {
        std::string const path = std::string("/usr/share/hyphen/hyph_") + name + ".dic";
        HyphenPatterns patterns;
        ASSERT_TRUE(patterns.Load(path)) << path;
        HyphenDict * dictionary = hnj_hyphen_load(path.c_str());
        ASSERT_TRUE(dictionary);
        UErrorCode error = U_ZERO_ERROR;
        UConverter * converter = ucnv_open(dictionary->cset, &error);
        ucnv_setFromUCallBack(converter, UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
        int const least = std::max<int>(dictionary->lhmin, 2);
        int const leastAfter = std::max<int>(dictionary->rhmin, 2);
        for (std::u16string const & word : words) {
            char bytes[512];
            char marks[520] = {};
            error = U_ZERO_ERROR;
            int const length = ucnv_fromUChars(converter, bytes, 500, word.data(), static_cast<int>(word.size()), &error);
            if (U_FAILURE(error) || word.size() < 4 || word.size() > HyphenPatterns::LongestWord) {
                continue; // Not a word that the dictionary could know.
            }
            char ** replacements = nullptr;
            int * positions = nullptr;
            int * cuts = nullptr;
            hnj_hyphen_hyphenate3(dictionary, bytes, length, marks, nullptr, &replacements, &positions, &cuts, 1, 1, 1,
                                  1);
            for (std::size_t i = 0; replacements && i < static_cast<std::size_t>(length); ++i) {
                std::free(replacements[i]);
            }
            std::free(replacements);
            std::free(positions);
            std::free(cuts);
            auto const found = patterns.Find(word);
            std::u16string ours;
            std::u16string theirs;
            for (std::size_t i = 0; i < word.size(); ++i) {
                bool const inside =
                    static_cast<int>(i) + 1 >= least && static_cast<int>(word.size() - i) - 1 >= leastAfter;
                ours += word[i];
                ours += inside && found[i] ? u"-" : u"";
                theirs += word[i];
                theirs += inside && (marks[i] & 1) ? u"-" : u"";
            }
            ASSERT_EQ(ToUtf8(theirs), ToUtf8(ours)) << name;
        }
        ucnv_close(converter);
        hnj_hyphen_free(dictionary);
    }
}

TEST(HyphenPatternsTest, TheGermanDictionaryLoadsInATwinkling)
{
    auto const start = std::chrono::steady_clock::now();
    HyphenPatterns patterns;
    ASSERT_TRUE(patterns.Load("/usr/share/hyphen/hyph_de_DE.dic"));
    // 0.05 s where libhyphen takes 2.7 s; the limit leaves room for a busy machine and a build without optimisation.
    EXPECT_LT(std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count(), 1.5);
}

TEST(HyphenPatternsTest, FilesThatAreNoDictionaryAreRefused)
{
    HyphenPatterns patterns;
    EXPECT_FALSE(patterns.Load("/usr/share/hyphen/none.dic"));
    EXPECT_FALSE(patterns.Load("/usr/share/hyphen"));
}
