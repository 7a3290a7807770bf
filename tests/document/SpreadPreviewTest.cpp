#include "framework/commands/ComposeTextCommand.h"
#include "framework/commands/SetPDFBookmarkManagerCommand.h"
#include "framework/commands/StoryCommands.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DynamicNodeRenderingEngine.h"
#include "framework/document/Selection.h"
#include "framework/document/ShapeNode.h"
#include "framework/document/SpreadPreview.h"
#include "framework/document/VantraController.h"
#include "framework/raster/Picture.h"
#include "framework/raster/PixelConversion.h"
#include "support/DocumentBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cmath>

using Kernel::Counted;
using Kernel::MakeCounted;
using Raster::Format;
using Transform = Raster::AffineTransform::Params;

namespace
{

constexpr Format DocumentFormats[] = {Format::Rgba8,  Format::Rgba16, Format::GreyAlpha8, Format::GreyAlpha16,
                                      Format::Cmyka8, Format::Laba16, Format::RgbaFloat};

SpreadNode & FirstSpread(DocumentController & document)
{
    return *document.GetDocument()->GetSpreadAtIndex(0);
}

/// A document whose first spread is one page of these measures with nothing on it.
Counted<DocumentController> BlankDocument(double width, double height)
{
    Counted<DocumentController> const document = DocumentBuilder().Paragraph("Text").Build();
    SpreadNode & spread = FirstSpread(*document);
    while (spread.GetChildCount(NodeChildListItems) > 0) {
        spread.RemoveChild(NodeChildListItems, 0);
    }
    SpreadPage page;
    page.m_Rect = {20, 30, 20 + width, 30 + height};
    spread.SetPages({page});
    return document;
}

void AddShape(DocumentController & document, Kernel::Rect const & rect, Raster::Colour const & colour)
{
    FirstSpread(document).AppendChild(NodeChildListOver, MakeCounted<ShapeNode>(rect, colour, std::nullopt, 0));
}

std::vector<int> PixelAt(Raster::DynamicBase const & bitmap, int x, int y)
{
    float colour[4];
    Raster::ToFloatPixels(bitmap.GetFormat(),
                          bitmap.GetRow(y) + static_cast<std::size_t>(x) * Raster::BytesPerPixel(bitmap.GetFormat()),
                          colour, 1);
    std::vector<int> pixel;
    for (float const value : colour) {
        pixel.push_back(static_cast<int>(std::lround(value * 255)));
    }
    return pixel;
}

/// What a PNG shows.
Counted<Raster::DynamicBitmap const> Decode(Kernel::RawData const & png)
{
    Raster::PictureProblem problem;
    auto const picture = Raster::Picture::FromBytes(
        std::make_shared<std::vector<unsigned char>>(png.GetData(), png.GetData() + png.GetSize()), "png", problem);
    return picture ? picture->Decode(problem) : nullptr;
}

}

TEST(SpreadPreviewTest, ASpreadIsHalvedUntilItFits)
{
    struct Row
    {
        double m_Width;
        double m_Height;
        int m_PixelsAcross;
        int m_PixelsDown;
    };
    for (Row const & row : {Row{300, 600, 300, 600}, Row{600, 300, 600, 300}, Row{500, 500, 500, 500},
                            // Sides are cut: 300.9 * 600 / 600.7 is 300.55.
                            Row{300.9, 600.7, 300, 600}, Row{1024, 100, 1024, 100}, Row{1025, 512.5, 512, 256},
                            Row{5000, 2500, 625, 312}, Row{1, 3000, 1, 750}, Row{0.5, 0.25, 1, 1}}) {
        auto const bitmap = SpreadPreview::Render(BlankDocument(row.m_Width, row.m_Height), 0);
        ASSERT_TRUE(bitmap) << row.m_Width;
        EXPECT_EQ(bitmap->GetWidth(), row.m_PixelsAcross) << row.m_Width << " by " << row.m_Height;
        EXPECT_EQ(bitmap->GetHeight(), row.m_PixelsDown) << row.m_Width << " by " << row.m_Height;
        EXPECT_EQ(bitmap->GetMipmapMode(), Raster::MipmapMode::OnDemand);
    }
    EXPECT_FALSE(SpreadPreview::Render(BlankDocument(0, 600), 0));
    EXPECT_FALSE(SpreadPreview::Render(BlankDocument(600, 0), 0));
    EXPECT_FALSE(SpreadPreview::Render(BlankDocument(600, 600), 99)) << "no such spread";
}

