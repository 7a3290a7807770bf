#include "framework/kernel/Trace.h"
#include "framework/raster/ColourTransform.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/PngEncoder.h"
#include "framework/raster/Picture.h"

#include <gtest/gtest.h>
#include <algorithm>
#include <thread>

using namespace Raster;

namespace
{

TEST(ColourTest, ConversionsGoThroughTheProfilesAndKeepWhatIsInTheSpace)
{
    ICCManager::ICCProfileSet const set;
    auto const near = [](Colour const & a, Colour const & b, float tolerance) {
        EXPECT_EQ(a.m_Space, b.m_Space);
        EXPECT_EQ(a.m_Alpha, b.m_Alpha);
        for (std::size_t i = 0; i < 4; ++i) {
            EXPECT_NEAR(a.m_Components[i], b.m_Components[i], tolerance) << i;
        }
    };
    near(ConvertColour(Colour::Rgb(1, 1, 1, 0.5F), ColourSpace::Cmyk, set), Colour::Cmyk(0, 0, 0, 0, 0.5F), 0.01F);
    near(ConvertColour(Colour::Cmyk(0, 0, 0, 0), ColourSpace::Rgb, set), Colour::Rgb(1, 1, 1), 0.01F);
    near(ConvertColour(Colour::Grey(0.5F), ColourSpace::Rgb, set), Colour::Rgb(0.5F, 0.5F, 0.5F), 0.01F);
    near(ConvertColour(Colour::Rgb(0.5F, 0.5F, 0.5F), ColourSpace::Lab, set), Colour::Lab(53.4F, 0, 0), 0.3F);
    near(ConvertColour(Colour::Grey(0.25F), ColourSpace::Cmyk, set), Colour::Cmyk(0, 0, 0, 0.75F), 0);
    near(ConvertColour(Colour::Cmyk(0.1F, 0.2F, 0.3F, 0.4F), ColourSpace::Cmyk, set),
         Colour::Cmyk(0.1F, 0.2F, 0.3F, 0.4F), 0);
    // Printed cyan has no red to speak of.
    Colour const cyan = ConvertColour(Colour::Cmyk(1, 0, 0, 0), ColourSpace::Rgb, set);
    EXPECT_LT(cyan.m_Components[0], 0.2F);
    EXPECT_GT(cyan.m_Components[2], 0.7F);
}

TEST(ColourTest, OneTransformServesManyThreads)
{
    ICCManager & manager = ICCManager::GetInstance();
    auto const transform = ColourTransform::Get(
        manager.GetDefaultProfileForFormat(Format::Rgba8), ColourTransform::Layout::Channels8Alpha,
        manager.GetDefaultProfileForFormat(Format::Cmyka8), ColourTransform::Layout::Channels8Alpha,
        RenderingIntent::RelativeColorimetric, true);
    ASSERT_TRUE(transform);
    std::vector<std::uint8_t> source(4 * 4096);
    for (std::size_t i = 0; i < source.size(); ++i) {
        source[i] = static_cast<std::uint8_t>(i * 37 >> 3);
    }
    std::vector<std::uint8_t> expected(5 * 4096);
    transform->Convert(source.data(), expected.data(), 4096);
    EXPECT_EQ(expected[4], source[3]) << "alpha is kept";
    std::vector<std::thread> threads;
    std::atomic<int> wrong = 0;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < 20; ++round) {
                std::vector<std::uint8_t> result(expected.size());
                transform->Convert(source.data(), result.data(), 4096);
                wrong += result != expected;
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
}

TEST(ColourTest, ProfilesAreRefusedWithAReasonAndAreTheSameEveryTime)
{
    String reason;
    EXPECT_FALSE(ICCProfile::FromBytes({1, 2, 3}, reason));
    EXPECT_EQ(reason, "The colour profile is damaged.");
    std::vector<unsigned char> bytes = ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Cmyka8)->GetBytes();
    auto const again = ICCProfile::FromBytes(bytes, reason);
    ASSERT_TRUE(again);
    EXPECT_TRUE(again->IsSame(*ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Cmyka8)));
    EXPECT_EQ(again->GetDescription(), "FOGRA39L Coated");
    ICCManager::ICCProfileSet a;
    ICCManager::ICCProfileSet b;
    a.m_Cmyk = again;
    b.m_Cmyk = ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Cmyka8);
    EXPECT_EQ(a, b);
    EXPECT_FALSE(ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Alpha8));
}

