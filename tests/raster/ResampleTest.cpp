#include "framework/raster/Resample.h"
#include "framework/raster/PixelConversion.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace Raster;
using Transform = AffineTransform::Params;

namespace
{

constexpr Format WithColours[] = {Format::Rgba8,  Format::Rgba16, Format::GreyAlpha8, Format::GreyAlpha16,
                                  Format::Cmyka8, Format::Laba16, Format::RgbaFloat};

/// An opaque grey bitmap of these values, row by row.
Kernel::Counted<DynamicBitmap> Greys(int width, std::vector<int> const & values)
{
    auto const bitmap = Kernel::MakeCounted<DynamicBitmap>();
    bitmap->Create(width, static_cast<int>(values.size()) / width, Format::GreyAlpha8, MipmapMode::None,
                   HardwareCachePolicy::Default);
    for (std::size_t i = 0; i < values.size(); ++i) {
        std::uint8_t * const pixel = bitmap->GetRow(static_cast<int>(i) / width) + i % static_cast<std::size_t>(width) * 2;
        pixel[0] = static_cast<std::uint8_t>(values[i]);
        pixel[1] = 255;
    }
    return bitmap;
}

/// Grey values of a buffer; -1 for a transparent pixel, a negative alpha for one that is half transparent.
std::vector<int> ValuesOf(DynamicBase const & buffer)
{
    std::vector<int> values;
    for (std::size_t i = 0; i < buffer.GetPixels().size(); i += 2) {
        int const alpha = buffer.GetPixels()[i + 1];
        values.push_back(alpha == 255 ? buffer.GetPixels()[i] : alpha == 0 ? -1 : -alpha);
    }
    return values;
}

}

TEST(ResampleTest, PixelsAreMeansOfWhatTheyCoverOrLieBetweenTheirNeighbours)
{
    struct Row
    {
        char const * m_Why;
        int m_SourceWidth;
        std::vector<int> m_Source;
        int m_Width;
        int m_Height;
        Transform m_ToSource;
        std::vector<int> m_Result;
    };
    Row const rows[] = {
        {"as it is", 3, {10, 20, 30}, 3, 1, {}, {10, 20, 30}},
        {"pairs", 4, {0, 100, 200, 255}, 2, 1, Transform::Scale(2, 1), {50, 228}},
        {"one and a half each", 3, {0, 90, 180}, 2, 1, Transform::Scale(1.5, 1), {30, 150}},
        {"both ways", 2, {0, 40, 80, 120}, 1, 1, Transform::Scale(2, 2), {60}},
        {"to twice the width", 2, {0, 200}, 4, 1, Transform::Scale(0.5, 1), {0, 50, 150, 200}},
        {"wider and lower", 2, {0, 200, 100, 100}, 4, 1, Transform::Scale(0.5, 2), {50, 75, 125, 150}},
        {"mirrored", 3, {10, 20, 30}, 3, 1, {-1, 0, 0, 1, 3, 0}, {30, 20, 10}},
        {"moved half a pixel beside it", 2, {60, 80}, 3, 1, Transform::Translation(-0.5, 0), {-128, 70, -128}},
        {"beside it", 2, {60, 80}, 3, 1, Transform::Translation(1, 0), {80, -1, -1}},
        {"far beside it", 2, {60, 80}, 1, 1, Transform::Translation(1e300, -1e300), {-1}},
        {"turned a quarter", 3, {1, 2, 3, 4, 5, 6}, 2, 3, {0, -1, 1, 0, 0, 2}, {4, 1, 5, 2, 6, 3}},
        {"flattened to nothing", 2, {60, 80}, 1, 1, Transform::Scale(0, 1), {-1}},
    };
    for (Row const & row : rows) {
        DynamicBuffer buffer;
        buffer.Create(row.m_Width, row.m_Height, Format::GreyAlpha8);
        Resample(*Greys(row.m_SourceWidth, row.m_Source), row.m_ToSource, buffer);
        EXPECT_EQ(ValuesOf(buffer), row.m_Result) << row.m_Why;
    }
}