TEST(SpreadPreviewTest, ThePictureShowsThePagesInTheFormatOfTheDocument)
{
    for (Format const format : DocumentFormats) {
        auto const document = BlankDocument(200, 100);
        document->SetFormatAndProfiles(format, {});
        // Half of the shape lies beside the page.
        AddShape(*document, {-80, 30, 120, 80}, Raster::Colour::Grey(0.5F));
        auto const bitmap = SpreadPreview::Render(document, 0);
        ASSERT_TRUE(bitmap);
        ASSERT_EQ(bitmap->GetFormat(), format);
        EXPECT_EQ(PixelAt(*bitmap, 150, 25)[3], 0) << "the paper is transparent";
        EXPECT_EQ(PixelAt(*bitmap, 50, 75)[3], 0);
        EXPECT_EQ(PixelAt(*bitmap, 50, 25)[3], 255) << static_cast<int>(format);
        auto const png = SpreadPreview::Encode(*bitmap, 200, 100, false, document->GetProfile(), document->GetProfiles());
        ASSERT_TRUE(png);
        auto const decoded = Decode(*png);
        ASSERT_TRUE(decoded);
        EXPECT_EQ(decoded->GetWidth(), 512);
        EXPECT_EQ(decoded->GetHeight(), 256);
        for (int i = 0; i < 3; ++i) {
            EXPECT_NEAR(PixelAt(*decoded, 128, 64)[static_cast<std::size_t>(i)], 128, 6) << static_cast<int>(format);
            EXPECT_GE(PixelAt(*decoded, 400, 200)[static_cast<std::size_t>(i)], 253) << static_cast<int>(format);
        }
        EXPECT_EQ(PixelAt(*decoded, 400, 200)[3], 255) << "white paper";
    }
}

TEST(SpreadPreviewTest, ThePngHasTheShapeOfTheSpreadCutToWholePixels)
{
    Raster::DynamicBitmap bitmap;
    bitmap.Create(10, 10, Format::Rgba8, Raster::MipmapMode::OnDemand, Raster::HardwareCachePolicy::Default);
    struct Row
    {
        double m_Width;
        double m_Height;
        int m_PixelsAcross;
        int m_PixelsDown;
    };
    for (Row const & row : {Row{300, 600, 256, 512}, Row{600, 300, 512, 256}, Row{70, 70, 512, 512},
                            Row{100.9, 300.3, 172, 512}, Row{419.528, 595.276, 360, 512}, Row{600, 1.2, 512, 1},
                            Row{600, 1.1, 0, 0}, Row{1, 600, 0, 0}, Row{0, 0, 0, 0}}) {
        auto const png = SpreadPreview::Encode(bitmap, row.m_Width, row.m_Height, true, nullptr, {});
        ASSERT_EQ(static_cast<bool>(png), row.m_PixelsAcross > 0) << row.m_Width << " by " << row.m_Height;
        if (png) {
            auto const decoded = Decode(*png);
            EXPECT_EQ(decoded->GetWidth(), row.m_PixelsAcross);
            EXPECT_EQ(decoded->GetHeight(), row.m_PixelsDown);
            EXPECT_EQ(PixelAt(*decoded, 0, 0)[3], 0) << "the ground stays transparent";
        }
    }
    Raster::DynamicBitmap coverage;
    coverage.Create(10, 10, Format::Alpha8, Raster::MipmapMode::OnDemand, Raster::HardwareCachePolicy::Default);
    EXPECT_FALSE(SpreadPreview::Encode(coverage, 10, 10, false, nullptr, {})) << "no colours";
}

