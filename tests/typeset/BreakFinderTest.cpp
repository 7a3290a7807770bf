#include "framework/typeset/BreakFinder.h"

#include "typeset/TypesetSupport.h"

#include <gtest/gtest.h>

#include <random>

using namespace Typeset;

namespace
{

std::u16string Marked(std::u16string_view text, std::vector<BreakPlace> const & places)
{
    std::u16string marked(text);
    for (std::size_t i = places.size(); i-- > 0;) {
        marked.insert(places[i].m_Position, places[i].m_Kind == BreakPlace::Kind::Mandatory ? u"‖" : u"|");
    }
    return marked;
}

class BreakFinderTest : public testing::Test
{
protected:
    /// Where the pair rules and ICU disagree about the text; empty if they agree.
    std::string Difference(std::u16string const & text)
    {
        std::vector<BreakPlace> byRules;
        std::vector<BreakPlace> byIterator;
        BreakFinder::FindByRules(text, m_Cache.GetCharacters(), byRules);
        BreakFinder::FindByIterator(text, "en", m_Cache, byIterator);
        std::u16string const ours = Marked(text, byRules);
        std::u16string const icu = Marked(text, byIterator);
        return ours == icu ? "" : "ours " + ToUtf8(ours) + "\nICU  " + ToUtf8(icu);
    }

    bool IsSimple(std::u16string const & text)
    {
        unsigned flags = 0;
        for (char16_t const unit : text) {
            flags |= m_Cache.GetCharacters().Get(unit).m_Flags;
        }
        return !(flags & CharacterInfo::Complex);
    }

    ShapeCache m_Cache;
};

}

TEST_F(BreakFinderTest, RulesAgreeWithIcuOnRandomTextOfEveryClass)
{
    // A few characters of each class, with those that rules single out.
    std::u16string const alphabet = u"aZéЖλ 1290,.;:!?()[]{}«»„“”‘’'\"-–—/%$€£°…\u00A0\u2060\u200B\u0301  &@#*+=<>|~\\_^`";
    std::mt19937 random(7);
    for (int i = 0; i < 20000; ++i) {
        std::u16string text;
        std::size_t const length = 2 + random() % 9;
        for (std::size_t j = 0; j < length; ++j) {
            text += alphabet[random() % alphabet.size()];
        }
        ASSERT_EQ("", Difference(text)) << "text " << i;
    }
}

TEST_F(BreakFinderTest, RulesAgreeWithIcuOnEveryParagraphOfTheProse)
{
    std::vector<std::u16string> const paragraphs = ReadCorpus("prose-variation");
    if (paragraphs.empty()) {
        GTEST_SKIP() << "no corpus on this machine";
    }
    for (std::u16string const & text : paragraphs) {
        if (IsSimple(text)) {
            ASSERT_EQ("", Difference(text));
        }
    }
}

TEST_F(BreakFinderTest, WebAddressesBreakBesideTheirPunctuationOnly)
{
    struct Case
    {
        char16_t const * m_Address;
        char16_t const * m_Broken;
    };
    for (Case const & row : {
             Case{u"https://example.org/a-path/page.html", u"https://|example|.org/|a-path/|page|.html"},
             Case{u"www.example.org/?q=1&r=2", u"www|.example|.org/|?q=|1&|r=2"},
             Case{u"http://x", u"http://x"},
         }) {
        std::vector<std::uint32_t> places;
        FindAddressBreaks(row.m_Address, places);
        std::u16string broken(row.m_Address);
        for (std::size_t i = places.size(); i-- > 0;) {
            broken.insert(places[i], u"|");
        }
        EXPECT_EQ(ToUtf8(row.m_Broken), ToUtf8(broken));
        EXPECT_TRUE(IsWebAddress(row.m_Address));
    }
    EXPECT_FALSE(IsWebAddress(u"and/or"));
}