TEST(ResampleTest, OpaqueWhiteStaysOpaqueWhiteInEveryFormat)
{
    Transform const transforms[] = {Transform::Scale(37 / 9.0, 23 / 7.0), Transform::Scale(37 / 100.0, 23 / 71.0),
                                    Transform::Scale(37 / 36.0, 23 / 24.0)};
    for (Format const format : WithColours) {
        DynamicBitmap bitmap;
        bitmap.Create(37, 23, format, MipmapMode::OnDemand, HardwareCachePolicy::Default);
        DynamicPixel const white({255, 255, 255, 255}, format);
        bitmap.Fill(white);
        for (Transform const & transform : transforms) {
            DynamicBuffer buffer;
            buffer.Create(static_cast<int>(37 / transform.a + 0.5), static_cast<int>(23 / transform.d + 0.5), format);
            DynamicBuffer expected = buffer;
            expected.Fill(white);
            Resample(bitmap, transform, buffer);
            EXPECT_EQ(buffer.GetPixels(), expected.GetPixels())
                << "format " << static_cast<int>(format) << ", scale " << transform.a;
        }
        // Turned, the middle of it.
        DynamicBuffer turned;
        turned.Create(4, 4, format);
        DynamicBuffer expected = turned;
        expected.Fill(white);
        Resample(bitmap, Transform::Rotation(0.3).Then(Transform::Translation(15, 10)), turned);
        std::vector<float> pixels(16 * 4);
        ToFloatPixels(format, turned.GetPixels().data(), pixels.data(), 16);
        EXPECT_GT(*std::min_element(pixels.begin(), pixels.end()), 0.999F) << static_cast<int>(format);
    }
}

TEST(ResampleTest, EdgesDoNotDarkenWhateverColourTheTransparentPixelsHave)
{
    for (Format const format : WithColours) {
        DynamicBitmap bitmap;
        bitmap.Create(4, 1, format, MipmapMode::OnDemand, HardwareCachePolicy::Default);
        bitmap.Fill(DynamicPixel({0, 0, 0, 0}, format));
        DynamicPixel const white({255, 255, 255, 255}, format);
        std::copy_n(white.GetBytes(), BytesPerPixel(format), bitmap.GetRow(0));
        for (Transform const & transform : {Transform::Scale(2, 1), Transform::Scale(4, 1), Transform::Scale(0.3, 1)}) {
            DynamicBuffer onNothing;
            onNothing.Create(static_cast<int>(4 / transform.a), 1, format);
            DynamicBuffer onWhite = onNothing;
            onWhite.Fill(white);
            DynamicBuffer const expected = onWhite;
            Resample(bitmap, transform, onWhite);
            EXPECT_EQ(onWhite.GetPixels(), expected.GetPixels()) << static_cast<int>(format);

            Resample(bitmap, transform, onNothing);
            float first[4];
            ToFloatPixels(format, onNothing.GetRow(0), first, 1);
            EXPECT_NEAR(first[0], 1, 1e-3) << static_cast<int>(format);
            EXPECT_NEAR(first[3], std::min(1.0, 1 / transform.a), 3e-3) << static_cast<int>(format);
        }
    }
}

TEST(ResampleTest, HalfTransparentColourLiesOverWhatIsThere)
{
    DynamicBitmap red;
    red.Create(1, 1, Format::Rgba8, MipmapMode::None, HardwareCachePolicy::Default);
    red.Fill(DynamicPixel({255, 0, 0, 128}, Format::Rgba8));
    DynamicBuffer buffer;
    buffer.Create(2, 2, Format::Rgba8);
    buffer.Fill(DynamicPixel({255, 255, 255, 255}, Format::Rgba8));
    Resample(red, Transform::Scale(0.5, 0.5), buffer);
    EXPECT_EQ(std::vector<int>(buffer.GetRow(1) + 4, buffer.GetRow(1) + 8), (std::vector<int>{255, 127, 127, 255}));
    // A bitmap of another format takes the buffer's.
    Resample(*Greys(1, {51}), Transform::Scale(0.5, 0.5), buffer);
    EXPECT_EQ(std::vector<int>(buffer.GetRow(0), buffer.GetRow(0) + 4), (std::vector<int>{51, 51, 51, 255}));
}