TEST(ColourTest, APixelHasItsColourInEveryFormat)
{
    struct Row
    {
        Format m_Format;
        std::vector<double> m_Values;
    };
    Row const rows[] = {
        {Format::Rgba8, {255, 128, 0, 51}},
        {Format::Rgba16, {65535, 32896, 0, 13107}},
        {Format::GreyAlpha8, {151, 51}},
        {Format::Cmyka8, {0, 127, 255, 0, 51}},
        {Format::Alpha16, {13107}},
        {Format::RgbaFloat, {1, 128.0 / 255, 0, 0.2}},
    };
    for (Row const & row : rows) {
        DynamicBuffer buffer;
        buffer.Create(3, 2, row.m_Format);
        buffer.Fill(DynamicPixel({255, 128, 0, 51}, row.m_Format));
        std::uint8_t const * last = buffer.GetRow(1) + 2 * BytesPerPixel(row.m_Format);
        for (std::size_t i = 0; i < row.m_Values.size(); ++i) {
            double const value = BytesPerChannel(row.m_Format) == 1   ? last[i]
                                 : BytesPerChannel(row.m_Format) == 2 ? reinterpret_cast<std::uint16_t const *>(last)[i]
                                                                      : reinterpret_cast<float const *>(last)[i];
            EXPECT_NEAR(value, row.m_Values[i], 1e-6) << static_cast<int>(row.m_Format) << ", channel " << i;
        }
        buffer.Clear(nullptr);
        EXPECT_EQ(last[0], 0);
    }
    DynamicPixel const white({255, 255, 255, 255}, Format::Laba16);
    EXPECT_NEAR(reinterpret_cast<std::uint16_t const *>(white.GetBytes())[0], 65535, 20);
    EXPECT_NEAR(reinterpret_cast<std::uint16_t const *>(white.GetBytes())[1], 32896, 30);
}

/// The default RGB profile without the numbers that its colours are made from.
Kernel::Consolidated<ICCProfile> HollowProfile()
{
    std::vector<unsigned char> bytes = ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8)->GetBytes();
    for (std::string_view const tag : {"rXYZ", "gXYZ", "bXYZ"}) {
        auto const at = std::search(bytes.begin() + 128, bytes.end(), tag.begin(), tag.end());
        *(at + 3) = '?';
    }
    String reason;
    return ICCProfile::FromBytes(bytes, reason);
}

TEST(ColourTest, ProfilesWithoutATransformAreTracedAndColoursGoByPlainArithmetic)
{
    std::vector<std::string> lines;
    Kernel::SetTraceTarget([&lines](String const & line) { lines.push_back(line.ToStd()); });
    DynamicBuffer buffer;
    buffer.Create(2, 2, Format::Cmyka8);
    buffer.Fill(DynamicPixel({51, 102, 153, 255}, Format::Cmyka8));
    auto const hollow = HollowProfile();
    ASSERT_TRUE(hollow);
    auto const bitmap = ConvertBitmap(buffer, nullptr, Format::Rgba8, hollow, RenderingIntent::Perceptual, true);
    Kernel::SetTraceTarget({});
    ASSERT_TRUE(bitmap);
    EXPECT_EQ(std::vector<int>(bitmap->GetRow(1), bitmap->GetRow(1) + 4), (std::vector<int>{51, 102, 153, 255}));
    EXPECT_EQ(lines, (std::vector<std::string>{
                         "Colour engine failed to create transform between FOGRA39L Coated and sRGB\r\n"}));
    // A profile of other colours than the bitmap's does not apply either.
    auto const grey = ICCManager::GetInstance().GetDefaultProfileForFormat(Format::GreyAlpha8);
    auto const mismatched = ConvertBitmap(buffer, grey, Format::Rgba8, nullptr, RenderingIntent::Perceptual, true);
    EXPECT_EQ(mismatched->GetPixels(), bitmap->GetPixels());
}