TEST(SpreadPreviewTest, ASoloViewIsPreviewedByItself)
{
    auto const document = BlankDocument(200, 100);
    AddShape(*document, {20, 30, 120, 130}, Raster::Colour::Rgb(1, 0, 0));
    AddShape(*document, {120, 30, 220, 130}, Raster::Colour::Rgb(0, 0, 1));
    document->SetSoloNode(FirstSpread(*document).GetChildAtIndex(NodeChildListOver, 1));
    auto const solo = SpreadPreview::Render(document, 0);
    EXPECT_EQ(PixelAt(*solo, 50, 50)[3], 0);
    EXPECT_EQ(PixelAt(*solo, 150, 50), (std::vector<int>{0, 0, 255, 255}));
    // A node that lies elsewhere, or nowhere any more, changes nothing.
    FirstSpread(*document).RemoveChild(NodeChildListOver, 1);
    auto const all = SpreadPreview::Render(document, 0);
    EXPECT_EQ(PixelAt(*all, 50, 50), (std::vector<int>{255, 0, 0, 255}));
}

TEST(DynamicNodeRenderingEngineTest, KeepsTenTilesAndDropsTheOldest)
{
    class Inverter final : public Renderer::RenderingFilter
    {
    public:
        void Apply(Raster::DynamicBitmap & piece) const override
        {
            for (int y = 0; y < piece.GetHeight(); ++y) {
                for (std::size_t i = 0; i < piece.GetRowBytes(); ++i) {
                    piece.GetRow(y)[i] = static_cast<std::uint8_t>(255 - piece.GetRow(y)[i]);
                }
            }
        }
    };
    auto const document = BlankDocument(200, 100);
    AddShape(*document, {20, 30, 220, 130}, Raster::Colour::Rgb(1, 0, 0));
    DocumentControllerSession const session(document);
    int const width = 4000;
    int const height = 2600;
    auto const engine = DynamicNodeRenderingEngine::Create(
        document->GetDocument()->GetSpreadAtIndex(0), {}, MakeCounted<Inverter>(), width, height,
        Transform::Translation(-20, -30).Then(Transform::Scale(20, 20)), Raster::ResamplerBilinear,
        Raster::ResamplerBicubic, {}, false);
    Raster::DynamicBitmap bitmap;
    bitmap.Create(width, height, Format::Rgba8, Raster::MipmapMode::OnDemand, Raster::HardwareCachePolicy::Default);
    EXPECT_EQ(engine->GetRenderedTileCount(), 0) << "nothing is made before it is asked for";

    ASSERT_TRUE(engine->Draw(bitmap, {600.5, 10, 600.75, 11}));
    EXPECT_EQ(engine->GetRenderedTileCount(), 1);
    EXPECT_EQ(PixelAt(bitmap, 600, 10), (std::vector<int>{0, 255, 255, 0})) << "red, inverted";
    EXPECT_EQ(PixelAt(bitmap, 601, 10), (std::vector<int>{0, 0, 0, 0})) << "beside the rectangle";

    // Four by three tiles; the page ends within the second row of them.
    ASSERT_TRUE(engine->Draw(bitmap, {-50, -50, 1e9, 1e9}));
    EXPECT_EQ(engine->GetRenderedTileCount(), 12);
    EXPECT_EQ(engine->GetTileCount(), 10U);
    EXPECT_EQ(PixelAt(bitmap, 3999, 1999), (std::vector<int>{0, 255, 255, 0}));
    EXPECT_EQ(PixelAt(bitmap, 3999, 2001), (std::vector<int>{255, 255, 255, 255}));
    ASSERT_TRUE(engine->Draw(bitmap, {3900, 2500, 3950, 2550}));
    EXPECT_EQ(engine->GetRenderedTileCount(), 12) << "the last tile is still there";
    ASSERT_TRUE(engine->Draw(bitmap, {600, 10, 601, 11}));
    EXPECT_EQ(engine->GetRenderedTileCount(), 13) << "the one made first has gone";
    ASSERT_TRUE(engine->Draw(bitmap, Kernel::Rect::Empty()));
    EXPECT_EQ(engine->GetRenderedTileCount(), 13);
}

