#include "PageWriter.h"

using namespace Renderer;
using namespace Renderer::RenderTree;

namespace
{

DisplayList Word(std::u16string_view text)
{
    DisplayList list;
    DrawText(list, Garamond(), 12, {20, 40}, text, 0);
    return list;
}

Kernel::Counted<PdfBookmark> Bookmark(char const * title, int page, Kernel::Counted<PdfBookmark const> parent)
{
    Kernel::Counted<PdfBookmark> bookmark = Kernel::MakeCounted<PdfBookmark>();
    bookmark->m_Title = title;
    bookmark->m_Page = page;
    bookmark->m_Parent = std::move(parent);
    return bookmark;
}

TEST(PdfExportTest, BoxesAreMirroredIntoPdfCoordinates)
{
    PageWriter writer;
    PdfPage page;
    // A right-hand page of a spread, 200 by 300 with 10 of bleed, inside of a sheet.
    page.m_Boxes.m_Media = {170, -30, 430, 330};
    page.m_Boxes.m_Bleed = {190, -10, 410, 310};
    page.m_Boxes.m_Trim = {200, 0, 400, 300};
    writer.Write(Word(u"x"), page, {});
    PdfProbe & probe = writer.Probe();
    EXPECT_EQ(probe.Value("1/MediaBox"), "[ 0 0 260 360 ]");
    EXPECT_EQ(probe.Value("1/BleedBox"), "[ 20 20 240 340 ]");
    EXPECT_EQ(probe.Value("1/TrimBox"), "[ 30 30 230 330 ]");
    EXPECT_EQ(probe.Value("1/CropBox"), "null");
}

TEST(PdfExportTest, MarksStandOutsideOfTheBleed)
{
    PrintersMarksOptions options;
    options.m_CropMarks = true;
    options.m_RegistrationMarks = true;
    options.m_Offset = 10;
    options.m_Length = 14;
    Kernel::Counted<PrintersMarksHelper> helper = Kernel::MakeCounted<PrintersMarksHelper>(PageWriter::Page, nullptr);
    helper->SetOptions(options);
    helper->SetIsIncludeBleed(true);
    PdfPage page;
    page.m_Boxes = helper->GetBoxes({9, 9, 9, 9});
    page.m_PrintersMarks = helper;
    EXPECT_EQ(page.m_Boxes.m_Media, (Kernel::Rect{-24, -24, 324, 424}));
    PageWriter writer;
    writer.Write(DisplayList(), page, {});
    PdfProbe::Image const image = writer.Probe().Draw(1);
    auto const dark = [&](int x, int y) { return (image.At(x, y) & 0xFF) < 0xC0; };
    int inside = 0;
    int outside = 0;
    for (int y = 0; y < image.m_Height; ++y) {
        for (int x = 0; x < image.m_Width; ++x) {
            bool const bleed = x >= 15 && x < 24 + 300 + 9 && y >= 15 && y < 24 + 400 + 9;
            (bleed ? inside : outside) += dark(x, y);
        }
    }
    EXPECT_EQ(inside, 0);
    EXPECT_GT(outside, 50);
}

TEST(PdfExportTest, LinksLeadForwardBackwardAndOut)
{
    PageWriter writer;
    Kernel::Counted<PrintersMarksHelper> frame =
        Kernel::MakeCounted<PrintersMarksHelper>(Kernel::Rect{0, 0, 300, 400}, nullptr);
    auto const link = [](int kind, int page, char const * target, Kernel::Point position, double top) {
        PdfHyperlink hyperlink;
        hyperlink.m_Kind = kind;
        hyperlink.m_Page = page;
        hyperlink.m_Target = target;
        hyperlink.m_Position = position;
        hyperlink.m_Rect = {10, top, 110, top + 20};
        return hyperlink;
    };
    std::vector<PdfHyperlink> links = {
        link(PdfHyperlink::Position, 3, "", {50, 100}, 0),
        link(PdfHyperlink::Page, 1, "", {}, 20),
        link(PdfHyperlink::Resource, 0, "https://example.org/ä b?q=(1)", {}, 40),
        link(PdfHyperlink::OtherPdf, 0, "other.pdf", {}, 60),
        link(PdfHyperlink::Page, 9, "", {}, 80),
        link(PdfHyperlink::Position, 3, "", {350, 100}, 100),
    };
    // The first position counts from a frame at the origin, the last in the target page's own coordinates.
    links[0].m_PrintersMarks = frame;
    PdfPage page;
    page.m_Boxes = PageBoxes::Plain(PageWriter::Page);
    PdfPage right = page;
    right.m_Boxes = PageBoxes::Plain({300, 0, 600, 400});
    writer.Write(Word(u"one"), page, {});
    writer.Write(Word(u"two"), page, links);
    writer.Write(Word(u"three"), right, {});
    EXPECT_EQ(writer.Probe().Links(2), "10 380 110 400 -> page 3 (50, 300)\n"
                                       "10 360 110 380 -> page 1 (0, 400)\n"
                                       "10 340 110 360 -> https://example.org/%C3%A4%20b?q=(1)\n"
                                       "10 320 110 340 -> file other.pdf\n"
                                       "10 280 110 300 -> page 3 (50, 300)\n");
    EXPECT_EQ(writer.Probe().Links(1), "");
}

TEST(PdfExportTest, APlaceOnALaterPageOfASpreadIsFoundFromTheSpreadsFirstPage)
{
    PageWriter writer;
    PdfPage alone;
    alone.m_Boxes = PageBoxes::Plain(PageWriter::Page);
    PdfPage beside = alone;
    beside.m_ContinuesSpread = PdfPage::Continues::Beside;
    PdfPage below = alone;
    below.m_ContinuesSpread = PdfPage::Continues::Below;
    auto const link = [](int page, Kernel::Point position) {
        PdfHyperlink hyperlink;
        hyperlink.m_Kind = PdfHyperlink::Position;
        hyperlink.m_Page = page;
        hyperlink.m_Position = position;
        hyperlink.m_Rect = {10, 0, 110, 20};
        return hyperlink;
    };
    std::vector<PdfHyperlink> const links = {
        link(1, {350, 100}), // Page 2 is beside page 1.
        link(1, {50, 100}),  // The first page itself.
        link(3, {350, 100}), // Page 4 is below page 3: too far right is no reason to go there.
        link(3, {50, 450}),
        link(4, {350, 450}), // Nothing follows: clipped by no one, as it stands.
    };
    writer.Write(Word(u"left"), alone, links);
    writer.Write(Word(u"right"), beside, {});
    writer.Write(Word(u"upper"), alone, {});
    writer.Write(Word(u"lower"), below, {});
    EXPECT_EQ(writer.Probe().Links(1), "10 380 110 400 -> page 2 (50, 300)\n"
                                       "10 380 110 400 -> page 1 (50, 300)\n"
                                       "10 380 110 400 -> page 3 (350, 300)\n"
                                       "10 380 110 400 -> page 4 (50, 350)\n"
                                       "10 380 110 400 -> page 4 (350, -50)\n");
}

TEST(PdfExportTest, TheOutlineKeepsItsTreeAndShowsTheAskedLevels)
{
    PageWriter writer;
    writer.m_Settings.m_OpenBookmarkLevels = 1;
    for (int i = 0; i < 3; ++i) {
        writer.Write(Word(u"x"));
    }
    auto const first = Bookmark("Chapter 1 \xC3\xA4", 1, nullptr);
    auto const section = Bookmark("Section", 2, first);
    auto const gone = Bookmark("", 2, nullptr);
    writer.GetExport().AddBookmarks({first, section, Bookmark("Deep", 2, section), Bookmark("Other", 2, first)});
    writer.GetExport().AddBookmarks({Bookmark("Chapter 2", 3, nullptr), Bookmark("Child of one left out", 3, gone),
                                     Bookmark("No page", 0, nullptr)});
    EXPECT_EQ(writer.Probe().Outline(), "+Chapter 1 \xC3\xA4 -> page 1 (0, 400)\n"
                                        "  Section -> page 2 (0, 400)\n"
                                        "    Deep -> page 2 (0, 400)\n"
                                        "  Other -> page 2 (0, 400)\n"
                                        "Chapter 2 -> page 3 (0, 400)\n"
                                        "Child of one left out -> page 3 (0, 400)\n"
                                        "No page -> nowhere\n");
    // Five entries at the top or below an open one.
    EXPECT_EQ(writer.Probe().Value("Outlines/Count"), "6");
    EXPECT_EQ(writer.Probe().Value("Outlines/First/First/Count"), "-1");
}

TEST(PdfExportTest, LabelsAreThePrintedFolios)
{
    PageWriter writer;
    std::vector<std::string> const folios = {"", "i", "ii", "iii", "1", "2", "A-9", "A-10", "c", "XI", "XII", "iv"};
    for (std::string const & folio : folios) {
        PdfPage page;
        page.m_Boxes = PageBoxes::Plain(PageWriter::Page);
        page.m_Label = folio;
        writer.Write(Word(u"x"), page, {});
    }
    EXPECT_EQ(writer.Probe().Labels(), folios);
}

TEST(PdfExportTest, TheFileSaysWhatItIs)
{
    PageWriter writer;
    writer.m_Title = "Caf\xC3\xA9 & <more>";
    writer.m_Settings.m_Language = "de-AT";
    writer.Write(Word(u"x"));
    PdfProbe & probe = writer.Probe();
    EXPECT_EQ(probe.Value("Lang"), "(de-AT)");
    EXPECT_EQ(probe.Value("ViewerPreferences/DisplayDocTitle"), "true");
    EXPECT_EQ(probe.Value("OutputIntents/0/OutputConditionIdentifier"), "(sRGB IEC61966-2.1)");
    std::string const packet = probe.Stream("Metadata");
    EXPECT_NE(packet.find("id=\"W5M0MpCehiHzreSzNTczkc9d\""), std::string::npos);
    EXPECT_NE(packet.find("Caf\xC3\xA9 &amp; &lt;more&gt;"), std::string::npos);
    EXPECT_NE(packet.find("<xmp:MetadataDate>2023-11-14T22:13:20Z<"), std::string::npos);
    EXPECT_NE(packet.find("<rdf:li>one</rdf:li><rdf:li>two</rdf:li>"), std::string::npos);
    EXPECT_NE(packet.find(std::string(63, ' ') + "\n<?xpacket end=\"w\"?>"), std::string::npos);
    // Legible in the file itself, and the only one there.
    std::string const file = writer.Finish();
    EXPECT_NE(file.find(packet), std::string::npos);
}

TEST(PdfExportTest, TheSameBookGivesTheSameBytes)
{
    auto const make = [] {
        PageWriter writer;
        for (int i = 0; i < 40; ++i) {
            DisplayList list = Word(u"page after page");
            DrawText(list, Liberation(), 9, {20, 80.0 + i}, u"more", 0);
            writer.Write(list);
        }
        return writer.Finish();
    };
    EXPECT_EQ(make(), make());
}

TEST(PdfExportTest, OpacityDrawsAGroupAsOnePicture)
{
    PageWriter writer;
    DisplayList list;
    Group group;
    group.m_Opacity = 0.5;
    group.m_Clip = Path::Rectangle({0, 0, 150, 400});
    group.m_Transform = Raster::AffineTransform::Params::Translation(10, 20);
    list.BeginGroup(group);
    list.FillRect({0, 0, 50, 50}, Raster::Colour::Rgb(1, 0, 0));
    list.FillRect({25, 0, 75, 50}, Raster::Colour::Rgb(1, 0, 0));
    list.FillRect({100, 0, 200, 50}, Raster::Colour::Rgb(0, 0, 1));
    list.EndGroup();
    list.FillRect({10, 100, 60, 150}, Raster::Colour::Rgb(0, 1, 0, 0.25F));
    writer.Write(list);
    PdfProbe::Image const image = writer.Probe().Draw(1);
    EXPECT_EQ(image.At(20, 40) & 0xFF, image.At(50, 40) & 0xFF) << "the overlap is no darker";
    EXPECT_NEAR(static_cast<int>(image.At(20, 40) & 0xFF), 128, 2);
    EXPECT_NEAR(static_cast<int>(image.At(120, 40) >> 16), 128, 2);
    EXPECT_EQ(image.At(170, 40), 0xFFFFFFU) << "clipped";
    EXPECT_NEAR(static_cast<int>(image.At(30, 120) & 0xFF), 191, 2);
    EXPECT_EQ(image.At(30, 200), 0xFFFFFFU);
}

TEST(PdfExportTest, ColoursGoIntoTheDocumentsSpaceOnce)
{
    struct Row
    {
        Raster::Format m_Format;
        Raster::Colour m_Colour;
        char const * m_Operator;
    };
    Row const rows[] = {
        {Raster::Format::Rgba8, Raster::Colour::Rgb(1, 0.5F, 0), "1 0.5 0 rg\n"},
        {Raster::Format::Rgba8, Raster::Colour::Grey(0.5F), "0.5 g\n"},
        {Raster::Format::Cmyka8, Raster::Colour::Cmyk(0.1F, 0.2F, 0.3F, 0.4F), "0.1 0.2 0.3 0.4 k\n"},
        // Black text stays one ink.
        {Raster::Format::Cmyka8, Raster::Colour::Grey(0), "0 0 0 1 k\n"},
        {Raster::Format::GreyAlpha8, Raster::Colour::Rgb(1, 1, 1), "1 g\n"},
        {Raster::Format::Laba16, Raster::Colour::Lab(50, 20, -30), "/Lab cs 50 20 -30 sc\n"},
    };
    for (Row const & row : rows) {
        PageWriter writer;
        writer.m_Format = row.m_Format;
        DisplayList list;
        list.FillRect({0, 0, 10, 10}, row.m_Colour);
        writer.Write(list);
        EXPECT_EQ(writer.Probe().Content(1), std::string(row.m_Operator) + "0 390 10 10 re f\n");
    }
}

TEST(PdfExportTest, CmykOutputNamesItsPrintingCondition)
{
    PageWriter writer;
    writer.m_Format = Raster::Format::Cmyka8;
    writer.Write(Word(u"x"));
    EXPECT_EQ(writer.Probe().Value("OutputIntents/0/OutputConditionIdentifier"), "(FOGRA39)");
    EXPECT_EQ(writer.Probe().Value("OutputIntents/0/DestOutputProfile/N"), "4");
}

TEST(PdfExportTest, AFailedOrStoppedExportSaysSoAndWritesNothingMore)
{
    class FullStream : public Kernel::OutStream
    {
    public:
        void Write(void const *, std::size_t) override { throw std::runtime_error("No space is left on the disk."); }
        [[nodiscard]] std::uint64_t GetPosition() const override { return 0; }
    };
    bool abort = false;
    Kernel::Counted<PdfSchema> const schema =
        Kernel::MakeCounted<PdfSchema>(Kernel::MakeCounted<FileExportOptionsPDF>(), &abort);
    PdfPage page;
    page.m_Boxes = PageBoxes::Plain(PageWriter::Page);
    {
        PdfExport full(schema, nullptr);
        ASSERT_TRUE(full.Create("a.pdf", Kernel::MakeCounted<FullStream>(), "", "", "", ""));
        EXPECT_TRUE(full.WritePage(page, Word(u"x"), {}, nullptr));
        EXPECT_FALSE(full.Close());
        EXPECT_EQ(full.GetError(), "No space is left on the disk.");
        EXPECT_FALSE(full.Close());
    }
    {
        PdfExport empty(schema, nullptr);
        Kernel::Counted<Kernel::MemoryOutStream> const stream = Kernel::MakeCounted<Kernel::MemoryOutStream>();
        ASSERT_TRUE(empty.Create("a.pdf", stream, "", "", "", ""));
        EXPECT_FALSE(empty.Close());
        EXPECT_EQ(stream->GetPosition(), 0U);
    }
    PdfExport stopped(schema, nullptr);
    Kernel::Counted<Kernel::MemoryOutStream> const stream = Kernel::MakeCounted<Kernel::MemoryOutStream>();
    ASSERT_TRUE(stopped.Create("a.pdf", stream, "", "", "", ""));
    EXPECT_TRUE(stopped.WritePage(page, Word(u"x"), {}, nullptr));
    abort = true;
    EXPECT_FALSE(stopped.WritePage(page, Word(u"x"), {}, nullptr));
    EXPECT_FALSE(stopped.Close());
    EXPECT_EQ(stream->GetPosition(), 0U);
}

}