TEST(ColourTest, ProfilesConvertBetweenAllFormatsWithColours)
{
    Format const formats[] = {Format::Rgba8,  Format::Rgba16, Format::GreyAlpha8, Format::GreyAlpha16,
                              Format::Cmyka8, Format::Laba16, Format::RgbaFloat};
    DynamicBuffer buffer;
    buffer.Create(3, 1, Format::Rgba8);
    std::uint8_t const greys[] = {255, 255, 255, 255, 128, 128, 128, 77, 64, 64, 64, 255};
    std::copy(std::begin(greys), std::end(greys), buffer.GetRow(0));
    for (Format const there : formats) {
        auto const first = ConvertBitmap(buffer, nullptr, there, nullptr, RenderingIntent::RelativeColorimetric, true);
        ASSERT_TRUE(first);
        EXPECT_EQ(first->GetFormat(), there);
        for (Format const next : formats) {
            auto const second = ConvertBitmap(*first, nullptr, next, nullptr, RenderingIntent::RelativeColorimetric, true);
            auto const back =
                ConvertBitmap(*second, nullptr, Format::Rgba8, nullptr, RenderingIntent::RelativeColorimetric, true);
            for (int i = 0; i < 12; ++i) {
                EXPECT_NEAR(back->GetRow(0)[i], greys[i], i % 4 == 3 ? 0 : 6)
                    << static_cast<int>(there) << " " << static_cast<int>(next) << ", channel " << i;
            }
        }
    }
    EXPECT_FALSE(ConvertBitmap(buffer, nullptr, Format::Alpha8, nullptr, RenderingIntent::Perceptual, true));
}

TEST(ColourTest, APngStatesTheProfileThatItsNumbersAreMeantIn)
{
    auto const standard = ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8);
    std::vector<unsigned char> bytes = standard->GetBytes();
    bytes[25] ^= 1;
    String reason;
    auto const other = ICCProfile::FromBytes(bytes, reason);
    for (auto const & profile : {standard, other}) {
        DynamicBuffer buffer;
        buffer.Create(4, 2, Format::Rgba8);
        auto const data = Kernel::MakeCounted<CompressedRasterData>();
        ExportOptions options;
        options.m_Dpi = 300;
        PNGBase png(data, 4, 2, options);
        ASSERT_TRUE(png.Write(buffer, nullptr, profile, RenderingIntent::RelativeColorimetric, true));
        auto const raw = data->RelinquishOwnership();
        EXPECT_TRUE(data->GetBytes().empty()) << "the bytes were given away";
        PictureProblem problem;
        auto const picture = Picture::FromBytes(
            std::make_shared<std::vector<unsigned char>>(raw->GetData(), raw->GetData() + raw->GetSize()), "x", problem);
        ASSERT_TRUE(picture) << problem.m_Text;
        EXPECT_NEAR(picture->GetInfo().m_DpiX, 300, 0.01);
        auto const read = picture->ReadProfile();
        ASSERT_EQ(static_cast<bool>(read), profile == other) << "sRGB is named, not embedded";
        EXPECT_TRUE(!read || read->IsSame(*other));
    }
}

TEST(ColourTest, AnEncodedPngReadsBackInEveryFormatWithColours)
{
    for (Format const format : {Format::Rgba8, Format::Rgba16, Format::GreyAlpha8, Format::GreyAlpha16, Format::Cmyka8,
                                Format::Laba16, Format::RgbaFloat}) {
        DynamicBuffer buffer;
        buffer.Create(5, 3, format);
        buffer.Fill(DynamicPixel({255, 255, 255, 128}, format));
        auto const data = Kernel::MakeCounted<CompressedRasterData>();
        PNGBase png(data, 5, 3, ExportOptions());
        ICCManager & manager = ICCManager::GetInstance();
        ASSERT_TRUE(png.Write(buffer, nullptr, manager.GetDefaultProfileForFormat(Format::Rgba8),
                              RenderingIntent::RelativeColorimetric, true));
        auto const raw = data->RelinquishOwnership();
        PictureProblem problem;
        auto const picture = Picture::FromBytes(
            std::make_shared<std::vector<unsigned char>>(raw->GetData(), raw->GetData() + raw->GetSize()), "x", problem);
        ASSERT_TRUE(picture) << problem.m_Text;
        auto const bitmap = picture->Decode(problem);
        ASSERT_TRUE(bitmap) << problem.m_Text;
        std::uint8_t const * last = bitmap->GetRow(2) + 16;
        for (int i = 0; i < 3; ++i) {
            EXPECT_GE(last[i], 253) << static_cast<int>(format);
        }
        EXPECT_EQ(last[3], 128) << static_cast<int>(format);
    }
    DynamicBuffer alpha;
    alpha.Create(5, 3, Format::Alpha8);
    PNGBase png(Kernel::MakeCounted<CompressedRasterData>(), 5, 3, ExportOptions());
    EXPECT_FALSE(png.Write(alpha, nullptr, ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8),
                           RenderingIntent::RelativeColorimetric, true));
}

}
