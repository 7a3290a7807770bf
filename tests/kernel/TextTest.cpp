#include "framework/kernel/Collator.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/Path.h"
#include "framework/kernel/PathTraitsDos.h"
#include "framework/kernel/Uri.h"
#include "framework/kernel/Utf.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <climits>

using namespace Kernel;

TEST(FormatTest, PlaceholdersAreReplacedInOrderAndOnce)
{
    struct Row
    {
        char const * m_Format;
        std::vector<FormatHolderT<String>> m_Holders;
        char const * m_Expected;
    };
    std::vector<FormatHolderT<String>> const eleven{"a", "b", "c", "d", "e", "f", "g", "h", "i", "j", "k"};
    Row const rows[] = {
        {"LoadChapter:%1\n", {"a.kvdoc"}, "LoadChapter:a.kvdoc\n"},
        {"%2 before %1, %2 again", {"one", "two"}, "two before one, two again"},
        {"%1", {"%2", "two"}, "%2"},
        {"100% of %3 and %", {"one"}, "100% of %3 and %"},
        {"%0 stays", {"one"}, "%0 stays"},
        {"%11|%10|%1", eleven, "k|j|a"},
        {"%10", {"one"}, "one0"},
        {"%1|%2", {-5, 18446744073709551615u >> 1}, "-5|9223372036854775807"},
        {"", {}, ""},
    };
    for (Row const & row : rows) {
        String text = ">";
        AppendFormatVT<String>(text, row.m_Format, row.m_Holders.data(), row.m_Holders.size());
        EXPECT_EQ(String(">") + row.m_Expected, text);
    }
}

TEST(FormatTest, NumbersShowSignAndGroups)
{
    CharacterGrouping const thousands;
    EXPECT_EQ("-2147483648", ToStringT<String>(INT_MIN, SignStyle::NegativeOnly, nullptr));
    EXPECT_EQ("-9,223,372,036,854,775,808", ToStringT<String>(LLONG_MIN, SignStyle::NegativeOnly, &thousands));
    EXPECT_EQ("+100", ToStringT<String>(100, SignStyle::Always, &thousands));
    EXPECT_EQ("1,000", ToStringT<String>(1000, SignStyle::NegativeOnly, &thousands));
    EXPECT_EQ("0", ToString(0));
}

TEST(LocalisedStringTest, TextAndContextAreTheKeyAndFinalTextIsNotLookedUp)
{
    LocalisedString const text("New book", "Command description");
    EXPECT_EQ("New book", text.ToString());
    EXPECT_EQ(text, LocalisedString("New bookish", 8, "Command description", 19));
    EXPECT_FALSE(text == LocalisedString("New book", "Another context"));
    EXPECT_TRUE(LocalisedString().Empty());
    EXPECT_EQ("", LocalisedString("", "Context").ToString()) << "not the header of a catalogue";
    EXPECT_EQ("%1 done", LocalisedString::CreateFakeFromString("%1 done").ToString());
    EXPECT_EQ("Page 7", Format(LocalisedString("Page %1", "Context"), 7));
}

TEST(PathTest, PartsFollowBothSeparators)
{
    struct Row
    {
        char const * m_Path;
        char const * m_FileName;
        char const * m_Stem;
        char const * m_Extension;
        char const * m_FolderWithSeparator;
        char const * m_Folder;
    };
    Row const rows[] = {
        {"/books/one.kvdoc", "one.kvdoc", "one", "kvdoc", "/books/", "/books"},
        {"C:\\books\\one.kvdoc", "one.kvdoc", "one", "kvdoc", "C:\\books\\", "C:\\books"},
        {"a\\b/c", "c", "c", "", "a\\b/", "a\\b"},
        {"a.b/c", "c", "c", "", "a.b/", "a.b"},
        {"chapter", "chapter", "chapter", "", "", ""},
        {"a.b.c", "a.b.c", "a.b", "c", "", ""},
        {"/.profile", ".profile", "", "profile", "/", "/"},
        {"folder/", "", "", "", "folder/", "folder"},
        {"", "", "", "", "", ""},
    };
    for (Row const & row : rows) {
        EXPECT_EQ(row.m_FileName, Path::GetFileName(row.m_Path)) << row.m_Path;
        EXPECT_EQ(row.m_Stem, Path::GetFileNameWithoutExtension(row.m_Path)) << row.m_Path;
        EXPECT_EQ(row.m_Extension, Path::GetExtension(row.m_Path)) << row.m_Path;
        EXPECT_EQ(row.m_FolderWithSeparator, Path::GetFolderWithSeparator(row.m_Path)) << row.m_Path;
        EXPECT_EQ(row.m_Folder, Path::GetFolder(row.m_Path)) << row.m_Path;
    }
    EXPECT_TRUE(Path::IsAbsolute("/a") && Path::IsAbsolute("\\a") && Path::IsAbsolute("c:a"));
    EXPECT_FALSE(Path::IsAbsolute("a/b") || Path::IsAbsolute("") || Path::IsAbsolute("1:"));
}

