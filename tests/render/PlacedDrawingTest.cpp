#include "PageWriter.h"

#include "framework/kernel/FileSystem.h"
#include "framework/render/PdfCompressor.h"
#include "framework/render/PdfSource.h"
#include "framework/render/Qpdf.h"
#include "framework/render/RasterSink.h"
#include "support/DrawingBuilder.h"

#include <cstdlib>

using namespace Renderer;
using namespace Renderer::RenderTree;
using Bytes = Raster::Picture::Bytes;
using Code = Raster::PictureProblem::Code;

namespace
{

Kernel::Counted<PlacedDrawing const> Open(Bytes const & bytes, int page, char const * password)
{
    Raster::PictureProblem problem;
    auto const drawing = PlacedDrawing::Open({bytes, "figure", page, password}, problem);
    EXPECT_TRUE(drawing) << problem.m_Text;
    return drawing;
}

Code ProblemOf(Bytes const & bytes, int page, char const * password)
{
    Raster::PictureProblem problem;
    auto const drawing = PlacedDrawing::Open({bytes, "figure", page, password}, problem);
    EXPECT_EQ(!drawing, Code::None != problem.m_Code);
    EXPECT_TRUE(drawing || std::string_view::npos != problem.m_Text.View().find("figure")) << problem.m_Text;
    return problem.m_Code;
}

Raster::AffineTransform::Params At(double left, double top, double width, double height)
{
    return {width, 0, 0, height, left, top};
}

std::string Zipped(std::string const & text)
{
    PdfCompressor::Deflater deflater;
    return std::string(deflater.Compress(text, PdfCompressor::Deflater::Effort::Quick));
}

/// Packed spaces, more than is ever unpacked.
std::string const & Bomb()
{
    static std::string const bomb = Zipped(std::string(PdfSource::LargestUnpacked + 1000, ' '));
    return bomb;
}

std::string StreamObject(std::string const & keys, std::string const & data)
{
    return "<<" + keys + "/Length " + std::to_string(data.size()) + ">>\nstream\n" + data + "\nendstream";
}

/// The drawing on a page's white ground by the raster sink, as `PdfProbe::Draw` gives it.
unsigned RasterAt(DisplayList const & list, int x, int y, std::vector<Warning> * warnings)
{
    RasterSink const sink(Kernel::MakeCounted<Schema>());
    auto const bitmap = sink.Draw(list, 300, 400, {}, warnings);
    if (!bitmap) {
        ADD_FAILURE() << "no bitmap";
        return 0;
    }
    std::uint8_t const * pixel = bitmap->GetRow(y) + x * 4;
    auto const over = [pixel](int channel) {
        return static_cast<unsigned>((pixel[channel] * pixel[3] + 255 * (255 - pixel[3]) + 127) / 255);
    };
    return over(0) << 16 | over(1) << 8 | over(2);
}

TEST(PlacedDrawingTest, APageShowsAsItsBoxesTurnsAndUnitSay)
{
    // The page has a red square of 20 points at its lower left corner (0,0).
    struct Row
    {
        char const * m_Keys;
        double m_Width;
        double m_Height;
        /// Corner where the square shows, in the placed box.
        bool m_Right;
        bool m_Bottom;
    };
    Row const rows[] = {
        {"/MediaBox[0 0 100 50]", 100, 50, false, true},
        {"/MediaBox[100 50 0 0]", 100, 50, false, true},
        {"/MediaBox[0 0 200 200]/CropBox[0 0 100 50]", 100, 50, false, true},
        {"/MediaBox[0 0 100 50]/CropBox[-10 -10 1000 1000]", 100, 50, false, true},
        {"/MediaBox[-80 0 20 50]", 100, 50, true, true},
        {"/MediaBox[0 -30 100 20]", 100, 50, false, false},
        {"/MediaBox[0 0 100 50]/Rotate 90", 50, 100, false, false},
        {"/MediaBox[0 0 100 50]/Rotate 180", 100, 50, true, false},
        {"/MediaBox[0 0 100 50]/Rotate 270", 50, 100, true, true},
        {"/MediaBox[0 0 100 50]/Rotate -90", 50, 100, true, true},
        {"/MediaBox[0 0 100 50]/UserUnit 2.5", 250, 125, false, true},
        {"/MediaBox[0 0 100 50]/CropBox(none)/Rotate/x/UserUnit -1", 100, 50, false, true},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_Keys);
        PdfSketch sketch;
        sketch.m_Keys = row.m_Keys;
        auto const drawing = Open(sketch.Make(), 1, "");
        ASSERT_TRUE(drawing);
        EXPECT_NEAR(drawing->GetSize().width, row.m_Width, 1e-6);
        EXPECT_NEAR(drawing->GetSize().height, row.m_Height, 1e-6);
        PageWriter writer;
        DisplayList list;
        list.DrawDrawing(drawing, At(20, 30, 200, 100));
        writer.Write(list);
        PdfProbe::Image const image = writer.Probe().Draw(1);
        for (bool const right : {false, true}) {
            for (bool const bottom : {false, true}) {
                int const x = right ? 215 : 25;
                int const y = bottom ? 125 : 35;
                unsigned const expected = right == row.m_Right && bottom == row.m_Bottom ? 0xFF0000 : 0xFFFFFF;
                EXPECT_EQ(image.At(x, y), expected) << x << " " << y;
                EXPECT_EQ(RasterAt(list, x, y, nullptr), expected) << "pixels, " << x << " " << y;
            }
        }
        EXPECT_TRUE(writer.GetWarnings().empty());
    }
}