TEST(DynamicNodeRenderingEngineTest, TilesJoinWithoutSeamsOnWhitePaper)
{
    Counted<DocumentController> const document = DocumentBuilder().Heading("A title", 1, "").Paragraphs(8).Build();
    DocumentControllerSession const session(document);
    auto const spread = document->GetDocument()->GetSpreadAtIndex(0);
    auto const draw = [&](Transform const & toPixels, int width, int height) {
        auto const engine =
            DynamicNodeRenderingEngine::Create(spread, {}, nullptr, width, height, toPixels, Raster::ResamplerBilinear,
                                               Raster::ResamplerBilinear, {}, false);
        auto bitmap = MakeCounted<Raster::DynamicBitmap>();
        bitmap->Create(width, height, Format::Rgba8, Raster::MipmapMode::None, Raster::HardwareCachePolicy::Default);
        EXPECT_TRUE(engine->Draw(*bitmap, {0, 0, 4000, 4000}));
        return bitmap;
    };
    Kernel::Rect const page = spread->GetPageRect(0);
    auto const big = draw(Transform::Translation(-page.left, -page.top).Then(Transform::Scale(4, 4)), 1660, 2360);
    // The same page around the corner of four tiles, as the middle of one.
    auto const corner = draw(Transform::Translation(-page.left, -page.top).Then(Transform::Scale(4, 4)).Then(
                                 Transform::Translation(-874, -874)),
                             300, 300);
    int ink = 0;
    for (int y = 0; y < 300; ++y) {
        for (int x = 0; x < 300; ++x) {
            // Places are rounded to parts of a pixel, differently in each.
            ASSERT_NEAR(PixelAt(*corner, x, y)[0], PixelAt(*big, x + 874, y + 874)[0], 2) << x << ", " << y;
            ink += PixelAt(*corner, x, y)[0] < 128 ? 1 : 0;
            ASSERT_EQ(PixelAt(*corner, x, y)[3], 255);
        }
    }
    EXPECT_GT(ink, 1000);
}

TEST(DocumentCacheBitmapTest, ADocumentInFrontKeepsThePictureOfItsFirstSpread)
{
    VantraController & application = VantraController::GetInstance();
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    DocumentBuilder().Paragraphs(12).BuildFile(path);
    NotificationRecorder recorder;
    OpenDocumentFailedNotification failure(path, true);
    Counted<DocumentController> const document = application.OpenDocument(path, failure);
    ASSERT_TRUE(document);
    auto const changes = [&] {
        auto const all = recorder.All<DocumentCacheBitmapChangedNotification>();
        for (auto const & notification : all) {
            EXPECT_EQ(notification->GetNode()->GetNodeIndex(), 0);
        }
        recorder.Clear();
        return all.size();
    };
    EXPECT_EQ(changes(), 1U);
    auto const first = document->GetDocumentCacheBitmap(0, false);
    ASSERT_TRUE(first);
    EXPECT_EQ(first->GetHeight(), 595);
    EXPECT_FALSE(document->GetDocumentCacheBitmap(1, true)) << "only the first spread has one";

    // An edit that shows there, and one that does not.
    auto const edit = [&] {
        application.EnqueueCommandAndWait(
            MakeCounted<InsertTextCommand>(
                "More. ", MakeCounted<Selection>(document->GetDocument()->GetMainFlow(), 0, 0)),
            document, false);
        application.EnqueueCommandAndWait(MakeCounted<ComposeTextCommand>(false, nullptr), document, false);
    };
    edit();
    EXPECT_EQ(changes(), 1U);
    auto const second = document->GetDocumentCacheBitmap(0, false);
    EXPECT_NE(second->GetPixels(), first->GetPixels());
    application.EnqueueCommandAndWait(MakeCounted<SetPDFBookmarkManagerCommand>(MakeCounted<PDFBookmarkManager>()),
                                      document, false);
    EXPECT_EQ(changes(), 0U);
    EXPECT_EQ(document->GetDocumentCacheBitmap(0, false), second);

    application.SetPreviewsWanted(false);
    edit();
    EXPECT_EQ(changes(), 0U) << "nobody wants pictures";
    application.SetPreviewsWanted(true);
    auto const current = document->GetDocumentCacheBitmap(0, true);
    EXPECT_NE(current->GetPixels(), second->GetPixels()) << "made at once where it has to be true";

    application.EnqueueCommandAndWait(
        Counted<VantraCommand>(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false)));
    EXPECT_FALSE(LoadTestDocument(path, nullptr)->GetDocumentCacheBitmap(0, true)) << "not in front";
}
