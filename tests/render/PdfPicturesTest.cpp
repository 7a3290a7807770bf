#include "PageWriter.h"

#include "framework/render/RasterSink.h"
#include "framework/render/XmpFile.h"

#include <fstream>

using namespace Renderer;
using namespace Renderer::RenderTree;

namespace
{

std::string const Images = std::string(KORVANE_SOURCE_FOLDER) + "/tests/raster/images/";

Kernel::Counted<Raster::Picture const> Open(std::string const & name)
{
    Raster::PictureProblem problem;
    auto const picture = Raster::Picture::FromFile(Images + name, problem);
    EXPECT_TRUE(picture) << problem.m_Text;
    return picture;
}

Raster::AffineTransform::Params At(double left, double top, double width, double height)
{
    return {width, 0, 0, height, left, top};
}

TEST(PdfPicturesTest, EveryKindOfPictureLooksAsItShould)
{
    struct Row
    {
        char const * m_Name;
        /// A pixel of the drawn picture of 64 by 96 points, and its colour.
        int m_X;
        int m_Y;
        unsigned m_Colour;
    };
    Row const rows[] = {
        {"palette.png", 2, 3, 0x0A141E},
        {"bits1.png", 1, 1, 0xFFFFFF},             {"rgb16.png", 62, 94, 0x0F0F9C},
        {"palette-transparent.png", 2, 2, 0xFFFFFF}, {"grey16.png", 32, 32, 0x808080},
        {"orientation1.jpg", 8, 8, 0xFE0000},      {"orientation3.jpg", 8, 8, 0xFE0000},
        {"orientation5.jpg", 56, 8, 0x00FF01},     {"orientation6.jpg", 8, 8, 0xFE0000},
        {"orientation7.jpg", 56, 8, 0x00FF01},     {"orientation8.jpg", 8, 80, 0x0000FE},
        {"alpha.png", 63, 50, 0xFF15 << 8 | 0x8A}, {"grey.jpg", 1, 50, 0x000000},
    };
    for (Row const & row : rows) {
        PageWriter writer;
        DisplayList list;
        list.DrawPicture(Open(row.m_Name), At(20, 30, 64, 96));
        writer.Write(list);
        PdfProbe::Image const image = writer.Probe().Draw(1);
        unsigned const drawn = image.At(20 + row.m_X, 30 + row.m_Y);
        for (int shift : {0, 8, 16}) {
            EXPECT_NEAR(static_cast<int>(drawn >> shift & 0xFF), static_cast<int>(row.m_Colour >> shift & 0xFF), 6)
                << row.m_Name << " " << std::hex << drawn;
        }
        EXPECT_EQ(image.At(10, 50), 0xFFFFFFU) << row.m_Name;
        EXPECT_TRUE(writer.GetWarnings().empty()) << row.m_Name;
    }
}

TEST(PdfPicturesTest, JpegDataAreTakenOverOnceAndWithoutTheirXmp)
{
    PageWriter writer;
    DisplayList list;
    list.DrawPicture(Open("profile.jpg"), At(20, 30, 64, 96));
    list.DrawPicture(Open("profile.jpg"), At(120, 30, 64, 96));
    list.DrawPicture(Open("cmyk.jpg"), At(20, 200, 64, 96));
    writer.Write(list);
    PdfProbe & probe = writer.Probe();
    EXPECT_EQ(probe.Value("1/Resources/XObject/I1/Filter"), "/DCTDecode");
    EXPECT_EQ(probe.Value("1/Resources/XObject/I1/ColorSpace/0"), "/ICCBased");
    EXPECT_EQ(probe.Value("1/Resources/XObject/I2/Decode"), "[ 1 0 1 0 1 0 1 0 ]");
    EXPECT_EQ(probe.Value("1/Resources/XObject/I3"), "null");
    std::string const file = writer.Finish();
    std::size_t packets = 0;
    for (std::size_t at = 0; (at = file.find("W5M0MpCehiHzreSzNTczkc9d", at)) != std::string::npos; ++at) {
        ++packets;
    }
    EXPECT_EQ(packets, 1U);
    // Full cyan as printed.
    PdfProbe::Image const image = probe.Draw(1);
    EXPECT_LT(image.At(40, 240) >> 16, 0x60U);
    EXPECT_GT(image.At(40, 240) & 0xFF, 0xA0U);
}

TEST(PdfPicturesTest, PngDataStayAsTheyAreWherePdfKnowsTheirForm)
{
    struct Row
    {
        char const * m_Name;
        bool m_Taken;
        char const * m_Bits;
    };
    Row const rows[] = {{"rgb16.png", true, "16"}, {"palette.png", true, "4"}, {"bits1.png", true, "1"},
                        {"alpha.png", false, "8"}, {"palette-interlaced.png", false, "8"}};
    for (Row const & row : rows) {
        PageWriter writer;
        DisplayList list;
        list.DrawPicture(Open(row.m_Name), At(20, 30, 64, 96));
        writer.Write(list);
        std::string const name = writer.Probe().Value("1/Resources/XObject").substr(3, 3).starts_with("/I2") ? "I2" : "I1";
        std::string const image = "1/Resources/XObject/" + name;
        EXPECT_EQ(writer.Probe().Value(image + "/DecodeParms") != "null", row.m_Taken) << row.m_Name;
        EXPECT_EQ(writer.Probe().Value(image + "/BitsPerComponent"), row.m_Bits) << row.m_Name;
    }
}

TEST(PdfPicturesTest, PicturesAreReducedToTheLimit)
{
    PageWriter writer;
    writer.m_Settings.m_PictureDpiLimit = 18;
    writer.m_Settings.m_PictureDpiWarning = 30;
    DisplayList list;
    // 32 by 48 upright, stored as 48 by 32; 64 by 96 points make 16 by 24.
    list.DrawPicture(Open("orientation6.jpg"), At(20, 30, 64, 96));
    writer.Write(list);
    EXPECT_EQ(writer.Probe().Value("1/Resources/XObject/I1/Width"), "24");
    EXPECT_EQ(writer.Probe().Value("1/Resources/XObject/I1/Height"), "16");
    PdfProbe::Image const image = writer.Probe().Draw(1);
    EXPECT_GT(image.At(30, 40) >> 16, 0xE0U) << "red at the top left";
    EXPECT_TRUE(writer.GetWarnings().empty());
    list.Clear();
    list.DrawPicture(Open("grey.jpg"), At(0, 0, 288, 300));
    PageWriter coarse;
    coarse.m_Settings.m_PictureDpiWarning = 30;
    coarse.Write(list);
    ASSERT_EQ(coarse.GetWarnings().size(), 1U);
    EXPECT_EQ(coarse.GetWarnings()[0].m_Code, Warning::Code::PictureResolution);
}

TEST(PdfPicturesTest, ADamagedPictureIsAMarkedBoxAndAWarning)
{
    TemporaryFolder folder;
    std::ifstream file(Images + "alpha.png", std::ios::binary);
    std::string bytes(std::istreambuf_iterator<char>(file), {});
    Raster::PictureProblem problem;
    auto const picture = Raster::Picture::FromFile(folder.WriteFile("cut.png", bytes.substr(0, bytes.size() - 50)), problem);
    ASSERT_TRUE(picture);
    DisplayList list;
    list.DrawPicture(picture, At(20, 30, 64, 96));
    PageWriter writer;
    writer.Write(list);
    ASSERT_EQ(writer.GetWarnings().size(), 1U);
    EXPECT_EQ(writer.GetWarnings()[0].m_Code, Warning::Code::PictureMissing);
    EXPECT_EQ(writer.GetWarnings()[0].m_Page, 1);
    EXPECT_NE(writer.GetWarnings()[0].m_Text.View().find("ends too early"), std::string_view::npos);
    PdfProbe::Image const image = writer.Probe().Draw(1);
    EXPECT_NEAR(static_cast<int>(image.At(40, 100) & 0xFF), 235, 3);
}

TEST(PdfPicturesTest, TheBitmapAndThePdfShowTheSame)
{
    DisplayList list;
    list.FillRect({0, 0, 300, 400}, Raster::Colour::White());
    DrawText(list, Garamond(), 40, {20, 80}, u"Hamburg", 0);
    Group group;
    group.m_Transform = Raster::AffineTransform::Params::Rotation(0.3).Then(
        Raster::AffineTransform::Params::Translation(100, 120));
    group.m_Opacity = 0.6;
    list.BeginGroup(group);
    Path star;
    star.MoveTo(0, 0);
    star.CurveTo(40, 0, 90, 40, 90, 90);
    star.LineTo(0, 90);
    star.Close();
    list.FillPath(star, Raster::Colour::Rgb(0.8F, 0.2F, 0.1F), FillRule::NonZero);
    Stroke stroke;
    stroke.m_Width = 6;
    stroke.m_Dashes = {14, 8};
    stroke.m_Cap = LineCap::Round;
    list.StrokePath(star, Raster::Colour::Rgb(0, 0.2F, 0.7F), stroke);
    list.EndGroup();
    list.DrawPicture(Open("orientation6.jpg"), At(40, 280, 64, 96));
    list.DrawPicture(Open("alpha.png"), {60, 30, -20, 60, 180, 290});
    PageWriter writer;
    writer.Write(list);
    PdfProbe::Image const page = writer.Probe().Draw(1);
    auto const bitmap = RasterSink(Kernel::MakeCounted<Schema>()).Draw(list, 300, 400, {}, nullptr);
    ASSERT_TRUE(bitmap);
    ASSERT_EQ(page.m_Width, 300);
    ASSERT_EQ(page.m_Height, 400);
    // Renderers differ along edges; areas agree.
    double difference = 0;
    for (int y = 0; y < 400; ++y) {
        for (int x = 0; x < 300; ++x) {
            std::uint8_t const * p = bitmap->GetRow(y) + x * 4;
            unsigned const drawn = page.At(x, y);
            for (int i = 0; i < 3; ++i) {
                difference += std::abs(static_cast<int>(p[i]) - static_cast<int>(drawn >> (16 - 8 * i) & 0xFF));
            }
        }
    }
    EXPECT_LT(difference / (300 * 400 * 3), 1.2);
    EXPECT_FALSE(RasterSink(Kernel::MakeCounted<Schema>()).Draw(list, 0, 10, {}, nullptr));
    EXPECT_FALSE(RasterSink(Kernel::MakeCounted<Schema>()).Draw(list, 40000, 10, {}, nullptr));
}

TEST(XmpFileTest, MetadataOfAFinishedFileAreReadReplacedAndKeepTheFileSound)
{
    PageWriter writer;
    DisplayList list;
    list.DrawPicture(Open("profile.jpg"), At(20, 30, 64, 96));
    writer.Write(list);
    TemporaryFolder folder;
    String const path = folder.WriteFile("out.pdf", writer.Finish());
    String packet;
    {
        XmpFile file;
        ASSERT_TRUE(file.Open(path));
        packet = file.Read();
        EXPECT_NE(packet.View().find("A title"), std::string_view::npos);
        EXPECT_FALSE(file.CanPut("no XMP"));
        EXPECT_THROW(file.Put("no XMP"), XmpException);
        std::string changed = packet.ToStd();
        changed.replace(changed.find("A title"), 7, "Another title, and a longer one");
        EXPECT_TRUE(file.CanPut(changed));
        file.Put(changed);
        file.Close();
    }
    PdfProbe probe(path);
    EXPECT_EQ(probe.Check(), "");
    EXPECT_NE(probe.Stream("Metadata").find("Another title, and a longer one"), std::string::npos);
    XmpFile again;
    ASSERT_TRUE(again.Open(path));
    EXPECT_NE(again.Read().View().find("Another title"), std::string_view::npos);
    XmpFile none;
    EXPECT_FALSE(none.Open(folder / "missing.pdf"));
}

}
