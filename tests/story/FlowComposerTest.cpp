#include "story/FlowFixture.h"

#include <gtest/gtest.h>

#include <cmath>

namespace
{

using namespace FlowTest;
using namespace Story;

struct Part
{
    char const * m_Name;
    int m_Lines;
    char const * m_Style;
};

TEST(FlowComposerTest, BreaksFramesByTheRulesOfKeeps)
{
    struct Case
    {
        char const * m_Why;
        int m_FrameLines;
        std::vector<Part> m_Parts;
        char const * m_Expected;
    };
    Case const cases[] = {
        {"fits", 5, {{"a", 2, "Body"}, {"b", 3, "Body"}}, "a1 a2 b1 b2 b3"},
        {"two lines at least on either side", 5, {{"a", 3, "Body"}, {"b", 5, "Body"}}, "a1 a2 a3 b1 b2|b3 b4 b5"},
        {"no widow", 5, {{"a", 6, "Body"}}, "a1 a2 a3 a4|a5 a6"},
        {"no orphan", 5, {{"a", 4, "Body"}, {"b", 4, "Body"}}, "a1 a2 a3 a4|b1 b2 b3 b4"},
        {"three lines cannot be divided", 5, {{"a", 3, "Body"}, {"b", 3, "Body"}}, "a1 a2 a3|b1 b2 b3"},
        {"a heading goes with two lines of what follows",
         5,
         {{"a", 3, "Body"}, {"h", 1, "Heading"}, {"b", 4, "Body"}},
         "a1 a2 a3|h1 b1 b2 b3 b4"},
        {"a heading with its two lines stays", 5, {{"a", 2, "Body"}, {"h", 1, "Heading"}, {"b", 4, "Body"}},
         "a1 a2 h1 b1 b2|b3 b4"},
        {"headings in a row go together",
         5,
         {{"a", 2, "Body"}, {"h", 1, "Heading"}, {"i", 1, "Heading"}, {"b", 2, "Body"}},
         "a1 a2|h1 i1 b1 b2"},
        {"headings without end give way",
         3,
         {{"a", 1, "Heading"}, {"b", 1, "Heading"}, {"c", 1, "Heading"}, {"d", 1, "Heading"}, {"e", 1, "Body"}},
         "a1 b1 c1|d1 e1"},
        {"kept together", 5, {{"a", 3, "Body"}, {"k", 4, "Together"}}, "a1 a2 a3|k1 k2 k3 k4"},
        {"what is larger than a frame cannot be kept together", 3, {{"k", 5, "Together"}}, "k1 k2 k3|k4 k5"},
        {"a new page", 5, {{"a", 1, "Body"}, {"p", 1, "New page"}, {"b", 1, "Body"}}, "a1|p1 b1"},
        {"no empty page at the beginning", 5, {{"p", 1, "New page"}}, "p1"},
        {"an empty paragraph is a line", 2, {{"a", 1, "Body"}, {"", 0, "Body"}, {"b", 1, "Body"}}, "a1 |b1"},
        {"a frame too small for a line takes one", 0, {{"a", 2, "Body"}}, "a1|a2"},
    };
    for (Case const & test : cases) {
        SCOPED_TRACE(test.m_Why);
        StoryBuilder builder;
        for (Part const & part : test.m_Parts) {
            AddLines(builder, part.m_Name, part.m_Lines, part.m_Style);
        }
        auto const layout = Compose(*builder.Finish(), Frames(200, 12 * test.m_FrameLines), {});
        EXPECT_EQ(Describe(*layout), test.m_Expected);
        EXPECT_FALSE(layout->IsOverset());
    }
}

TEST(FlowComposerTest, ABreakElementBeginsANewFrame)
{
    StoryBuilder builder;
    AddLines(builder, "a", 1, "Body");
    AddObject(builder, MakeCounted<BreakGlyph>(), "Body");
    AddLines(builder, "b", 1, "Body");
    builder.AppendText("c", nullptr);
    builder.AppendObject(MakeCounted<BreakGlyph>(), nullptr);
    builder.AppendText("d", nullptr);
    builder.EndParagraph(nullptr);
    EXPECT_EQ(Describe(*Compose(*builder.Finish(), Frames(200, 120), {})), "a1|b1 c|d");
}

TEST(FlowComposerTest, TextSitsOnTheGridAndComesBackToItAfterAHeading)
{
    StoryBuilder builder;
    AddLines(builder, "s", 1, "Spaced");
    AddLines(builder, "a", 3, "Body");
    AddLines(builder, "t", 1, "Spaced");
    AddLines(builder, "b", 12, "Body");
    FrameSource const frames = [](std::uint32_t) { return FrameGeometry{200, 121, 12, 9}; };
    auto const layout = Compose(*builder.Finish(), frames, {});
    ASSERT_EQ(layout->GetFrames().size(), 2u);
    for (auto const & frame : layout->GetFrames()) {
        float last = -1;
        for (auto const & line : layout->GetLines(frame)) {
            EXPECT_GT(line.m_Baseline, last);
            last = line.m_Baseline;
            auto const text = TextOf(*layout, line);
            if (text[0] == 'a' || text[0] == 'b') {
                float const steps = (line.m_Baseline - 9) / 12;
                EXPECT_NEAR(steps, std::round(steps), 0.01) << text;
            }
        }
        EXPECT_LE(last, 121);
    }
    // Space before is dropped at the head of a frame: the heading's first baseline is its own ascent.
    EXPECT_NEAR(layout->GetLines(layout->GetFrames()[0])[0].m_Baseline, 15 * 0.75, 0.01);
}

TEST(FlowComposerTest, FactsNameTheirPlaces)
{
    StoryBuilder builder;
    AddLines(builder, "a", 4, "Body");
    AddObject(builder, MakeAnchor("alone"), "Body");
    builder.AppendObject(MakeAnchor("first"), nullptr);
    builder.AppendText("Title", nullptr);
    builder.EndParagraph(ParagraphAtts::FromStyle("Heading"));
    AddLines(builder, "b", 2, "Body");
    builder.AppendText("x", nullptr);
    builder.AppendObject(MakeCounted<IndexMarkGlyph>("Topic"), nullptr);
    builder.EndParagraph(nullptr);
    AddObject(builder, MakeAnchor("last"), "Body");
    auto const story = builder.Finish();
    auto const layout = Compose(*story, Frames(200, 60), {});
    ASSERT_EQ(Describe(*layout), "a1 a2 a3 a4|Title b1 b2 x") << "anchors take no room";

    auto const anchors = CollectAnchors(*story);
    ASSERT_EQ(anchors.size(), 3u);
    ASSERT_EQ(layout->GetAnchors().size(), 3u);
    EXPECT_EQ(anchors[1].m_Data->GetUid(), "first");
    for (auto const & place : layout->GetAnchors()) {
        EXPECT_EQ(place.m_Frame, 1u) << "an anchor without text stands where the next text stands";
    }
    EXPECT_NEAR(layout->GetAnchors()[0].m_Y, 0, 0.01);
    EXPECT_GT(layout->GetAnchors()[2].m_Y, 40);

    ASSERT_EQ(layout->GetHeadings().size(), 1u);
    auto const & heading = layout->GetHeadings()[0];
    EXPECT_EQ(layout->GetString(heading.m_Text), "Title");
    EXPECT_EQ(heading.m_Level, 2u);
    EXPECT_EQ(heading.m_Place.m_Frame, 1u);
    ASSERT_EQ(layout->GetIndexMarks().size(), 1u);
    EXPECT_EQ(layout->GetString(layout->GetIndexMarks()[0].m_Topic), "Topic");

    auto const frames = layout->GetFrames();
    EXPECT_EQ(frames[0].m_TextBegin, 0u);
    EXPECT_EQ(frames[0].m_TextEnd, 12u);
    EXPECT_EQ(frames[1].m_TextBegin, frames[0].m_TextEnd);
    EXPECT_EQ(frames[1].m_TextEnd, story->GetLength());
}

TEST(FlowComposerTest, ALinkThatBreaksOverLinesHasARectangleOnEach)
{
    auto const link = MakeCounted<GlyphAtts const>(AttSet(), HyperlinkData::ToWeb("https://example.org"));
    StoryBuilder builder;
    builder.AppendText("Before ", nullptr);
    builder.AppendText("a linked text that goes over several lines of this narrow measure", link);
    builder.AppendText(" after", nullptr);
    builder.EndParagraph(nullptr);
    auto const layout = Compose(*builder.Finish(), Frames(110, 30), {});
    auto const links = layout->GetLinks();
    ASSERT_GE(links.size(), 3u);
    std::uint32_t inFrames = 0;
    for (auto const & frame : layout->GetFrames()) {
        inFrames += frame.m_LinkCount;
        for (auto const & part : layout->GetLinks(frame)) {
            EXPECT_EQ(layout->GetHyperlink(part.m_Hyperlink)->GetPath(), "https://example.org");
            EXPECT_GE(part.m_Left, 0);
            EXPECT_LE(part.m_Right, 111);
            EXPECT_LT(part.m_Top, part.m_Bottom);
        }
    }
    EXPECT_EQ(inFrames, links.size());
    EXPECT_GT(layout->GetFrames().size(), 1u);
}

TEST(FlowComposerTest, NotesAreNumberedAndSetBehindTheText)
{
    StoryBuilder builder;
    builder.AppendText("one", nullptr);
    builder.AppendObject(MakeNote("First note", 5, false), nullptr);
    builder.AppendText(" two", nullptr);
    builder.AppendObject(MakeNote("Second note", 1, false), nullptr);
    builder.AppendText(" three", nullptr);
    builder.AppendObject(MakeNote("Third note", 20, true), nullptr);
    builder.EndParagraph(nullptr);
    auto const story = builder.Finish();

    auto const layout = Compose(*story, Frames(300, 60), {});
    EXPECT_EQ(Describe(*layout), "one5 two6 three20 Notes 5.First note 6.Second note 20.Third note");
    ASSERT_EQ(layout->GetNotes().size(), 3u);
    for (auto const & note : layout->GetNotes()) {
        EXPECT_LT(note.m_Reference.m_Y, note.m_Text.m_Y);
    }
    int forward = 0;
    int back = 0;
    for (auto const & link : layout->GetLinks()) {
        ASSERT_LT(link.m_Note, 3u);
        ++(link.m_LeadsBack ? back : forward);
    }
    EXPECT_EQ(forward, 3);
    EXPECT_EQ(back, 3);

    ComposeOptions options;
    options.m_FirstNoteNumber = 31;
    options.m_NotesHeading = "";
    EXPECT_EQ(Describe(*Compose(*story, Frames(300, 60), options)),
              "one31 two32 three20 31.First note 32.Second note 20.Third note");
    options.m_SetsNotes = false;
    EXPECT_EQ(Describe(*Compose(*story, Frames(300, 60), options)), "one31 two32 three20");
}

TEST(FlowComposerTest, PicturesShrinkToFitAndAreNeverDivided)
{
    struct Case
    {
        char const * m_Why;
        double m_Width;
        double m_Height;
        std::uint32_t m_Frame;
        double m_SetWidth;
        double m_SetHeight;
    };
    for (Case const & test : {Case{"as it is", 50, 40, 0, 50, 40}, Case{"too wide", 800, 80, 0, 200, 20},
                              Case{"too tall for what is left", 50, 80, 1, 50, 80},
                              Case{"too tall for any frame", 100, 400, 1, 30, 120}}) {
        SCOPED_TRACE(test.m_Why);
        StoryBuilder builder;
        AddLines(builder, "a", 5, "Body");
        AddObject(builder, MakePicture(test.m_Width, test.m_Height), "Body");
        AddLines(builder, "b", 1, "Body");
        auto const layout = Compose(*builder.Finish(), Frames(200, 120), {});
        auto const & frame = layout->GetFrames()[test.m_Frame];
        ASSERT_EQ(frame.m_PictureCount, 1u);
        auto const & picture = layout->GetPictures(frame)[0];
        EXPECT_NEAR(picture.m_Right - picture.m_Left, test.m_SetWidth, 0.01);
        EXPECT_NEAR(picture.m_Bottom - picture.m_Top, test.m_SetHeight, 0.01);
        EXPECT_LE(picture.m_Bottom, 120.01);
    }
}

TEST(FlowComposerTest, ACaptionStaysWithItsPicture)
{
    StoryBuilder builder;
    AddLines(builder, "a", 5, "Body");
    AddObject(builder, MakePicture(50, 55), "Body");
    AddLines(builder, "c", 1, "Caption");
    auto const layout = Compose(*builder.Finish(), Frames(200, 120), {});
    EXPECT_EQ(Describe(*layout), "a1 a2 a3 a4 a5|c1");
    EXPECT_EQ(layout->GetFrames()[1].m_PictureCount, 1u);
}

TEST(FlowComposerTest, AMissingPictureShowsAsABoxWithItsReason)
{
    PictureGlyph::Fields fields;
    fields.m_IsMissing = true;
    fields.m_MissingReason = "gone.png is missing";
    StoryBuilder builder;
    AddObject(builder, MakeCounted<PictureGlyph>(fields), "Body");
    auto const layout = Compose(*builder.Finish(), Frames(200, 120), {});
    EXPECT_EQ(Describe(*layout), "gone.png is missing");
    ASSERT_EQ(layout->GetFrames()[0].m_BoxCount, 1u);
    EXPECT_EQ(layout->GetBoxes(layout->GetFrames()[0])[0].m_Kind, LayoutItem::Box::Kind::MissingPicture);
    ASSERT_EQ(layout->GetProblems().size(), 1u);
    EXPECT_EQ(layout->GetString(layout->GetProblems()[0].m_Text), "gone.png is missing");
}

TEST(FlowComposerTest, ATableGoesOverWithItsHeader)
{
    StoryBuilder builder;
    AddLines(builder, "a", 1, "Body");
    AddObject(builder, MakeTable(7, 2, 1, 99, 0), "Body");
    AddLines(builder, "b", 1, "Body");
    // Three rows fit, the header among them.
    auto const layout = Compose(*builder.Finish(), Frames(200, 60), {});
    EXPECT_EQ(Describe(*layout), "a1 r0c0 r0c1 r1c0 r1c1 r2c0 r2c1|"
                                 "r0c0 r0c1 r3c0 r3c1 r4c0 r4c1|r0c0 r0c1 r5c0 r5c1 r6c0 r6c1 b1");
    for (auto const & frame : layout->GetFrames()) {
        for (auto const & line : layout->GetLines(frame)) {
            EXPECT_LE(line.m_Baseline, 60);
        }
    }
}

TEST(FlowComposerTest, ARowTallerThanAFrameIsDivided)
{
    StoryBuilder builder;
    AddObject(builder, MakeTable(3, 2, 0, 1, 9), "Body");
    auto const layout = Compose(*builder.Finish(), Frames(200, 60), {});
    EXPECT_EQ(Describe(*layout), "r0c0 r0c1 t1 t2 t3 r1c1|t4 t5 t6 t7|t8 t9 r2c0 r2c1");
    EXPECT_FALSE(layout->IsOverset());
}

TEST(FlowComposerTest, ATableNeverLeavesItsMeasure)
{
    struct Case
    {
        char const * m_Why;
        std::vector<std::string> m_Cells;
    };
    for (Case const & test :
         {Case{"narrow", {"a", "b"}},
          Case{"one wide column", {"short", "a cell with a long text that has to be broken into several lines here"}},
          Case{"words too long for all", {"incomprehensibilities", "internationalisation", "misunderstandings",
                                          "extraterritoriality", "counterrevolutionary"}}}) {
        SCOPED_TRACE(test.m_Why);
        TableGlyph::Fields fields;
        fields.m_Rows = 1;
        fields.m_Columns = static_cast<std::uint32_t>(test.m_Cells.size());
        for (auto const & text : test.m_Cells) {
            fields.m_Cells.push_back(OneParagraph(text, "Body"));
        }
        StoryBuilder builder;
        AddObject(builder, MakeCounted<TableGlyph>(fields), "Body");
        auto const layout = Compose(*builder.Finish(), Frames(200, 400), {});
        for (auto const & box : layout->GetBoxes(layout->GetFrames()[0])) {
            EXPECT_LE(box.m_Right, 200.1);
        }
        float const first = layout->GetLines(layout->GetFrames()[0])[0].m_Left;
        EXPECT_GE(first, 0);
    }
}

TEST(FlowComposerTest, WordsThatAreTooLongForATableCostItsColumnOfFiguresNothing)
{
    TableGlyph::Fields fields;
    fields.m_Rows = 1;
    for (char const * const text : {"incomprehensibilities-incomprehensibilities", "1000",
                                    "counterrevolutionary-counterrevolutionary-counterrevolutionary"}) {
        fields.m_Cells.push_back(OneParagraph(text, "Body"));
        ++fields.m_Columns;
    }
    StoryBuilder builder;
    AddObject(builder, MakeCounted<TableGlyph>(fields), "Body");
    auto const layout = Compose(*builder.Finish(), Frames(100, 400), {});
    std::string const lines = Describe(*layout);
    EXPECT_NE((" " + lines + " ").find(" 1000 "), std::string::npos) << lines;
}

TEST(FlowComposerTest, ATableInHebrewBeginsAtTheRight)
{
    TableGlyph::Fields fields;
    fields.m_Rows = 1;
    fields.m_Columns = 2;
    fields.m_Cells = {OneParagraph("\u05D0", "Body"), OneParagraph("12", "Body")};
    StoryBuilder builder;
    AddObject(builder, MakeCounted<TableGlyph>(fields), "Body");
    auto const layout = Compose(*builder.Finish(), Frames(200, 400), {});
    auto const lines = layout->GetLines(layout->GetFrames()[0]);
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_GT(lines[0].m_Left, lines[1].m_Left);
    EXPECT_GT(lines[0].m_Right, 180) << "the table ends at the right edge";
    EXPECT_GT(lines[1].m_Left, 100);
}

TEST(FlowComposerTest, ListsHangTheirMarkers)
{
    auto const item = [](int kind, int level, bool restart, int start) {
        auto list = MakeCounted<ListAtt>();
        list->SetKind(kind);
        list->SetLevel(level);
        list->SetName("l");
        list->SetIsRestartNumbering(restart);
        list->SetStartNumberingAt(start);
        return ParagraphAtts::FromStyle("Body", list);
    };
    StoryBuilder builder;
    auto const add = [&](char const * text, Counted<ParagraphAtts const> const & atts) {
        builder.AppendText(text, nullptr);
        builder.EndParagraph(atts);
    };
    add("a", item(ListAtt::Numbered, 0, true, 3));
    add("b", item(ListAtt::Bulleted, 1, false, 1));
    add("c", item(ListAtt::Numbered, 1, true, 1));
    add("d", item(ListAtt::Numbered, 0, false, 1));
    add("e", item(ListAtt::None, 0, false, 1));
    add("f", item(ListAtt::Numbered, 0, true, 1));
    auto const layout = Compose(*builder.Finish(), Frames(200, 400), {});
    EXPECT_EQ(Describe(*layout), "3.a \xE2\x80\xA2" "b 1.c 4.d e 1.f");
    auto const lines = layout->GetLines(layout->GetFrames()[0]);
    for (auto const & line : lines) {
        EXPECT_NEAR(line.m_Left, TextOf(*layout, line).find_first_of("bc") != std::string::npos ? 28 : 14, 0.01);
        EXPECT_GE(layout->GetRuns(line)[0].m_X, 0);
    }
}

TEST(FlowComposerTest, BackgroundsCoverTheirParagraphInEachFrame)
{
    StoryBuilder builder;
    AddLines(builder, "a", 2, "Body");
    AddLines(builder, "c", 6, "Code");
    AddLines(builder, "b", 1, "Body");
    auto const layout = Compose(*builder.Finish(), Frames(200, 72), {});
    ASSERT_EQ(layout->GetFrames().size(), 2u);
    for (auto const & frame : layout->GetFrames()) {
        ASSERT_EQ(frame.m_BoxCount, 1u);
        auto const & box = layout->GetBoxes(frame)[0];
        EXPECT_GE(box.m_Top, 0);
        EXPECT_LE(box.m_Bottom, 72.1);
        for (auto const & line : layout->GetLines(frame)) {
            bool const isCode = TextOf(*layout, line)[0] == 'c';
            EXPECT_EQ(line.m_Baseline > box.m_Top && line.m_Baseline < box.m_Bottom, isCode);
            EXPECT_NEAR(line.m_Left, isCode ? 4 : 0, 0.01);
        }
    }
}

TEST(FlowComposerTest, ClustersCoverTheTextOfTheirRun)
{
    StoryBuilder builder;
    builder.AppendText("The office fluffs \xD7\xA9\xD7\x9C\xD7\x95\xD7\x9D and \xD0\xBC\xD0\xB8\xD1\x80.", nullptr);
    builder.AppendObject(MakeNote("n", 123, false), nullptr);
    builder.AppendText(std::string(20000, 'x'), nullptr);
    builder.EndParagraph(nullptr);
    auto const layout = Compose(*builder.Finish(), Frames(200, 60), {});
    std::size_t letters = 0;
    for (auto const & frame : layout->GetFrames()) {
        for (auto const & line : layout->GetLines(frame)) {
            for (auto const & run : layout->GetRuns(line)) {
                auto const text = layout->GetText(run);
                letters += static_cast<std::size_t>(std::count(text.begin(), text.end(), u'x'));
                std::size_t const glyphs = layout->GetGlyphs(run).size();
                EXPECT_TRUE(glyphs > 0 || text.empty());
                for (auto const & glyph : layout->GetGlyphs(run)) {
                    EXPECT_LT(glyph.m_Text & LayoutItem::Glyph::ClusterMask, std::max<std::size_t>(text.size(), 1));
                }
            }
        }
    }
    EXPECT_EQ(letters, 20000u);
}

}