TEST(PlacedDrawingTest, VectorsAndFontsStayAndAPageIsTakenOnce)
{
    Bytes const svg = SvgWith("<rect width='100' height='50' fill='#0f0'/>"
                              "<text x='5' y='30' font-family='Liberation Sans' font-size='12'>Drawn words</text>");
    auto const fromSvg = Open(svg, 1, "");
    EXPECT_NEAR(fromSvg->GetSize().width, 75, 1e-6) << "96 pixels to the inch";
    Raster::PictureProblem problem;
    Bytes const asPdf = fromSvg->ReadAsPdf(problem);
    ASSERT_TRUE(asPdf) << problem.m_Text;

    PageWriter writer;
    for (int page = 0; page < 2; ++page) {
        DisplayList list;
        list.DrawDrawing(fromSvg, At(20, 30, 150, 75));
        list.DrawDrawing(Open(svg, 1, ""), At(20, 130, 50, 25));
        list.DrawDrawing(Open(asPdf, 1, ""), At(20, 230, 150, 75));
        writer.Write(list);
    }
    PdfProbe & probe = writer.Probe();
    EXPECT_EQ(probe.Value("1/Resources/XObject/D1/Subtype"), "/Form");
    EXPECT_EQ(probe.Value("2/Resources/XObject/D2/Subtype"), "/Form");
    EXPECT_EQ(probe.Value("1/Resources/XObject/D3"), "null") << "one for each file, not for each use";
    int images = 0;
    int fontFiles = 0;
    for (QPDFObjectHandle & object : probe.GetPdf().getAllObjects()) {
        images += object.isStream() && object.getDict().getKey("/Subtype").isNameAndEquals("/Image") ? 1 : 0;
        if (object.isDictionary() && object.hasKey("/FontFile2")) {
            EXPECT_NE(object.getKey("/FontName").getName().find("LiberationSans"), std::string::npos);
            ++fontFiles;
        }
    }
    EXPECT_EQ(images, 0);
    EXPECT_EQ(fontFiles, 2);
    EXPECT_NE(probe.Text(2).find("Drawn words"), std::string::npos);
    EXPECT_EQ(probe.Draw(1).At(150, 40), 0x00FF00U);
}

