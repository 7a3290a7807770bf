#include "framework/raster/PixelConversion.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>

using namespace Raster;

namespace
{

/// The channels of one pixel as numbers of their own size.
std::vector<double> ChannelsOf(Format format, std::uint8_t const * bytes)
{
    std::vector<double> channels;
    for (int i = 0; i < ChannelCount(format); ++i) {
        std::uint16_t deep = 0;
        float wide = 0;
        switch (BytesPerChannel(format)) {
        case 1:
            channels.push_back(bytes[i]);
            break;
        case 2:
            std::memcpy(&deep, bytes + 2 * i, 2);
            channels.push_back(deep);
            break;
        default:
            std::memcpy(&wide, bytes + 4 * i, 4);
            channels.push_back(static_cast<double>(wide));
            break;
        }
    }
    return channels;
}

}

TEST(PixelConversionTest, FloatsBecomeChannelsByTheRuleOfTheFormat)
{
    struct Row
    {
        Format m_Format;
        float m_From[4];
        std::vector<double> m_To;
        double m_Tolerance = 0;
    };
    float const nan = std::nanf("");
    Row const rows[] = {
        // 0.1 of 255 is 25.5: rounded, not cut.
        {Format::Rgba8, {-0.5F, 0.1F, 1.5F, 0.5F}, {0, 26, 255, 128}},
        {Format::Rgba8, {nan, nan, 0, nan}, {0, 0, 0, 0}},
        {Format::Rgba16, {0.5F, 1.0F, 0.25F, 2.0F}, {32768, 65535, 16384, 65535}},
        // 0.299 * 0.2 + 0.587 * 0.4 + 0.114 * 0.6 = 0.363
        {Format::GreyAlpha8, {0.2F, 0.4F, 0.6F, 0.5F}, {93, 128}},
        {Format::GreyAlpha16, {0.2F, 0.4F, 0.6F, 0.5F}, {23789, 32768}},
        // Black 0.4, of the other 0.6 cyan has two thirds and magenta one.
        {Format::Cmyka8, {0.2F, 0.4F, 0.6F, 1}, {170, 85, 0, 102, 255}},
        {Format::Cmyka8, {0, 0, 0, 1}, {0, 0, 0, 255, 255}},
        {Format::Cmyka8, {1, 1, 1, 0}, {0, 0, 0, 0, 0}},
        {Format::Laba16, {1, 1, 1, 1}, {65535, 32896, 32896, 65535}},
        {Format::Laba16, {0, 0, 0, 1}, {0, 32896, 32896, 65535}},
        // sRGB red is L 54.29, a 80.81, b 69.89 under D50.
        {Format::Laba16, {1, 0, 0, 1}, {35580, 53665, 50856, 65535}, 4},
        {Format::Alpha8, {1, 1, 1, 0.5F}, {128}},
        {Format::RgbaFloat, {-2, 0.5F, 7, 1}, {-2, 0.5, 7, 1}},
    };
    for (Row const & row : rows) {
        alignas(float) std::uint8_t bytes[16] = {};
        FromFloatPixels(row.m_Format, row.m_From, bytes, 1);
        std::vector<double> const found = ChannelsOf(row.m_Format, bytes);
        ASSERT_EQ(found.size(), row.m_To.size());
        for (std::size_t i = 0; i < found.size(); ++i) {
            EXPECT_NEAR(found[i], row.m_To[i], row.m_Tolerance)
                << "format " << static_cast<int>(row.m_Format) << ", channel " << i;
        }
    }
}

TEST(PixelConversionTest, ChannelsBecomeFloatsByTheRuleOfTheFormat)
{
    struct Row
    {
        Format m_Format;
        std::vector<std::uint16_t> m_From;
        float m_To[4];
    };
    Row const rows[] = {
        {Format::Rgba8, {0, 51, 255, 102}, {0, 0.2F, 1, 0.4F}},
        {Format::Rgba16, {0, 13107, 65535, 26214}, {0, 0.2F, 1, 0.4F}},
        {Format::GreyAlpha8, {51, 102}, {0.2F, 0.2F, 0.2F, 0.4F}},
        {Format::GreyAlpha16, {13107, 26214}, {0.2F, 0.2F, 0.2F, 0.4F}},
        {Format::Cmyka8, {170, 85, 0, 102, 51}, {0.2F, 0.4F, 0.6F, 0.2F}},
        {Format::Cmyka8, {255, 0, 0, 255, 255}, {0, 0, 0, 1}},
        {Format::Laba16, {65535, 32896, 32896, 65535}, {1, 1, 1, 1}},
        {Format::Laba16, {35580, 53665, 50856, 0}, {1, 0, 0, 0}},
        {Format::Alpha8, {51}, {0, 0, 0, 0.2F}},
    };
    for (Row const & row : rows) {
        std::vector<std::uint8_t> bytes;
        for (std::uint16_t const value : row.m_From) {
            bytes.push_back(static_cast<std::uint8_t>(value & 0xFF));
            if (BytesPerChannel(row.m_Format) == 2) {
                bytes.push_back(static_cast<std::uint8_t>(value >> 8));
            }
        }
        float found[4];
        ToFloatPixels(row.m_Format, bytes.data(), found, 1);
        for (int i = 0; i < 4; ++i) {
            EXPECT_NEAR(found[i], row.m_To[i], row.m_Format == Format::Laba16 ? 2e-3 : 1e-6)
                << "format " << static_cast<int>(row.m_Format) << ", channel " << i;
        }
    }
}

TEST(PixelConversionTest, AnEightBitColourComesBackFromEveryFormatThatCanHoldIt)
{
    for (Format const format : {Format::Rgba8, Format::Rgba16, Format::Laba16, Format::RgbaFloat}) {
        DynamicBuffer colours;
        colours.Create(6 * 6 * 6, 1, Format::Rgba8);
        for (int i = 0; i < colours.GetWidth(); ++i) {
            std::uint8_t const pixel[] = {static_cast<std::uint8_t>(i % 6 * 51), static_cast<std::uint8_t>(i / 6 % 6 * 51),
                                          static_cast<std::uint8_t>(i / 36 * 51), static_cast<std::uint8_t>(i)};
            std::memcpy(colours.GetRow(0) + 4 * i, pixel, 4);
        }
        DynamicBuffer there;
        there.Create(colours.GetWidth(), 1, format);
        ConvertPixels(colours, there);
        DynamicBuffer back;
        back.Create(colours.GetWidth(), 1, Format::Rgba8);
        ConvertPixels(there, back);
        EXPECT_EQ(back.GetPixels(), colours.GetPixels()) << static_cast<int>(format);
    }
}
