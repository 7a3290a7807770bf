#include "framework/kernel/Geometry.h"
#include "framework/story/ByteStream.h"
#include "story/FlowFixture.h"

#include <gtest/gtest.h>

#include <limits>
#include <random>

namespace
{

using namespace FlowTest;
using namespace Story;

Counted<::Story::Story> MakeMixedStory()
{
    StoryBuilder builder;
    auto const prose = [&](int count) {
        for (int i = 0; i < count; ++i) {
            builder.AppendText("Some ordinary prose, word after word, with officers and ", nullptr);
            builder.AppendText("links", MakeCounted<GlyphAtts const>(AttSet(), HyperlinkData::ToWeb("x")));
        }
    };
    prose(3);
    builder.AppendObject(MakeNote("A note.", 1, false), nullptr);
    builder.EndParagraph(ParagraphAtts::FromStyle("Body"));
    AddLines(builder, "h", 1, "Heading");
    AddObject(builder, MakePicture(300, 200), "Picture");
    AddLines(builder, "c", 2, "Caption");
    builder.AppendText("inline ", nullptr);
    builder.AppendObject(MakePicture(30, 900), nullptr);
    builder.EndParagraph(nullptr);
    AddObject(builder, MakeTable(4, 3, 1, 2, 7), "Body");
    AddObject(builder, MakeTable(2, 2, 2, 99, 0), "Body");
    AddLines(builder, "k", 5, "Code");
    AddObject(builder, MakeCounted<RuleGlyph>(), "Body");
    AddObject(builder, MakeAnchor("end"), "Body");
    builder.AppendText(std::string(300, 'w'), nullptr);
    prose(2);
    return builder.Finish();
}

/// Letters of the main text and the notes, without spaces: what has to come out whatever the geometry.
std::size_t CountLetters(Layout const & layout, char16_t letter)
{
    std::size_t count = 0;
    for (auto const & frame : layout.GetFrames()) {
        for (auto const & line : layout.GetLines(frame)) {
            for (auto const & run : layout.GetRuns(line)) {
                auto const text = layout.GetText(run);
                count += static_cast<std::size_t>(std::count(text.begin(), text.end(), letter));
            }
        }
    }
    return count;
}

TEST(FlowTerminationTest, EveryGeometryEndsAndLosesNoText)
{
    auto const story = MakeMixedStory();
    auto const usual = Compose(*story, Frames(300, 500), {});
    auto const expected = CountLetters(*usual, u'w');
    ASSERT_GT(expected, 300u);
    double const nan = std::numeric_limits<double>::quiet_NaN();
    double const infinite = std::numeric_limits<double>::infinity();
    for (auto const & size : std::vector<Kernel::Size>{{300, 20}, {300, 1}, {300, 0}, {300, -5}, {12, 500}, {1, 30},
                                                       {0, 0}, {-10, 50}, {nan, nan}, {infinite, infinite},
                                                       {300, 1e9}, {1e9, 100}}) {
        SCOPED_TRACE(testing::Message() << size.width << " x " << size.height);
        for (double const grid : {0.0, 12.0, 1e6, nan}) {
            FrameSource const frames = [&](std::uint32_t) { return FrameGeometry{size.width, size.height, grid, 10}; };
            auto const layout = Compose(*story, frames, {});
            EXPECT_FALSE(layout->IsOverset());
            EXPECT_EQ(CountLetters(*layout, u'w'), expected);
            std::uint32_t end = 0;
            for (auto const & frame : layout->GetFrames()) {
                EXPECT_EQ(frame.m_TextBegin, end);
                end = frame.m_TextEnd;
            }
            EXPECT_EQ(end, story->GetLength());
        }
    }
}

TEST(FlowTerminationTest, FramesOfChangingSizeLoseNoText)
{
    auto const story = MakeMixedStory();
    auto const expected = CountLetters(*Compose(*story, Frames(300, 500), {}), u'w');
    std::mt19937 random(11);
    for (int round = 0; round < 20; ++round) {
        FrameSource const frames = [&](std::uint32_t) {
            return FrameGeometry{40.0 + random() % 300, 20.0 + random() % 300, 0, 0};
        };
        auto const layout = Compose(*story, frames, {});
        EXPECT_EQ(CountLetters(*layout, u'w'), expected) << round;
        EXPECT_TRUE(layout->GetAnchors()[0].IsPlaced());
        EXPECT_EQ(layout->GetHeadings().size(), 1u);
    }
}

TEST(FlowTerminationTest, TextBehindTheLastFrameIsOverset)
{
    StoryBuilder builder;
    AddLines(builder, "a", 9, "Body");
    AddObject(builder, MakeAnchor("x"), "Body");
    AddLines(builder, "b", 1, "Body");
    auto const story = builder.Finish();
    FrameSource const two = [](std::uint32_t number) {
        return number < 2 ? std::optional(FrameGeometry{200, 36, 0, 0}) : std::nullopt;
    };
    auto const layout = Compose(*story, two, {});
    EXPECT_TRUE(layout->IsOverset());
    EXPECT_EQ(Describe(*layout), "a1 a2 a3|a4 a5 a6");
    EXPECT_FALSE(layout->GetAnchors()[0].IsPlaced());
    ASSERT_EQ(layout->GetProblems().size(), 1u);
    EXPECT_EQ(layout->GetProblems()[0].m_StoryOffset, 18u);

    ComposeOptions options;
    options.m_MaximumFrames = 1;
    EXPECT_EQ(Compose(*story, Frames(200, 36), options)->GetFrames().size(), 1u);
    std::atomic<bool> const abort = true;
    options.m_Abort = &abort;
    EXPECT_FALSE(Compose(*story, Frames(200, 36), options));
}

TEST(FlowTerminationTest, AnEmptyStoryHasOneEmptyFrame)
{
    auto const layout = Compose(::Story::Story(), Frames(200, 36), {});
    ASSERT_EQ(layout->GetFrames().size(), 1u);
    EXPECT_EQ(layout->GetFrames()[0].m_LineCount, 0u);
}

struct SavedLayout
{
    std::vector<std::byte> m_Facts;
    std::shared_ptr<std::vector<std::byte>> m_Glyphs;
};

SavedLayout Save(Layout const & layout)
{
    ByteWriter facts;
    ByteWriter glyphs;
    layout.SaveFacts(facts);
    layout.SaveGlyphData(glyphs);
    return {facts.TakeBytes(), std::make_shared<std::vector<std::byte>>(glyphs.TakeBytes())};
}

TEST(LayoutTest, TheSameTextGivesTheSameBytesWhateverWasSetBefore)
{
    auto const story = MakeMixedStory();
    auto const styles = MakeStyles();
    FlowComposer composer;
    auto const first = Save(*composer.Compose(*story, *styles, Frames(250, 300), {}));
    static_cast<void>(composer.Compose(*story, *styles, Frames(100, 100), {}));
    auto const again = Save(*composer.Compose(*story, *styles, Frames(250, 300), {}));
    EXPECT_EQ(first.m_Facts, again.m_Facts);
    EXPECT_EQ(*first.m_Glyphs, *again.m_Glyphs);
}

TEST(LayoutTest, ComesBackInTwoParts)
{
    auto const story = MakeMixedStory();
    auto const layout = Compose(*story, Frames(250, 300), {});
    auto const saved = Save(*layout);
    ByteReader in(saved.m_Facts);
    auto const loaded = Layout::LoadFacts(in);
    ASSERT_TRUE(loaded);
    EXPECT_FALSE(loaded->HasGlyphData());
    EXPECT_EQ(loaded->GetFrames().size(), layout->GetFrames().size());
    EXPECT_EQ(loaded->GetNotes().size(), 1u);
    ASSERT_TRUE(loaded->LoadGlyphData(saved.m_Glyphs, *saved.m_Glyphs));
    ASSERT_TRUE(loaded->LoadFonts());
    EXPECT_EQ(Describe(*loaded), Describe(*layout));
    auto const again = Save(*loaded);
    EXPECT_EQ(again.m_Facts, saved.m_Facts);
    EXPECT_EQ(*again.m_Glyphs, *saved.m_Glyphs);
}

TEST(LayoutTest, DamageIsFoundOnLoading)
{
    auto const layout = Compose(*MakeMixedStory(), Frames(250, 300), {});
    auto const saved = Save(*layout);
    std::mt19937 random(5);
    for (int i = 0; i < 3000; ++i) {
        auto facts = saved.m_Facts;
        auto glyphs = std::make_shared<std::vector<std::byte>>(*saved.m_Glyphs);
        if (i % 3 == 0) {
            facts.resize(random() % facts.size());
        } else if (i % 3 == 1) {
            glyphs->resize(random() % glyphs->size());
        }
        for (int n = 0; n < 4; ++n) {
            if (!facts.empty()) {
                facts[random() % facts.size()] = static_cast<std::byte>(random());
            }
            if (!glyphs->empty()) {
                (*glyphs)[random() % glyphs->size()] = static_cast<std::byte>(random());
            }
        }
        ByteReader in(facts);
        auto const loaded = Layout::LoadFacts(in);
        if (loaded && loaded->LoadGlyphData(glyphs, *glyphs)) {
            // What was accepted can be walked: every index is in range.
            static_cast<void>(Describe(*loaded));
        }
        if (i % 3 == 1 && loaded) {
            EXPECT_FALSE(loaded->HasGlyphData()) << "a cut block is refused";
        }
    }
}

}