TEST(PlacedDrawingTest, PagesOfOneFileShareWhatTheyShareThere)
{
    PdfSketch sketch;
    sketch.m_Pages = {"BT/F 9 Tf 5 5 Td(One)Tj ET", "BT/F 9 Tf 5 5 Td(Two)Tj ET", "q"};
    Bytes const bytes = sketch.Make();
    // All pages refer to one font.
    QPDF pdf;
    pdf.processMemoryFile("", reinterpret_cast<char const *>(bytes->data()), bytes->size());
    QPDFObjectHandle const font =
        pdf.makeIndirectObject(QPDFObjectHandle::parse("<</Type/Font/Subtype/Type1/BaseFont/Helvetica>>"));
    for (QPDFObjectHandle page : pdf.getAllPages()) {
        page.replaceKey("/Resources", QPDFObjectHandle::parse("<</Font<<>>>>"));
        page.getKey("/Resources").getKey("/Font").replaceKey("/F", font);
    }
    QPDFWriter file(pdf);
    file.setOutputMemory();
    file.write();
    auto const buffer = file.getBufferSharedPointer();
    Bytes const shared = ToBytes({reinterpret_cast<char const *>(buffer->getBuffer()), buffer->getSize()});

    PageWriter writer;
    DisplayList list;
    for (int page = 1; page <= 3; ++page) {
        list.DrawDrawing(Open(shared, page, ""), At(20, 100 * page, 100, 50));
    }
    writer.Write(list);
    int fonts = 0;
    for (QPDFObjectHandle & object : writer.Probe().GetPdf().getAllObjects()) {
        fonts += object.isDictionaryOfType("/Font") ? 1 : 0;
    }
    EXPECT_EQ(fonts, 1);
    EXPECT_NE(writer.Probe().Text(1).find("Two"), std::string::npos);
}

TEST(PlacedDrawingTest, AProtectedFileOpensWithItsPasswordAndComesOutWithoutOne)
{
    PdfSketch sketch;
    sketch.m_Pages = {"0 0 1 rg 0 0 100 50 re f"};
    sketch.m_Password = "schl\xC3\xBCssel";
    Bytes const bytes = sketch.Make();
    EXPECT_EQ(ProblemOf(bytes, 1, ""), Code::Locked);
    EXPECT_EQ(ProblemOf(bytes, 1, "wrong"), Code::Locked);
    auto const drawing = Open(bytes, 1, "schl\xC3\xBCssel");
    ASSERT_TRUE(drawing);
    PageWriter writer;
    DisplayList list;
    list.DrawDrawing(drawing, At(20, 30, 200, 100));
    writer.Write(list);
    EXPECT_FALSE(writer.Probe().GetPdf().isEncrypted());
    EXPECT_EQ(writer.Probe().Draw(1).At(120, 80), 0x0000FFU);
    EXPECT_EQ(RasterAt(list, 120, 80, nullptr), 0x0000FFU);
    EXPECT_EQ(writer.Finish().find("schl"), std::string::npos);
}

TEST(PlacedDrawingTest, ADrawingIsDrawnApartFromWhatIsRoundIt)
{
    // It sets nothing before it draws, so black lines of one point are meant, and leaves a mess behind.
    PdfSketch sketch;
    sketch.m_Pages = {"0 0 100 50 re f q q 0 1 0 rg 5 w 0.1 0 0 0.1 0 0 cm"};
    PageWriter writer;
    DisplayList list;
    list.FillRect({0, 0, 10, 10}, Raster::Colour::Rgb(1, 0, 0));
    list.DrawDrawing(Open(sketch.Make(), 1, ""), At(20, 30, 100, 50));
    list.FillRect({150, 150, 160, 160}, Raster::Colour::Rgb(1, 0, 0));
    writer.Write(list);
    PdfProbe::Image const image = writer.Probe().Draw(1);
    EXPECT_EQ(image.At(60, 50), 0x000000U);
    EXPECT_EQ(image.At(155, 155), 0xFF0000U);
    EXPECT_EQ(image.At(130, 50), 0xFFFFFFU);
}

TEST(PlacedDrawingTest, WhatIsNotThePagesLookStaysBehind)
{
    std::string const packet = "<?xpacket begin='' id='W5M0MpCehiHzreSzNTczkc9d'?><x/><?xpacket end='w'?>";
    PdfSketch sketch;
    Bytes const bytes = RawPdf(
        {"<</Type/Catalog/Pages 2 0 R/OpenAction<</S/JavaScript/JS(bad)>>>>", "<</Type/Pages/Count 1/Kids[3 0 R]>>",
         "<</Type/Page/Parent 2 0 R/MediaBox[0 0 100 50]/Contents 5 0 R/Metadata 4 0 R/Resources<</XObject<</X 6 0 R>>"
         "/Back 3 0 R>>>>",
         StreamObject("/Type/Metadata/Subtype/XML", packet), StreamObject("", "/X Do"),
         StreamObject("/Type/XObject/Subtype/Form/BBox[0 0 100 50]/Metadata 4 0 R/PieceInfo<</A 1>>/Ref<</F(x.pdf)>>",
                      "0 0 1 rg 0 0 100 50 re f")});
    PageWriter writer;
    DisplayList list;
    list.DrawDrawing(Open(bytes, 1, ""), At(20, 30, 200, 100));
    writer.Write(list);
    PdfProbe & probe = writer.Probe();
    EXPECT_EQ(probe.Draw(1).At(120, 80), 0x0000FFU);
    EXPECT_EQ(probe.PageCount(), 1);
    EXPECT_EQ(probe.Value("1/Resources/XObject/D1/Resources/Back"), "null");
    EXPECT_EQ(probe.Value("1/Resources/XObject/D1/Resources/XObject/X/Ref"), "null");
    EXPECT_EQ(probe.Value("1/Resources/XObject/D1/Resources/XObject/X/PieceInfo"), "null");
    std::string const file = writer.Finish();
    std::size_t const first = file.find("W5M0MpCehiHzreSzNTczkc9d");
    EXPECT_EQ(file.find("W5M0MpCehiHzreSzNTczkc9d", first + 1), std::string::npos) << "the output's own is the only one";
}

