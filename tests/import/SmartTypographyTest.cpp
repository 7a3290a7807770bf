#include "import/SmartTypography.h"
#include "import/InlineBuilder.h"
#include "import/SourceText.h"

#include <gtest/gtest.h>

using namespace Import;

namespace
{

std::string Smart(char const * language, char const * text)
{
    InlineBuilder builder;
    builder.Append(ToUtf16(text), false);
    builder.Apply(SmartTypography(language).FindEdits(builder.Text(), {}));
    return ToUtf8(builder.Finish().m_Text);
}

}

TEST(SmartTypographyTest, EachLanguageGetsItsOwnMarks)
{
    struct Case
    {
        char const * m_Language;
        char const * m_Text;
        char const * m_Expected;
    };
    for (auto const & [language, text, expected] : {
             Case{"en", "\"It's 'so',\" he said (\"no\").", "“It’s ‘so’,” he said (“no”)."},
             Case{"en", "the '90s, 'tis, dogs' tails, rock 'n' roll", "the ’90s, ’tis, dogs’ tails, rock ’n’ roll"},
             Case{"en", "a--b --- c... d.... e..", "a–b — c… d…. e.."},
             Case{"en", "use --quiet or -o", "use --quiet or -o"},
             Case{"en", "pp. 12-34, 1939-45, 1875-05-03, UTF-8, ch04-01, 34-12, 555-1234-5, Listing 1-2, Chapters 1-2",
                  "pp. 12–34, 1939–45, 1875-05-03, UTF-8, ch04-01, 34-12, 555-1234-5, Listing 1-2, Chapters 1–2"},
             Case{"de-DE", "\"Das ist 'so'\"", "„Das ist ‚so‘“"},
             Case{"de", "Seite 12-34, im Jahr 1914-18, Abbildung 1-2, Tabelle 3-4", "Seite 12–34, im Jahr 1914–18, Abbildung 1-2, Tabelle 3-4"},
             Case{"de-CH", "\"So\"", "«So»"},
             Case{"fr", "\"Oui\" : non ! l'eau", "«\u202FOui\u202F»\u00A0: non\u202F! l’eau"},
             Case{"ru", "\"Да\"", "«Да»"},
             Case{"xx", "\"a\"", "“a”"},
         }) {
        EXPECT_EQ(Smart(language, text), expected) << language;
    }
}

TEST(SmartTypographyTest, VerbatimTextIsLeftAlone)
{
    InlineBuilder builder;
    builder.Append(u"\"a\" ", false);
    builder.SetMarks(Mark::Code);
    builder.Append(u"\"b\" -- ", true);
    builder.SetMarks(Mark::None);
    builder.Append(u"\"c\"", false);
    builder.Apply(SmartTypography("en").FindEdits(builder.Text(), builder.VerbatimMask()));
    EXPECT_EQ(ToUtf8(builder.Finish().m_Text), "“a” \"b\" -- “c”");
}

TEST(InlineBuilderTest, EditsMoveLooksAndObjectsAlong)
{
    InlineBuilder builder;
    builder.Append(u"one---", false);
    builder.SetMarks(Mark::Emphasis);
    builder.Append(u"two...", false);
    builder.AddObject(ObjectKind::Anchor, 7);
    builder.SetMarks(Mark::None);
    builder.Append(u"x", false);
    builder.Apply({{3, 3, u"-"}, {9, 3, u"!"}});
    InlineText const text = builder.Finish();
    EXPECT_EQ(ToUtf8(text.m_Text), "one-two!x");
    EXPECT_EQ(text.m_Spans,
              (std::vector<Span>{{0, 4, Mark::None, -1}, {4, 4, Mark::Emphasis, -1}, {8, 1, Mark::None, -1}}));
    EXPECT_EQ(text.m_Objects, (std::vector<InlineObject>{{8, ObjectKind::Anchor, 7}}));
}
