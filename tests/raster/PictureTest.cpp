#include "framework/raster/Picture.h"
#include "framework/raster/Resample.h"
#include "support/TemporaryFolder.h"

#include <fstream>
#include <gtest/gtest.h>
#include <random>

using namespace Raster;

namespace
{

std::string const Images = std::string(KORVANE_SOURCE_FOLDER) + "/tests/raster/images/";

std::string Bytes(std::string const & path)
{
    std::ifstream file(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(file), {});
}

Kernel::Counted<Picture const> FromText(std::string const & data, PictureProblem & problem)
{
    auto bytes = std::make_shared<std::vector<unsigned char>>(data.begin(), data.end());
    return Picture::FromBytes(bytes, "memory", problem);
}

TEST(PictureTest, HeadersTellWhatThePixelsWillBe)
{
    struct Row
    {
        char const * m_Name;
        int m_Width;
        int m_Height;
        ColourSpace m_Space;
        int m_Bits;
        bool m_Alpha;
        double m_Dpi;
        Format m_Format;
    };
    Row const rows[] = {
        {"alpha.png", 48, 32, ColourSpace::Rgb, 8, true, 0, Format::Rgba8},
        {"grey16.png", 64, 8, ColourSpace::Grey, 16, false, 300, Format::GreyAlpha16},
        {"rgb16.png", 16, 16, ColourSpace::Rgb, 16, false, 300, Format::Rgba16},
        {"palette-interlaced.png", 40, 30, ColourSpace::Rgb, 8, false, 0, Format::Rgba8},
        {"bits1.png", 19, 7, ColourSpace::Grey, 8, false, 0, Format::GreyAlpha8},
        {"palette-transparent.png", 16, 16, ColourSpace::Rgb, 8, true, 0, Format::Rgba8},
        {"cmyk.jpg", 32, 16, ColourSpace::Cmyk, 8, false, 150, Format::Cmyka8},
        {"grey.jpg", 32, 16, ColourSpace::Grey, 8, false, 200, Format::GreyAlpha8},
        {"profile.jpg", 32, 16, ColourSpace::Rgb, 8, false, 72, Format::Rgba8},
    };
    for (Row const & row : rows) {
        PictureProblem problem;
        auto const picture = Picture::FromFile(Images + row.m_Name, problem);
        ASSERT_TRUE(picture) << problem.m_Text;
        PictureInfo const & info = picture->GetInfo();
        EXPECT_EQ(info.m_Width, row.m_Width) << row.m_Name;
        EXPECT_EQ(info.m_Height, row.m_Height) << row.m_Name;
        EXPECT_EQ(info.m_Space, row.m_Space) << row.m_Name;
        EXPECT_EQ(info.m_BitsPerChannel, row.m_Bits) << row.m_Name;
        EXPECT_EQ(info.m_HasAlpha, row.m_Alpha) << row.m_Name;
        EXPECT_NEAR(info.m_DpiX, row.m_Dpi, 0.1) << row.m_Name;
        EXPECT_FALSE(info.m_WrongExtension) << row.m_Name;
        auto const pixels = picture->Decode(problem);
        ASSERT_TRUE(pixels) << problem.m_Text;
        EXPECT_EQ(pixels->GetFormat(), row.m_Format) << row.m_Name;
    }
}

TEST(PictureTest, PixelsHaveTheirValuesInEveryForm)
{
    PictureProblem problem;
    auto const pixel = [&](char const * name, int x, int y) {
        auto const picture = Picture::FromFile(Images + name, problem);
        auto const bitmap = picture ? picture->Decode(problem) : nullptr;
        EXPECT_TRUE(bitmap) << problem.m_Text;
        std::vector<int> values;
        int const channels = bitmap ? ChannelCount(bitmap->GetFormat()) : 0;
        for (int i = 0; i < channels; ++i) {
            std::uint8_t const * row = bitmap->GetRow(y);
            int const at = x * channels + i;
            values.push_back(BytesPerChannel(bitmap->GetFormat()) == 2
                                 ? reinterpret_cast<std::uint16_t const *>(row)[at]
                                 : row[at]);
        }
        return values;
    };
    EXPECT_EQ(pixel("alpha.png", 10, 0), (std::vector<int>{255, 0, 128, 50}));
    EXPECT_EQ(pixel("grey16.png", 63, 0), (std::vector<int>{0x8000 + 63, 65535}));
    EXPECT_EQ(pixel("rgb16.png", 1, 2), (std::vector<int>{257, 514, 40000, 65535}));
    EXPECT_EQ(pixel("palette-transparent.png", 0, 0), (std::vector<int>{10, 20, 30, 0}));
    EXPECT_EQ(pixel("palette-transparent.png", 1, 0)[3], 255);
    EXPECT_EQ(pixel("palette-interlaced.png", 3, 5), (std::vector<int>{70, 60, 50, 255}));
    EXPECT_EQ(pixel("bits1.png", 0, 0), (std::vector<int>{255, 255}));
    EXPECT_EQ(pixel("bits1.png", 1, 0), (std::vector<int>{0, 255}));
    // Full cyan ink; the file stores it inverted, as its Adobe marker says.
    std::vector<int> const cyan = pixel("cmyk.jpg", 4, 4);
    EXPECT_NEAR(cyan.at(0), 255, 3);
    EXPECT_NEAR(cyan.at(1), 0, 3);
    EXPECT_NEAR(cyan.at(3), 0, 3);
}

TEST(PictureTest, AllEightOrientationsComeOutUpright)
{
    // Stored so that the upright picture always has red at the top left, green at the top right and blue below them.
    for (int orientation = 1; orientation <= 8; ++orientation) {
        PictureProblem problem;
        auto const picture =
            Picture::FromFile(Images + "orientation" + std::to_string(orientation) + ".jpg", problem);
        ASSERT_TRUE(picture) << problem.m_Text;
        EXPECT_EQ(picture->GetInfo().m_Orientation, orientation);
        EXPECT_EQ(picture->GetInfo().UprightWidth(), 32);
        EXPECT_EQ(picture->GetInfo().UprightHeight(), 48);
        auto const bitmap = picture->Decode(problem);
        ASSERT_TRUE(bitmap) << problem.m_Text;
        ASSERT_EQ(bitmap->GetWidth(), 32);
        auto const strongest = [&](int x, int y) {
            std::uint8_t const * p = bitmap->GetRow(y) + x * 4;
            return p[0] > 200 ? 'r' : p[1] > 200 ? 'g' : p[2] > 200 ? 'b' : '?';
        };
        EXPECT_EQ((std::string{strongest(4, 4), strongest(28, 4), strongest(4, 40), strongest(28, 40)}), "rgbb")
            << "orientation " << orientation;
    }
}

TEST(PictureTest, ContentCountsAndNotTheName)
{
    TemporaryFolder folder;
    PictureProblem problem;
    auto const picture = Picture::FromFile(folder.WriteFile("photo.png", Bytes(Images + "grey.jpg")), problem);
    ASSERT_TRUE(picture) << problem.m_Text;
    EXPECT_EQ(picture->GetInfo().m_Kind, PictureKind::Jpeg);
    EXPECT_TRUE(picture->GetInfo().m_WrongExtension);
}

TEST(PictureTest, WhatIsNoSoundPictureIsRefusedWithAReason)
{
    using Code = PictureProblem::Code;
    auto const patched = [](std::string bytes, std::size_t at, std::string const & with) {
        return bytes.replace(at, with.size(), with);
    };
    std::string const png = Bytes(Images + "rgb16.png");
    std::string const jpeg = Bytes(Images + "profile.jpg");
    struct Row
    {
        char const * m_Why;
        std::string m_Bytes;
        Code m_Open;
        Code m_Decode;
    };
    Row const rows[] = {
        {"empty", "", Code::UnknownKind, Code::None},
        {"text", "GIF89a and so on", Code::UnknownKind, Code::None},
        {"signature only", png.substr(0, 8), Code::Truncated, Code::None},
        {"cut in the header", png.substr(0, 20), Code::Truncated, Code::None},
        {"cut in the pixels", png.substr(0, png.size() - 40), Code::None, Code::Truncated},
        {"a flipped byte in the header", patched(png, 17, "\x7F"), Code::Corrupt, Code::None},
        {"a flipped byte in the pixels", patched(png, png.size() - 60, "\x55\xAA"), Code::None, Code::Corrupt},
        {"cut in JPEG data", jpeg.substr(0, jpeg.size() - 10), Code::None, Code::Truncated},
        {"cut before the frame", jpeg.substr(0, 30), Code::Truncated, Code::None},
        {"a marker missing", patched(jpeg, 20, "\x01\x02"), Code::Corrupt, Code::None},
    };
    for (Row const & row : rows) {
        PictureProblem problem;
        auto const picture = FromText(row.m_Bytes, problem);
        EXPECT_EQ(problem.m_Code, row.m_Open) << row.m_Why << ": " << problem.m_Text;
        EXPECT_EQ(static_cast<bool>(picture), row.m_Open == Code::None) << row.m_Why;
        if (picture) {
            EXPECT_FALSE(picture->Decode(problem)) << row.m_Why;
            EXPECT_EQ(problem.m_Code, row.m_Decode) << row.m_Why << ": " << problem.m_Text;
        }
        if (problem.m_Code != Code::None) {
            EXPECT_EQ(problem.m_Text.View().substr(0, 19), "The picture memory ") << row.m_Why;
        }
    }
    PictureProblem problem;
    EXPECT_FALSE(Picture::FromFile(Images + "none.png", problem));
    EXPECT_EQ(problem.m_Code, Code::NotFound);
    EXPECT_FALSE(Picture::FromFile(Images, problem));
    EXPECT_EQ(problem.m_Code, Code::UnknownKind);
}

TEST(PictureTest, ADeclaredSizeTakesNoMemoryThatTheDataCantFill)
{
    // A sound header of 14,000 by 14,000 pixels of 8 bytes, and hardly any data.
    PictureProblem problem;
    auto const picture = Picture::FromFile(Images + "bomb.png", problem);
    ASSERT_TRUE(picture) << problem.m_Text;
    EXPECT_FALSE(picture->Decode(problem));
    EXPECT_EQ(problem.m_Code, PictureProblem::Code::Truncated);
    EXPECT_FALSE(Picture::FromFile(Images + "huge.png", problem));
    EXPECT_EQ(problem.m_Code, PictureProblem::Code::TooLarge);
}

TEST(PictureTest, DamageAnywhereNeverCrashes)
{
    std::mt19937 random(7);
    for (char const * name : {"alpha.png", "palette-interlaced.png", "cmyk.jpg", "orientation6.jpg", "profile.jpg"}) {
        std::string const sound = Bytes(Images + name);
        for (int round = 0; round < 300; ++round) {
            std::string bytes = sound;
            for (int i = 0; i < 3; ++i) {
                bytes[random() % bytes.size()] = static_cast<char>(random());
            }
            bytes.resize(round % 3 == 0 ? random() % bytes.size() : bytes.size());
            PictureProblem problem;
            if (auto const picture = FromText(bytes, problem)) {
                if (static_cast<long>(picture->GetInfo().m_Width) * picture->GetInfo().m_Height < 1'000'000) {
                    static_cast<void>(picture->Decode(problem));
                }
                static_cast<void>(picture->ReadProfile());
            }
        }
    }
}

TEST(PictureTest, AnEmbeddedProfileIsFound)
{
    PictureProblem problem;
    auto const picture = Picture::FromFile(Images + "profile.jpg", problem);
    ASSERT_TRUE(picture);
    ASSERT_TRUE(picture->ReadProfile());
    EXPECT_EQ(picture->ReadProfile()->GetSpace(), ColourSpace::Rgb);
    EXPECT_FALSE(Picture::FromFile(Images + "grey.jpg", problem)->ReadProfile());
}

TEST(PictureTest, ReducingWeighsColoursByTheirAlpha)
{
    DynamicBitmap bitmap;
    bitmap.Create(3, 2, Format::Rgba8, MipmapMode::None, HardwareCachePolicy::Default);
    std::uint8_t const opaque[] = {200, 100, 0, 255};
    std::copy(std::begin(opaque), std::end(opaque), bitmap.GetRow(0));
    std::copy(std::begin(opaque), std::end(opaque), bitmap.GetRow(1) + 8);
    auto const reduced = Reduce(bitmap, 1, 1);
    // A third is covered; the colour is not mixed with that of nothing.
    EXPECT_EQ(std::vector<int>(reduced->GetRow(0), reduced->GetRow(0) + 4), (std::vector<int>{200, 100, 0, 85}));
}

}