TEST(PlacedDrawingTest, HiddenLayersStayHidden)
{
    Bytes const bytes = RawPdf(
        {"<</Type/Catalog/Pages 2 0 R/OCProperties<</OCGs[5 0 R 6 0 R]/D<</OFF[6 0 R]>>>>>>",
         "<</Type/Pages/Count 1/Kids[3 0 R]>>",
         "<</Type/Page/Parent 2 0 R/MediaBox[0 0 100 50]/Contents 4 0 R/Resources<</Properties<</A 5 0 R/B 6 0 R>>>>>>",
         StreamObject("", "/OC/A BDC 0 0 1 rg 0 0 50 50 re f EMC /OC/B BDC 1 0 0 rg 50 0 50 50 re f EMC"),
         "<</Type/OCG/Name(Shown)>>", "<</Type/OCG/Name(Hidden)>>"});
    PageWriter writer;
    DisplayList list;
    list.DrawDrawing(Open(bytes, 1, ""), At(20, 30, 200, 100));
    writer.Write(list);
    PdfProbe::Image const image = writer.Probe().Draw(1);
    EXPECT_EQ(image.At(70, 80), 0x0000FFU);
    EXPECT_EQ(image.At(170, 80), 0xFFFFFFU);
}

TEST(PlacedDrawingTest, BrokenAndHostileFilesGiveAReason)
{
    std::string const catalogue = "<</Type/Catalog/Pages 2 0 R>>";
    std::string const page = "<</Type/Page/MediaBox[0 0 100 50]>>";
    std::vector<std::string> deep{catalogue};
    for (int i = 3; i < 50'000; ++i) {
        deep.push_back("<</Type/Pages/Kids[" + std::to_string(i) + " 0 R]>>");
    }
    deep.push_back(page);
    struct Row
    {
        char const * m_Why;
        Bytes m_Bytes;
        int m_Page;
        Code m_Code;
    };
    PdfSketch three;
    three.m_Pages = {"q Q", "q Q", "q Q"};
    PdfSketch huge;
    huge.m_Keys = "/MediaBox[0 0 1000000000 1000000000]";
    PdfSketch noSize;
    noSize.m_Keys = "/MediaBox[0 0 0 0]";
    Bytes const whole = three.Make();
    std::string const cut(whole->begin(), whole->end() - 20);
    Row const rows[] = {
        {"neither", ToBytes("GIF89a"), 1, Code::UnknownKind},
        {"only a header", ToBytes("%PDF-1.7\n"), 1, Code::Corrupt},
        {"noise", ToBytes("%PDF-1.7\n" + std::string(5000, '\xA7')), 1, Code::Corrupt},
        {"cut short, but its pages can be found", ToBytes(cut), 2, Code::None},
        {"no pages", RawPdf({catalogue, "<</Type/Pages/Count 0/Kids[]>>"}), 1, Code::NoSuchPage},
        {"no page tree", RawPdf({catalogue}), 1, Code::NoSuchPage},
        {"beyond the last page", three.Make(), 4, Code::NoSuchPage},
        {"far beyond", three.Make(), 2'000'000'000, Code::NoSuchPage},
        {"a tree that goes round", RawPdf({catalogue, "<</Type/Pages/Kids[2 0 R 2 0 R]/Count 9>>"}), 1, Code::NoSuchPage},
        {"a very deep tree", RawPdf(deep), 1, Code::None},
        {"larger than any page", huge.Make(), 1, Code::TooLarge},
        {"letter size for one without", noSize.Make(), 1, Code::None},
        {"an object stream that unpacks to too much",
         RawPdf({catalogue, StreamObject("/Type/ObjStm/N 1/First 4/Filter/FlateDecode", Bomb())}), 1, Code::TooLarge},
        {"the same under another name",
         RawPdf({catalogue, StreamObject("/Ty#70e/X/#4E 1/Fi#72st 4/Filter[/Fl]", Bomb())}), 1, Code::TooLarge},
        {"packed twice",
         RawPdf({catalogue, StreamObject("/Type/ObjStm/N 1/First 4/Filter[/FlateDecode/FlateDecode]", Zipped(Bomb()))}), 1,
         Code::TooLarge},
        {"no XML", ToBytes("<svg"), 1, Code::Corrupt},
        {"an SVG without anything", ToBytes("<svg xmlns='http://www.w3.org/2000/svg'/>"), 1, Code::Corrupt},
        {"an SVG's second page", SvgWith(""), 2, Code::NoSuchPage},
        {"an SVG as large as a town", ToBytes("<svg xmlns='http://www.w3.org/2000/svg' width='1e8' height='1e8'/>"), 1,
         Code::TooLarge},
        {"entities that multiply",
         ToBytes("<!DOCTYPE svg [<!ENTITY a 'aaaaaaaaaa'><!ENTITY b '&a;&a;&a;&a;&a;&a;&a;&a;&a;&a;'>"
                 "<!ENTITY c '&b;&b;&b;&b;&b;&b;&b;&b;&b;&b;'><!ENTITY d '&c;&c;&c;&c;&c;&c;&c;&c;&c;&c;'>"
                 "<!ENTITY e '&d;&d;&d;&d;&d;&d;&d;&d;&d;&d;'><!ENTITY f '&e;&e;&e;&e;&e;&e;&e;&e;&e;&e;'>"
                 "<!ENTITY g '&f;&f;&f;&f;&f;&f;&f;&f;&f;&f;'><!ENTITY h '&g;&g;&g;&g;&g;&g;&g;&g;&g;&g;'>]>"
                 "<svg xmlns='http://www.w3.org/2000/svg' width='9' height='9'><text>&h;&h;</text></svg>"),
         1, Code::Corrupt},
    };
    for (Row const & row : rows) {
        EXPECT_EQ(ProblemOf(row.m_Bytes, row.m_Page, ""), row.m_Code) << row.m_Why;
    }
}

TEST(PlacedDrawingTest, AHostilePageIsPlacedOrGivesAMarkedBoxAndAWarning)
{
    // A chain of references that would be too long for recursion.
    std::vector<std::string> chain{"<</Type/Catalog/Pages 2 0 R>>", "<</Type/Pages/Count 1/Kids[3 0 R]>>",
                                   "<</Type/Page/MediaBox[0 0 100 50]/Contents 4 0 R/Resources 5 0 R>>",
                                   StreamObject("", "0 0 1 rg 0 0 100 50 re f")};
    for (int i = 6; i < 50'000; ++i) {
        chain.push_back("<</Next " + std::to_string(i) + " 0 R>>");
    }
    chain.emplace_back("null");
    std::string const part = StreamObject("/Filter/FlateDecode", Bomb());
    auto const withContents = [](std::string const & contents, std::string const & stream) {
        return RawPdf({"<</Type/Catalog/Pages 2 0 R>>", "<</Type/Pages/Count 1/Kids[3 0 R]>>",
                       "<</Type/Page/MediaBox[0 0 100 50]/Contents " + contents + ">>", stream});
    };
    struct Row
    {
        char const * m_Why;
        Bytes m_Bytes;
        bool m_IsPlaced;
    };
    Row const rows[] = {
        {"a long chain", RawPdf(chain), true},
        {"parts that unpack to too much", withContents("[4 0 R]", part), false},
        {"a part that can't be unpacked", withContents("[4 0 R]", StreamObject("/Filter/NoSuch", "q")), false},
        {"no content", withContents("null", "null"), true},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_Why);
        PageWriter writer;
        DisplayList list;
        list.DrawDrawing(Open(row.m_Bytes, 1, ""), At(20, 30, 200, 100));
        writer.Write(list);
        EXPECT_EQ(writer.Probe().Check(), "");
        EXPECT_EQ(writer.GetWarnings().size(), row.m_IsPlaced ? 0U : 1U);
        EXPECT_EQ(writer.Probe().Value("1/Resources/XObject/D1/Subtype"), row.m_IsPlaced ? "/Form" : "null");
    }
}

