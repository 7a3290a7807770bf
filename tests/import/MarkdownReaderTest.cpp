#include "Describe.h"

#include "import/MarkdownReader.h"

#include <gtest/gtest.h>

using namespace Import;

namespace
{

struct Case
{
    char const * m_Why;
    std::string m_Markdown;
    std::string m_Blocks;
    std::string m_Messages = "";
};

void Check(std::vector<Case> const & cases)
{
    for (Case const & row : cases) {
        SCOPED_TRACE(row.m_Why);
        std::string messages;
        EXPECT_EQ(ReadAndDescribe(row.m_Markdown, &messages), row.m_Blocks);
        EXPECT_EQ(messages, row.m_Messages);
    }
}

}

TEST(MarkdownReaderTest, BlocksAndTheirNesting)
{
    Check({
        {"headings, paragraphs joined over lines", "# A\n\none\ntwo\n", "h1 <anchor a>A\np one two\n"},
        {"line break", "one  \ntwo\\\nthree", "p one/two/three\n"},
        {"rule", "a\n\n***\n\nb", "p a\nrule\np b\n"},
        {"code keeps spaces and blank lines", "```rust,ignore\n  a\n\n\tb\n```", "code:rust {code   a//    b}\n"},
        {"code without a line", "```\n```\n", "code\n"},
        {"indented code", "    x\n", "code {code x}\n"},
        {"nested lists and quotations", "1. a\n   - b\n\n     c\n2. d\n\n> q\n> > r\n",
         "  1. p a\n    - p b\n    p c\n  2. p d\n>p q\n>>p r\n"},
        {"a list that starts elsewhere, with brackets", "7) a\n8) b", "  7) p a\n  8) p b\n"},
        {"tasks", "- [ ] a\n- [x] b\n- c", "  [ ] p a\n  [x] p b\n  - p c\n"},
        {"empty items keep their bullets", "-\n- a\n-\n", "  - p\n  - p a\n  - p\n"},
        {"table", "|a|b|\n|:-|-:|\n|*c*|\n|d|e|f|\n", "table\n  |a |b\n  |{em c} |\n  |d |e\n"},
        {"note with two paragraphs, used twice", "a[^n] b[^n]\n\n[^n]: One.\n\n    Two.\n",
         "p a<note 0> b<note 0>\nnote 0 n\n  p One.\n  p Two.\n"},
        {"a line end between ideographs is no space", "漢字\n漢字 a\nb", "p 漢字漢字 a b\n"},
        {"only headings", "# a\n## b", "h1 <anchor a>a\nh2 <anchor b>b\n"},
        {"nothing", "", ""},
    });
}

TEST(MarkdownReaderTest, LooksLinksAndPictures)
{
    Check({
        {"looks nest", "*a **b*** ~~c~~ `d *e*`", "p {em a }{em+strong b} {strike c} {code d *e*}\n"},
        {"links", "[a *b*](x.md#y) <http://z.org>", "p [a ](x.md#y)[{em b}](x.md#y) [http://z.org](http://z.org)\n"},
        {"a picture alone is a figure with its caption", "![A *b*](p.png)", "figure <picture p.png>A {em b}\n"},
        {"a picture in a line stays there", "see ![A](p.png) here", "p see <picture p.png> here\n"},
        {"html marks", "<em>a</em><br>H<sub>2</sub>O <kbd>Esc</kbd> x<sup>2</sup><!-- no -->",
         "p {em a}/H{sub 2}O {kbd Esc} x{sup 2}\n"},
        {"html link and anchor", "<a id=\"q\"></a><a href=\"z.md\">t</a>", "p [<anchor q>t](z.md)\n"},
        {"html block with picture and caption",
         "<figure>\n<img src=\"p.png\" alt=\"x\">\n<figcaption>Cap</figcaption>\n</figure>",
         "figure <picture p.png>\ncaption Cap\n"},
        {"caption span", "<span class=\"caption\">Table 1</span>", "caption Table 1\n"},
        {"listing with file name and caption",
         "<Listing number=\"1-2\" file-name=\"src/a.rs\" caption=\"Uses `x`\">\n\n```rust\nx\n```\n\n</Listing>",
         "file <anchor listing-1-2>src/a.rs\ncode:rust {code x}\ncaption Listing 1-2: Uses {code x}\n"},
        {"entities", "a &amp; b &lt; &copy;", "p a & b < ©\n"},
    });
}

