#include "framework/render/PrintPlacement.h"

#include "PageWriter.h"

#include <gtest/gtest.h>

#include <limits>

namespace Renderer
{
namespace
{

using Fit = Geometry::FitRect;

struct Row
{
    char const * why;
    std::uint32_t placement;
    OrientationEnum orientation;
    double scale;
    Kernel::Size paper;
    /// Paper, scale, and where the content comes to lie.
    Kernel::Size turned;
    double found;
    Kernel::Rect expected;
};

TEST(PrintPlacementTest, ContentGoesOnPaper)
{
    // Content of 100 by 200 at (10, 20) of its sheet.
    Kernel::Rect const content{10, 20, 110, 220};
    for (Row const & row : {
             Row{"centre", 0, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {100, 150, 200, 350}},
             Row{"top left", 1, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {0, 0, 100, 200}},
             Row{"top centre", 2, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {100, 0, 200, 200}},
             Row{"top right", 4, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {200, 0, 300, 200}},
             Row{"middle left", 8, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {0, 150, 100, 350}},
             Row{"middle right", 16, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {200, 150, 300, 350}},
             Row{"bottom left", 32, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {0, 300, 100, 500}},
             Row{"bottom centre", 64, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {100, 300, 200, 500}},
             Row{"bottom right", 128, OrientationPortrait, 1, {300, 500}, {300, 500}, 1, {200, 300, 300, 500}},
             Row{"scaled", 1, OrientationPortrait, 0.5, {300, 500}, {300, 500}, 0.5, {0, 0, 50, 100}},
             Row{"landscape turns the paper", 1, OrientationLandscape, 1, {300, 500}, {500, 300}, 1, {0, 0, 100, 200}},
             Row{"turned by the content's shape", 1, OrientationAuto, 1, {500, 300}, {300, 500}, 1, {0, 0, 100, 200}},
             Row{"fill: as large as the paper allows", Fit::Fill, OrientationPortrait, 9, {300, 500}, {300, 500}, 2.5,
                 {25, 0, 275, 500}},
             Row{"shrink: never larger", Fit::Shrink, OrientationPortrait, 9, {300, 500}, {300, 500}, 1, {100, 150, 200, 350}},
             Row{"shrink where the paper is too small", Fit::Shrink, OrientationPortrait, 9, {80, 100}, {80, 100}, 0.5,
                 {15, 0, 65, 100}},
             Row{"the sheet's margins count", Fit::FromOrigin | Fit::TopLeft, OrientationPortrait, 1, {300, 500}, {300, 500}, 1,
                 {10, 20, 110, 220}},
             Row{"and are kept behind the content when it is fitted", Fit::FromOrigin | Fit::TopLeft | Fit::Fill,
                 OrientationPortrait, 1, {60, 240}, {60, 240}, 0.5, {5, 10, 55, 110}},
             Row{"paper made to measure", Fit::Fill, OrientationLandscape, 2, {}, {200, 400}, 2, {0, 0, 200, 400}},
             Row{"a scale that is none", 1, OrientationPortrait, -3, {300, 500}, {300, 500}, 1, {0, 0, 100, 200}},
         }) {
        PaperPlacement const placed =
            PlaceOnPaper({content, 0, 0, row.orientation, static_cast<Fit::Type>(row.placement), row.scale}, row.paper);
        EXPECT_EQ(placed.m_Paper, row.turned) << row.why;
        EXPECT_EQ(placed.m_Scale, row.found) << row.why;
        EXPECT_EQ(placed.m_ToPaper.MapBounds(content), row.expected) << row.why;
    }
}

TEST(PrintPlacementTest, BleedAndMarksFindRoom)
{
    PrintContent content{{0, 0, 100, 200}, 5, 10, OrientationPortrait, Fit::Fill, 1};
    PaperPlacement const fitted = PlaceOnPaper(content, {240, 440});
    EXPECT_EQ(fitted.m_Scale, 2) << "440 less twice 10 for marks, over 200 with twice 5 of bleed";
    content.m_Scale = 2;
    PaperPlacement const measured = PlaceOnPaper(content, {});
    EXPECT_EQ(measured.m_Paper, (Kernel::Size{240, 440}));
    EXPECT_EQ(measured.m_ToPaper.MapBounds(content.m_Rect), (Kernel::Rect{20, 20, 220, 420}));
    EXPECT_EQ(PlaceOnPaper(content, {18, 18}).m_Scale, 1) << "no room at all: in its own size";

    double const nothing = std::numeric_limits<double>::quiet_NaN();
    for (Kernel::Rect const & rect : {Kernel::Rect::Empty(), Kernel::Rect{}, Kernel::Rect{0, 0, nothing, 1}}) {
        content.m_Rect = rect;
        EXPECT_EQ(PlaceOnPaper(content, {100, nothing}).m_Scale, 2);
        EXPECT_TRUE(PlaceOnPaper(content, {100, 100}).m_Scale > 0);
    }
}

TEST(PdfFormTest, APageIsInTheFileOnceAndSheetsShowItInAnySizeWithItsFontsOnce)
{
    PageWriter writer;
    RenderTree::DisplayList list;
    DrawText(list, Garamond(), 20, {20, 50}, u"Imposed", 0);
    list.FillRect({0, 100, 300, 200}, Raster::Colour::Rgb(1, 0, 0));
    int const form = writer.GetExport().AddForm(list, PageWriter::Page, nullptr);
    ASSERT_GE(form, 0);
    RenderTree::DisplayList empty;
    for (double const scale : {0.5, 1.0}) {
        RenderTree::PdfPage page;
        page.m_Boxes = PageBoxes::Plain(PageWriter::Page);
        page.m_Forms = {{form, Raster::AffineTransform::Params::Scale(scale, scale), {0, 0, 300 * scale, 150 * scale}}};
        writer.Write(empty, page, {});
    }
    PdfProbe & pdf = writer.Probe();
    EXPECT_EQ(pdf.Text(1), pdf.Text(2));
    EXPECT_NE(pdf.Text(1).find("Imposed"), std::string::npos);
    EXPECT_EQ(pdf.Fonts().find('\n'), pdf.Fonts().rfind('\n')) << pdf.Fonts();
    EXPECT_EQ(pdf.Value("1/Resources/XObject"), pdf.Value("2/Resources/XObject"));
    EXPECT_EQ(pdf.Value("1/Group"), "null") << "nothing in it is transparent";
    PdfProbe::Image const half = pdf.Draw(1);
    EXPECT_EQ(half.At(100, 60), 0xFF0000u) << "red from 50 to 75 where the clip ends";
    EXPECT_EQ(half.At(100, 80), 0xFFFFFFu) << "clipped";
    EXPECT_EQ(half.At(200, 60), 0xFFFFFFu) << "beyond the page's right edge";
    EXPECT_EQ(pdf.Draw(2).At(200, 120), 0xFF0000u);
}

}
}