TEST(PlacedDrawingTest, APageThatIsMadeOnceForManySheetsTellsItsOwnWarnings)
{
    Bytes const broken = RawPdf({"<</Type/Catalog/Pages 2 0 R>>", "<</Type/Pages/Count 1/Kids[3 0 R]>>",
                                 "<</Type/Page/MediaBox[0 0 100 50]/Contents[4 0 R]>>",
                                 StreamObject("/Filter/NoSuch", "q")});
    PageWriter writer;
    DisplayList sound;
    sound.DrawDrawing(Open(PdfSketch().Make(), 1, ""), At(20, 30, 200, 100));
    writer.Write(sound);
    DisplayList list;
    list.DrawDrawing(Open(broken, 1, ""), At(20, 30, 200, 100));
    std::vector<Warning> own;
    EXPECT_LE(0, writer.GetExport().AddForm(list, PageWriter::Page, &own));
    ASSERT_EQ(own.size(), 1U);
    EXPECT_EQ(own[0].m_Code, Warning::Code::PictureMissing);
    EXPECT_TRUE(writer.GetWarnings().empty());
}

TEST(PlacedDrawingTest, AnSvgSeesOnlyItsOwnFolder)
{
    TemporaryFolder folder;
    std::string const red = "<svg xmlns='http://www.w3.org/2000/svg' width='10' height='10'>"
                            "<rect width='10' height='10' fill='red'/></svg>";
    std::string const outside = folder.WriteFile("outside.svg", red).ToStd();
    ASSERT_TRUE(Kernel::FileSystem::CreateFolders(folder.GetPath() + "/in"));
    folder.WriteFile("in/beside.svg", red);
    struct Row
    {
        char const * m_Target;
        bool m_IsShown;
    };
    std::string const absolute = "file://" + outside;
    Row const rows[] = {{"beside.svg", true},
                        {"../outside.svg", false},
                        {outside.c_str(), false},
                        {absolute.c_str(), false},
                        {"http://localhost:1/x.svg", false}};
    for (Row const & row : rows) {
        Bytes const svg = SvgWith("<image width='100' height='50' preserveAspectRatio='none' xlink:href='" +
                                  std::string(row.m_Target) + "'/>");
        Raster::PictureProblem problem;
        auto const drawing = PlacedDrawing::Open({svg, folder.GetPath() + "/in/main.svg", 1, ""}, problem);
        ASSERT_TRUE(drawing) << row.m_Target << problem.m_Text;
        auto const bitmap = drawing->Draw(100, 50, problem);
        ASSERT_TRUE(bitmap) << row.m_Target << problem.m_Text;
        EXPECT_EQ(bitmap->GetRow(25)[50 * 4 + 3] != 0, row.m_IsShown) << row.m_Target;
    }
}

TEST(PlacedDrawingTest, WithoutItsProgramAPageIsAMarkedBoxInPixelsAndStillAPageInPdf)
{
    std::string const path = std::getenv("PATH");
    setenv("PATH", "/nowhere", 1);
    DisplayList list;
    list.DrawDrawing(Open(PdfSketch().Make(), 1, ""), At(20, 30, 200, 100));
    std::vector<Warning> warnings;
    EXPECT_EQ(RasterAt(list, 100, 40, &warnings), 0xEBEBEBU);
    ASSERT_EQ(warnings.size(), 1U);
    EXPECT_EQ(warnings[0].m_Code, Warning::Code::PictureNotDrawn);
    EXPECT_NE(warnings[0].m_Text.View().find("pdftocairo"), std::string_view::npos) << warnings[0].m_Text;
    PageWriter writer;
    writer.Write(list);
    std::string const file = writer.Finish();
    setenv("PATH", path.c_str(), 1);
    EXPECT_EQ(writer.Probe().Draw(1).At(25, 125), 0xFF0000U);
    EXPECT_TRUE(writer.GetWarnings().empty());
}

}
