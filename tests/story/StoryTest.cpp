#include "framework/story/ByteStream.h"
#include "framework/story/Delta.h"
#include "framework/story/GlyphCloneContext.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/StoryBuilder.h"
#include "framework/story/TableGlyph.h"

#include <gtest/gtest.h>

#include <random>
#include <sstream>

namespace
{

using namespace Story;
using Kernel::Counted;
using Kernel::MakeCounted;

/// "[Body]One two|[Heading]Three": paragraph styles and their text, for comparing whole stories at once.
std::string Describe(::Story::Story const & story)
{
    std::ostringstream out;
    for (std::size_t i = 0; i < story.GetParagraphs().size(); ++i) {
        auto const & paragraph = story.GetParagraphs()[i];
        auto text = story.GetString(story.GetParagraphBegin(i), paragraph.m_End).ToStd();
        bool const isOpen = text.empty() || text.back() != '\n';
        if (!isOpen) {
            text.pop_back();
        }
        out << (i ? "|" : "") << '[' << (paragraph.m_Atts ? paragraph.m_Atts->Get(ParagraphAtt::Style).ToStd() : "")
            << ']' << text << (isOpen ? "..." : "");
    }
    return out.str();
}

std::string DescribeRuns(::Story::Story const & story)
{
    std::ostringstream out;
    std::size_t begin = 0;
    for (auto const & run : story.GetGlyphRuns()) {
        out << (run.m_Atts ? run.m_Atts->Get(GlyphAtt::Style).ToStd() : "-") << ':' << run.m_End - begin << ' ';
        begin = run.m_End;
    }
    return out.str();
}

Kernel::Hash128 HashOf(::Story::Story const & story)
{
    Kernel::HashAccumulator hash;
    story.AccumulateHash(hash);
    return hash.Get128();
}

Counted<::Story::Story> MakeText(std::vector<std::pair<std::string, std::string>> const & paragraphs)
{
    StoryBuilder builder;
    for (auto const & [style, text] : paragraphs) {
        builder.AppendText(text, nullptr);
        builder.EndParagraph(ParagraphAtts::FromStyle(style));
    }
    return builder.Finish();
}

/// A story with one of everything, two notes deep.
Counted<::Story::Story> MakeRichStory()
{
    auto const strong = GlyphAtts::FromStyle("Strong");
    auto const link = MakeCounted<GlyphAtts const>(AttSet(), HyperlinkData::ToAnchor("uid-7", "other.md#seven"));
    StoryBuilder note;
    note.AppendText("See there, and ", nullptr);
    note.AppendText("here", link);
    note.EndParagraph(ParagraphAtts::FromStyle("Note text"));

    TableGlyph::Fields table;
    table.m_Rows = 2;
    table.m_Columns = 2;
    table.m_HeaderRows = 1;
    table.m_Alignments = {ParagraphAtt::Left, ParagraphAtt::Right};
    table.m_Cells = {MakeText({{"Cell", "a"}}), nullptr, MakeText({{"Cell", "c"}}), MakeText({{"Cell", "d"}})};
    PictureGlyph::Fields picture;
    picture.m_DataId = "pic1";
    picture.m_NaturalWidth = 300;
    picture.m_NaturalHeight = 200;

    auto list = MakeCounted<ListAtt>();
    list->SetKind(ListAtt::Numbered);
    list->SetName("steps");
    list->SetStartNumberingAt(4);

    StoryBuilder builder;
    builder.AppendObject(MakeCounted<AnchorGlyph>(MakeCounted<AnchorData>("Intro", true, true, "uid-1", 1)), nullptr);
    builder.AppendText("Introduction", nullptr);
    builder.EndParagraph(ParagraphAtts::FromStyle("Heading 1"));
    builder.AppendText("Plain and ", nullptr);
    builder.AppendText("strong", strong);
    builder.AppendObject(MakeCounted<PinnoteGlyph>(MakeCounted<NoteAtt const>(), note.Finish()), nullptr);
    builder.AppendObject(MakeCounted<IndexMarkGlyph>("Topic"), nullptr);
    builder.AppendText(" linked", link);
    builder.EndParagraph(ParagraphAtts::FromStyle("Body", list));
    builder.AppendObject(MakeCounted<TableGlyph>(table), nullptr);
    builder.EndParagraph(nullptr);
    builder.AppendObject(MakeCounted<PictureGlyph>(picture), nullptr);
    builder.EndParagraph(nullptr);
    builder.AppendObject(MakeCounted<FieldGlyph>(FieldGlyph::Kind::PageNumber, ""), nullptr);
    builder.AppendObject(MakeCounted<RuleGlyph>(), nullptr);
    builder.AppendText("open end", nullptr);
    return builder.Finish();
}

TEST(StoryBuilderTest, SharesEqualAttributesAndCleansItsInput)
{
    StoryBuilder builder;
    for (int i = 0; i < 3; ++i) {
        builder.AppendText("x", GlyphAtts::FromStyle("Code"));
    }
    builder.AppendText("a\nb\x01" "c\xEF\xBF\xBC\xFF\t", nullptr);
    builder.EndParagraph(ParagraphAtts::FromStyle("Body"));
    builder.EndParagraph(ParagraphAtts::FromStyle("Body"));
    auto const story = builder.Finish();

    EXPECT_EQ(Describe(*story), "[Body]xxxa bc\xEF\xBF\xBD\xEF\xBF\xBD\t|[Body]");
    EXPECT_EQ(DescribeRuns(*story), "Code:3 -:9 ");
    EXPECT_EQ(story->GetParagraphs()[0].m_Atts, story->GetParagraphs()[1].m_Atts);
    EXPECT_TRUE(builder.Finish()->Empty());
}

TEST(StoryTest, ReplacingTextKeepsTheAttributesOfThePartWithTheParagraphEnd)
{
    struct Case
    {
        char const * m_Why;
        std::size_t m_Begin;
        std::size_t m_End;
        std::vector<std::pair<std::string, std::string>> m_Insert;
        char const * m_Expected;
    };
    Case const cases[] = {
        {"nothing changes", 2, 2, {}, "[A]One|[B]Two|[C]Three"},
        {"joined paragraphs take the later attributes", 3, 4, {}, "[B]OneTwo|[C]Three"},
        {"an inserted paragraph end splits", 5, 5, {{"N", "x"}}, "[A]One|[N]Tx|[B]wo|[C]Three"},
        {"a whole paragraph goes", 4, 8, {}, "[A]One|[C]Three"},
        {"all goes", 0, 14, {}, ""},
        {"at the end", 14, 14, {{"N", "x"}}, "[A]One|[B]Two|[C]Three|[N]x"},
        {"the last end goes", 13, 14, {}, "[A]One|[B]Two|[C]Three..."},
    };
    for (Case const & test : cases) {
        SCOPED_TRACE(test.m_Why);
        auto const story = MakeText({{"A", "One"}, {"B", "Two"}, {"C", "Three"}});
        GlyphCloneContext context(false);
        story->ReplaceText(test.m_Begin, test.m_End, *MakeText(test.m_Insert), context);
        EXPECT_EQ(Describe(*story), test.m_Expected);
    }
}

TEST(StoryTest, AppendingAStretchOfItselfOrOfAnotherStoryCopiesElementsThroughTheContext)
{
    auto const story = MakeRichStory();
    auto const anchorOf = [](::Story::Story const & text, std::size_t i) {
        return dynamic_cast<AnchorGlyph const &>(*text.GetObjects()[i].m_Glyph).GetAnchorData();
    };
    for (bool const newIdentities : {false, true}) {
        GlyphCloneContext context(newIdentities);
        auto copy = MakeText({{"A", "Before"}});
        copy->AppendText(story->GetAll(), context);
        EXPECT_EQ(copy->GetObjects().size(), story->GetObjects().size());
        EXPECT_EQ(anchorOf(*copy, 0)->GetUid() == "uid-1", !newIdentities);
        EXPECT_NE(anchorOf(*copy, 0), anchorOf(*story, 0)) << "a copy is a place of its own";
    }
    GlyphCloneContext context(false);
    auto const text = MakeText({{"A", "One"}});
    text->AppendText(text->GetAll(), context);
    EXPECT_EQ(Describe(*text), "[A]One|[A]One");

    GlyphString end;
    end.AddChar32('\n');
    ::Story::Story collated;
    collated.AppendText(end, nullptr, nullptr);
    EXPECT_EQ(Describe(collated), "[]");
}

TEST(StoryTest, FormattingTouchesTheStretchAndTheParagraphsThatItMeets)
{
    auto const story = MakeText({{"A", "One"}, {"B", "Two"}, {"C", "Three"}});
    Delta::Fields fields;
    fields.m_GlyphAtts.SetString(GlyphAtt::Style, "Strong");
    fields.m_ParagraphAtts.SetInt(ParagraphAtt::KeepWithNext, 1);
    Counted<Delta const> const delta = MakeCounted<Delta const>(fields);
    story->FormatText(delta, 1, 5);
    EXPECT_EQ(DescribeRuns(*story), "-:1 Strong:4 -:9 ");
    EXPECT_EQ(story->GetParagraphs()[0].m_Atts->Get(ParagraphAtt::KeepWithNext, 0), 1);
    EXPECT_EQ(story->GetParagraphs()[1].m_Atts->Get(ParagraphAtt::KeepWithNext, 0), 1);
    EXPECT_EQ(story->GetParagraphs()[2].m_Atts->Get(ParagraphAtt::KeepWithNext, 0), 0);

    story->FormatText(MakeDelta(ParagraphAtt::CollatedEndnotes, 1, false));
    for (auto const & paragraph : story->GetParagraphs()) {
        EXPECT_EQ(paragraph.m_Atts->Get(ParagraphAtt::CollatedEndnotes, 0), 1);
    }
}

TEST(StoryTest, AListDeltaChangesOnlyItsFieldsOfListItems)
{
    auto const story = MakeRichStory();
    auto change = MakeCounted<ListAtt>();
    change->SetName("not taken over");
    change->SetIsRestartNumbering(true);
    change->SetStartNumberingAt(9);
    story->FormatText(MakeCounted<ListAttDelta>(change, static_cast<ListAttFields>(4608), false));
    auto const item = story->GetParagraphs()[1].m_Atts->GetListAtt();
    EXPECT_EQ(item->GetName(), "steps");
    EXPECT_TRUE(item->IsRestartNumbering());
    EXPECT_EQ(item->GetStartNumberingAt(), 9);
    EXPECT_FALSE(story->GetParagraphs()[0].m_Atts->GetListAtt());
}

TEST(StoryPosTest, WalksParagraphsAndFindsElements)
{
    auto const story = MakeText({{"A", "One"}, {"B", ""}, {"C", "Three"}});
    std::vector<std::size_t> begins;
    for (StoryPos pos = story->gbegin(); pos < story->gend(false); ++pos) {
        if (pos.IsParagraphBegin()) {
            begins.push_back(pos.GetOffset());
            EXPECT_EQ(pos.GetParagraphAtts()->Get(ParagraphAtt::Style), begins.size() == 1   ? "A"
                                                                        : begins.size() == 2 ? "B"
                                                                                             : "C");
        }
        pos = pos.GetParagraphEnd(false);
    }
    EXPECT_EQ(begins, (std::vector<std::size_t>{0, 4, 5}));
    EXPECT_EQ(story->gbegin().GetParagraphEnd(true).GetOffset(), 4u);
    EXPECT_EQ(story->gbegin().GetParagraphEnd(StoryPos(*story, 2), true).GetOffset(), 2u);

    auto const rich = MakeRichStory();
    std::vector<StoryPos> notes;
    rich->gbegin().BaseCollectIf(notes, rich->gend(false), IsNoteReferenceGlyph());
    ASSERT_EQ(notes.size(), 1u);
    EXPECT_EQ(GetNoteAtt(notes[0].GetGlyph())->GetKind(), NoteAtt::Endnote);
    notes.clear();
    rich->gbegin().BaseCollectIf(notes, rich->GetAll().m_Begin, IsNoteReferenceGlyph());
    EXPECT_TRUE(notes.empty());
}

TEST(StorySerialisationTest, ComesBackWithEverything)
{
    auto const story = MakeRichStory();
    ByteWriter out;
    story->SaveBytes(out);
    ByteReader in(out.GetBytes());
    ::Story::Story loaded;
    ASSERT_TRUE(loaded.LoadBytes(in));
    EXPECT_TRUE(in.IsComplete());
    EXPECT_EQ(Describe(loaded), Describe(*story));
    EXPECT_EQ(DescribeRuns(loaded), DescribeRuns(*story));
    EXPECT_EQ(HashOf(loaded), HashOf(*story));
    ByteWriter again;
    loaded.SaveBytes(again);
    EXPECT_EQ(again.GetBytes(), out.GetBytes());
    auto const & anchor = dynamic_cast<AnchorGlyph const &>(*loaded.GetObjects()[0].m_Glyph);
    EXPECT_EQ(anchor.GetAnchorData()->GetUid(), "uid-1");
    EXPECT_EQ(anchor.GetAnchorData()->GetLevel(), 1);
}

TEST(StorySerialisationTest, DamagedBytesAreRefusedAndNeverHarm)
{
    auto const story = MakeRichStory();
    ByteWriter out;
    story->SaveBytes(out);
    auto const good = out.GetBytes();
    std::mt19937 random(7);
    std::size_t refused = 0;
    for (std::size_t i = 0; i < 20000; ++i) {
        auto bad = good;
        if (i < good.size()) {
            bad.resize(i);
        } else {
            for (int n = 0; n < 1 + static_cast<int>(random() % 3); ++n) {
                bad[random() % bad.size()] = static_cast<std::byte>(random());
            }
        }
        ByteReader in(bad);
        ::Story::Story loaded;
        if (!loaded.LoadBytes(in)) {
            ++refused;
            EXPECT_TRUE(loaded.Empty());
        } else {
            static_cast<void>(HashOf(loaded));
        }
    }
    EXPECT_GT(refused, good.size()) << "every truncation and many a changed byte";
}

TEST(StoryTest, HashFollowsContentAndNotSharing)
{
    auto const base = MakeRichStory();
    EXPECT_EQ(HashOf(*base), HashOf(*MakeRichStory()));
    auto const changed = [&](auto const & change) {
        auto const copy = base->Clone();
        change(*copy);
        return HashOf(*copy);
    };
    GlyphCloneContext context(false);
    EXPECT_NE(HashOf(*base), changed([&](::Story::Story & s) { s.ReplaceText(3, 4, *MakeText({}), context); }));
    EXPECT_NE(HashOf(*base),
              changed([&](::Story::Story & s) { s.FormatText(MakeDelta(ParagraphAtt::KeepWithNext, 1, false), 0, 1); }));
    EXPECT_EQ(HashOf(*base), changed([&](::Story::Story & s) {
                  dynamic_cast<AnchorGlyph const &>(*s.GetObjects()[0].m_Glyph).GetAnchorData()->SetUid("new");
              }))
        << "a uid that is given later moves nothing";
}

TEST(ListAttTest, FormatsNumbers)
{
    using Format = ListAtt::NumberFormat;
    struct Case
    {
        int m_Number;
        Format m_Format;
        char const * m_Text;
    };
    for (Case const & test : {Case{7, Format::Decimal, "7"}, Case{-3, Format::LowerRoman, "-3"},
                              Case{26, Format::LowerLetter, "z"}, Case{27, Format::LowerLetter, "aa"},
                              Case{703, Format::UpperLetter, "AAA"}, Case{1994, Format::UpperRoman, "MCMXCIV"},
                              Case{4000, Format::LowerRoman, "4000"}, Case{0, Format::LowerLetter, "0"}}) {
        EXPECT_EQ(FormatNumber(test.m_Number, test.m_Format), test.m_Text);
    }
}

}