TEST(MarkdownReaderTest, AttributeLists)
{
    Check({
        {"heading", "# A b {#my-id .x}\n\n## A b {y=1}", "h1 <anchor my-id>A b\nh2 <anchor a-b>A b\n"},
        {"spans", "[a *b*]{#i .smallcaps} c", "p {smallcaps <anchor i>a }{em+smallcaps b} c\n"},
        {"index marks", "[dog]{.index} [cat]{.index topic=\"Animal!Cat\" see=\"Pet\"}",
         "p <index dog>dog <index Animal!Cat see Pet>cat\n"},
        {"picture width", "![A](p.png){width=60%}", "figure <picture p.png>A\n"},
        {"nested brackets", "[a [b] c]{.mark}", "p {highlight a [b] c}\n"},
        {"in code they are text", "`[a]{.index}` `x`{.y", "p {code [a]{.index}} {code x}{.y\n"},
        {"not an attribute list", "f[i]{j} {k}", "p f[i]{j} {k}\n"},
        {"a class without a look is told", "[a]{.huge}", "p a\n", "1 class-unknown\n"},
        {"a broken width is told", "![A](p.png){width=wide}", "figure <picture p.png>A\n", "1 picture-width\n"},
    });
}

TEST(MarkdownReaderTest, WhatCannotBeHonouredIsToldWithItsLine)
{
    Check({
        {"mark without note, note without mark", "a\nb[^x]\n\n[^y]: z\n", "p a b[^x]\n",
         "2 note-missing\n4 note-unused\n"},
        {"note defined twice", "a[^x]\n\n[^x]: b\n\n[^x]: c\n", "p a<note 0>\nnote 0 x\n  p b\n", "5 note-twice\n"},
        {"definitions in code are code", "```\n[^y]: z\n```\n", "code {code [^y]: z}\n"},
        {"duplicate anchors", "# A {#x}\n\n[b]{#x}\n", "h1 <anchor x>A\np b\n", "3 anchor-twice\n"},
        {"generated blocks", "a\n\n::: {.toc}\n:::\n\n::: warning\nb\n:::\n", "p a\nbox Table of contents\np b\n",
         "3 later-block\n6 class-unknown\n"},
        {"references without text", "[](b.md) [t](c.md){.page}", "p [b.md](b.md) [t](c.md)\n",
         "1 later-reference\n1 later-reference\n"},
        {"include directives", "x\n\n```\ny\n{{#include a.rs}}\n```\n", "p x\ncode {code y/{{#include a.rs}}}\n",
         "5 directive\n"},
        {"unknown tag", "a <blink>b</blink>", "p a b\n", "1 html-unknown\n"},
        {"unclosed tag", "a <b>b\n\nc", "p a {strong b}\np c\n", "1 html-open\n"},
        {"raw table", "<table>\n<tr><td>a</td><td>b</td></tr>\n</table>", "p a\np b\n", "1 html-structure\n"},
        {"script", "<script>\nx < y\n</script>\n", "", "1 html-unknown\n"},
        {"control characters",
         "a\x01"
         "b\x02",
         "p ab\n", "1 control-character\n"},
        {"front matter counts as lines", "---\ntitle: T\n---\n\n[^x]", "p [^x]\n", "5 note-missing\n"},
    });
}

TEST(MarkdownReaderTest, RepeatedHeadingsGetNumberedAnchors)
{
    EXPECT_EQ(ReadAndDescribe("# Use\n\n# Use\n\n# Use-1\n\n# C++ & `x_y` Größe!\n"),
              "h1 <anchor use>Use\nh1 <anchor use-1>Use\nh1 <anchor use-1-1>Use-1\n"
              "h1 <anchor c--x_y-größe>C++ & {code x_y} Größe!\n");
}