TEST(PathTest, AppendPutsExactlyOneSeparatorBetween)
{
    struct Row
    {
        char const * m_Path;
        char const * m_Part;
        char const * m_Expected;
    };
    Row const rows[] = {
        {"/books", "one", "/books/one"},
        {"/books/", "one", "/books/one"},
        {"/books", "/one", "/books/one"},
        {"/books/", "/one", "/books/one"},
        {"", "one", "one"},
        {"/books", "", "/books"},
        {"C:\\books", "one", "C:\\books\\one"},
        {"C:\\books\\", "one", "C:\\books\\one"},
        {"a\\b/c", "d", "a\\b/c/d"},
        {"books", "one", "books/one"},
        {"/", "one", "/one"},
    };
    for (Row const & row : rows) {
        EXPECT_EQ(row.m_Expected, PathTraitsDos::Append(String(row.m_Path), String(row.m_Part)));
    }
    char buffer[8] = "abc";
    EXPECT_EQ(8u, PathTraitsDos::Append(buffer, "defg", 3, 4, sizeof(buffer))) << "no room for the closing zero";
    EXPECT_STREQ("abc", buffer);
    EXPECT_EQ(7u, PathTraitsDos::Append(buffer, "def", 3, 3, sizeof(buffer)));
    EXPECT_STREQ("abc/def", buffer);
}

TEST(UriTest, AProtocolIsToldFromADriveAndFromText)
{
    for (char const * text : {"https://a.b", "HTTP://a", "ftp://x", "mailto:a@b.c", "tel:+49", "x-y.z+1://q"}) {
        EXPECT_TRUE(HasUriProtocol(text)) << text;
    }
    for (char const * text : {"www.a.b", "C://books", "C:\\books", "a b://c", "://x", "1a://x", "note: text", ""}) {
        EXPECT_FALSE(HasUriProtocol(text)) << text;
    }
}

TEST(UtfTest, TheFirstBadByteHasItsLineAndColumn)
{
    struct Row
    {
        char const * m_Why;
        std::string m_Text;
        std::size_t m_Offset, m_Line, m_Column;
    };
    Row const rows[] = {
        {"stray continuation", "ab\x80", 2, 1, 3},
        {"columns count characters", "\xC3\xA4\xC3\xB6\xFF", 4, 1, 3},
        {"lines end in LF, CR LF and CR", "a\nb\r\nc\rd\xFF", 8, 4, 2},
        {"overlong slash", "x\xC0\xAF", 1, 1, 2},
        {"overlong three bytes", "\xE0\x80\x80", 0, 1, 1},
        {"surrogate", "\xED\xA0\x80", 0, 1, 1},
        {"above U+10FFFF", "\xF4\x90\x80\x80", 0, 1, 1},
        {"cut off at the end", "\n\xE2\x82", 1, 2, 1},
        {"Latin-1 in long ASCII", std::string(100, 'a') + "\xE9t\xE9", 100, 1, 101},
    };
    for (Row const & row : rows) {
        Utf8Fault fault;
        EXPECT_FALSE(IsValidUtf8(row.m_Text, fault)) << row.m_Why;
        EXPECT_EQ(row.m_Offset, fault.m_Offset) << row.m_Why;
        EXPECT_EQ(row.m_Line, fault.m_Line) << row.m_Why;
        EXPECT_EQ(row.m_Column, fault.m_Column) << row.m_Why;
    }
    EXPECT_TRUE(IsValidUtf8("plain \xC3\xA4 \xE2\x82\xAC \xF0\x9F\x93\x96 \xEF\xBF\xBF"));
}

TEST(UtfTest, ConversionKeepsCharactersAndReplacesWhatIsMalformed)
{
    std::string const good = "a\xC3\xA4\xE2\x82\xAC\xF0\x9F\x93\x96z";
    EXPECT_EQ(u"a\u00E4\u20AC\U0001F4D6z", Utf8ToUtf16(good));
    EXPECT_EQ(good, Utf16ToUtf8(Utf8ToUtf16(good)));
    EXPECT_EQ(6u, CountUtf16(good));
    EXPECT_EQ(u"\uFFFDx\uFFFD", Utf8ToUtf16("\xE2\x82x\xFF")) << "one for each maximal part";
    char16_t const lone[] = {0xD800, u'x', 0xDC00, 0};
    EXPECT_EQ("\xEF\xBF\xBDx\xEF\xBF\xBD", Utf16ToUtf8(lone));
}

TEST(CollatorTest, OrderIsThatOfTheLanguage)
{
    std::vector<String> words{"zebra", "\xC3\x84pfel", "Apfel", "apfel", "b"};
    std::sort(words.begin(), words.end(), Collator("de"));
    EXPECT_EQ((std::vector<String>{"apfel", "Apfel", "\xC3\x84pfel", "b", "zebra"}), words);
    EXPECT_LT(0, Collator("sv").Compare("\xC3\xA4", "z")) << "a letter of its own there";
    EXPECT_GT(0, Collator("no such language").Compare("a", "B"));
    Collator numeric("");
    numeric.SetNumericOrder();
    EXPECT_GT(0, numeric.Compare("chapter 9", "chapter 10"));
}