TEST(MarkdownReaderTest, FrontMatterGivesTitleAuthorsAndLanguage)
{
    MessageList messages;
    ReadOptions options;
    options.m_ShownName = "a.md";
    ChapterText const chapter = ReadMarkdown(
        "---\ntitle: \"A: b\" # c\nauthor: [X, 'Y ''Z''']\nlang: de\nother:\n  - 1\nlonely\n---\n# H \"q\"\n", options,
        messages);
    EXPECT_EQ(chapter.Title(), "A: b");
    EXPECT_EQ(chapter.m_FrontMatter.m_Authors, (std::vector<std::string>{"X", "Y 'Z'"}));
    EXPECT_EQ(chapter.m_FrontMatter.m_Language, "de");
    EXPECT_EQ(Describe(chapter), "h1 <anchor h-q>H „q“\n");
    EXPECT_EQ(Describe(messages), "7 front-matter\n");
    // A thematic break at the start is no front matter.
    EXPECT_EQ(ReadAndDescribe("---\nplain text\n\n---\n"), "rule\np plain text\nrule\n");
}

TEST(MarkdownReaderTest, AListOfTheFrontMatterIsReadOrRefusedWhole)
{
    struct Row
    {
        char const * m_List;
        std::vector<std::string> m_Authors;
        char const * m_Messages;
    };
    Row const rows[] = {
        {"[X, Y]", {"X", "Y"}, ""},
        {"[X, Y, ] # both", {"X", "Y"}, ""},
        {"[]", {}, ""},
        {"[X, Y", {}, "2 front-matter\n"},
        {"[# X", {}, "2 front-matter\n"},
        {"[X, # Y]", {}, "2 front-matter\n"},
        {"[\"X\" Y]", {}, "2 front-matter\n"},
        {"[\"X, Y]", {}, "2 front-matter\n"},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_List);
        MessageList messages;
        ChapterText const chapter =
            ReadMarkdown("---\nauthors: " + std::string(row.m_List) + "\n---\nx\n", {"a.md", "en", true}, messages);
        EXPECT_EQ(chapter.m_FrontMatter.m_Authors, row.m_Authors);
        EXPECT_EQ(Describe(messages), row.m_Messages);
    }
}

TEST(MarkdownReaderTest, ExtremeInputIsReadWithoutHarm)
{
    std::string deep;
    for (int level = 0; level < 20; ++level) {
        deep += std::string(static_cast<std::size_t>(level) * 2, ' ') + "- x\n";
    }
    MessageList messages;
    ChapterText const lists = ReadMarkdown(deep, {"a.md", "en", true}, messages);
    ASSERT_EQ(lists.m_Blocks.size(), 20u);
    EXPECT_EQ(lists.m_Blocks.back().m_ListDepth, 20);

    ChapterText const quotes = ReadMarkdown(std::string(30000, '>') + "x", {"a.md", "en", true}, messages);
    EXPECT_EQ(quotes.m_Blocks.size(), 1u);
    ChapterText const brackets =
        ReadMarkdown(std::string(60000, '[') + "]{.x}" + std::string(60000, '*'), {"a.md", "en", true}, messages);
    EXPECT_EQ(brackets.m_Blocks.size(), 1u);
    // A table of a few kilobytes that would have nine million cells.
    std::string endless = "\n";
    for (char const * part : {"x|", "-|"}) {
        for (int column = 0; column < 3000; ++column) {
            endless += part;
        }
        endless += "\n";
    }
    for (int row = 0; row < 3000; ++row) {
        endless += "a\n";
    }
    MessageList told;
    ChapterText const table = ReadMarkdown(endless + "\n|a|b|\n|-|-|\n|c|d|\n", {"a.md", "en", true}, told);
    EXPECT_EQ(Describe(told), "3 table-size\n");
    ASSERT_EQ(table.m_Blocks.size(), 2u);
    EXPECT_EQ(table.m_Blocks[1].m_Kind, BlockKind::Table);

    ChapterText const line = ReadMarkdown(std::string(3000000, 'a') + " \"b\"", {"a.md", "en", true}, messages);
    ASSERT_EQ(line.m_Blocks.size(), 1u);
    EXPECT_EQ(line.m_Blocks[0].m_Text.m_Text.size(), 3000004u);
}
