#include "framework/render/PdfPictures.h"

#include "framework/kernel/Format.h"
#include "framework/raster/ICCManager.h"
#include "framework/raster/PictureReader.h"
#include "framework/raster/Resample.h"
#include "framework/render/PdfText.h"

#include <cmath>
#include <cstring>
#include <libdeflate.h>
#include <memory>

namespace Renderer::RenderTree
{

namespace
{

/// Pictures are left alone until they exceed the limit by this much: a reduction by less gains little and blurs.
constexpr double LimitTolerance = 1.2;

std::string_view AsText(unsigned char const * bytes, std::size_t size)
{
    return {reinterpret_cast<char const *>(bytes), size};
}

char const * DeviceSpace(Raster::ColourSpace space)
{
    switch (space) {
    case Raster::ColourSpace::Grey:
        return "/DeviceGray";
    case Raster::ColourSpace::Cmyk:
        return "/DeviceCMYK";
    default:
        return "/DeviceRGB";
    }
}

/// Where the channels of decoded pixels go: colours and alpha apart, 16 bits with the high byte first, and whether any
/// pixel lets something through.
struct Planes
{
    std::string m_Colour;
    std::string m_Alpha;
    bool m_IsOpaque = true;
};

Planes Separate(Raster::DynamicBitmap const & bitmap, bool reduceTo8)
{
    Planes planes;
    std::size_t const channels = static_cast<std::size_t>(Raster::ChannelCount(bitmap.GetFormat()));
    std::size_t const bytes = Raster::BytesPerChannel(bitmap.GetFormat());
    std::vector<std::uint8_t> const & pixels = bitmap.GetPixels();
    std::size_t const kept = bytes == 2 && reduceTo8 ? 1 : bytes;
    std::size_t const count = pixels.size() / (channels * bytes);
    planes.m_Colour.reserve(count * (channels - 1) * kept);
    planes.m_Alpha.reserve(count * kept);
    for (std::size_t i = 0; i < count * channels; ++i) {
        bool const isAlpha = i % channels == channels - 1;
        std::string & plane = isAlpha ? planes.m_Alpha : planes.m_Colour;
        std::uint16_t value = 0;
        if (bytes == 1) {
            value = pixels[i];
            plane += static_cast<char>(value);
            planes.m_IsOpaque = planes.m_IsOpaque && (!isAlpha || value == 0xFF);
        } else {
            std::memcpy(&value, pixels.data() + i * 2, 2);
            planes.m_IsOpaque = planes.m_IsOpaque && (!isAlpha || value == 0xFFFF);
            if (kept == 1) {
                plane += static_cast<char>((value * 255U + 32767U) / 65535U);
            } else {
                plane += static_cast<char>(value >> 8);
                plane += static_cast<char>(value & 0xFF);
            }
        }
    }
    return planes;
}

/// Bytes that a row of a PNG's pixels takes, its filter's number before it.
std::size_t PngRowBytes(Raster::PictureInfo const & info)
{
    std::size_t const channels = info.m_Space == Raster::ColourSpace::Grey || info.m_IsPalette ? 1 : 3;
    return (static_cast<std::size_t>(info.m_Width) * channels * static_cast<std::size_t>(info.m_StoredBits) + 7) / 8 + 1;
}

/// The data unpack to exactly the declared rows, each with a filter that there is.
bool IsSoundPngData(std::string const & packed, Raster::PictureInfo const & info)
{
    std::size_t const row = PngRowBytes(info);
    std::size_t const size = row * static_cast<std::size_t>(info.m_Height);
    if (size / 1032 > packed.size()) {
        return false;
    }
    std::vector<unsigned char> unpacked(size);
    std::unique_ptr<libdeflate_decompressor, void (*)(libdeflate_decompressor *)> const inflater(
        libdeflate_alloc_decompressor(), libdeflate_free_decompressor);
    if (libdeflate_zlib_decompress(inflater.get(), packed.data(), packed.size(), unpacked.data(), size, nullptr) !=
        LIBDEFLATE_SUCCESS) {
        return false;
    }
    for (std::size_t at = 0; at < size; at += row) {
        if (unpacked[at] > 4) {
            return false;
        }
    }
    return true;
}

}

PdfPictures::PdfPictures(PdfSchema const & schema, PdfResources & resources, PdfSpill & spill)
    : m_Schema(schema), m_Resources(resources), m_Spill(spill)
{
}

void PdfPictures::BeginPage(int page, std::vector<Warning> * warnings)
{
    m_Page = page;
    m_Warnings = warnings;
}

void PdfPictures::Warn(Warning::Code code, String const & path, String const & text)
{
    if (m_Warnings) {
        m_Warnings->push_back({code, m_Page, path, text});
    }
}

bool PdfPictures::ImageFor(PlacedPicture const & placed, Kernel::Size const & size, std::uint32_t & image)
{
    return placed.m_Picture ? FromPicture(*placed.m_Picture, size, image) : FromBitmap(placed, image);
}

void PdfPictures::CheckResolution(Raster::Picture const & picture, Kernel::Size const & size)
{
    double const least = m_Schema.GetOptions().GetSettings().m_PictureDpiWarning;
    Raster::PictureInfo const & info = picture.GetInfo();
    double const dpi = std::min(info.UprightWidth() * 72 / std::max(size.width, 1e-3),
                                info.UprightHeight() * 72 / std::max(size.height, 1e-3));
    if (least > 0 && dpi < least) {
        Warn(Warning::Code::PictureResolution, picture.GetPath(),
             Kernel::Format(Kernel::LocalisedString("The picture %1 has only %2 pixels to the inch.", "Picture"),
                            picture.GetPath(), std::lround(dpi)));
    }
}

bool PdfPictures::IsReduced(Raster::PictureInfo const & info, Kernel::Size const & size, int & width, int & height) const
{
    double const limit = m_Schema.GetOptions().GetSettings().m_PictureDpiLimit;
    // The size on the page is the upright picture's; the pixels are the stored one's.
    double const across = info.IsTurned() ? size.height : size.width;
    double const down = info.IsTurned() ? size.width : size.height;
    auto const reduced = [limit](int pixels, double points) {
        double const wanted = points / 72 * limit;
        return limit > 0 && pixels > wanted * LimitTolerance
                   ? std::clamp(static_cast<int>(std::lround(wanted)), 1, pixels)
                   : pixels;
    };
    width = reduced(info.m_Width, across);
    height = reduced(info.m_Height, down);
    return width != info.m_Width || height != info.m_Height;
}

bool PdfPictures::FromPicture(Raster::Picture const & picture, Kernel::Size const & size, std::uint32_t & image)
{
    Raster::PictureInfo const & info = picture.GetInfo();
    if (info.m_WrongExtension) {
        Warn(Warning::Code::PictureWrongExtension, picture.GetPath(),
             Kernel::Format(Kernel::LocalisedString("The picture %1 is a %2 file, unlike its name.", "Picture"),
                            picture.GetPath(), info.m_Kind == Raster::PictureKind::Png ? "PNG" : "JPEG"));
    }
    CheckResolution(picture, size);
    Raster::PictureProblem problem;
    Raster::Picture::Bytes const bytes = picture.ReadBytes(problem);
    if (!bytes) {
        Warn(Warning::Code::PictureMissing, picture.GetPath(), problem.m_Text);
        return false;
    }
    Key key{Kernel::HashBytes128(bytes->data(), bytes->size())};
    bool const reduce = IsReduced(info, size, key.m_Width, key.m_Height);
    if (auto const known = m_Known.find(key); known != m_Known.end()) {
        image = known->second;
        return true;
    }
    bool const taken = !reduce && (info.m_Kind == Raster::PictureKind::Jpeg ? TakeJpeg(picture, bytes, image)
                                                                            : TakePng(picture, bytes, image));
    if (!taken) {
        Kernel::Counted<Raster::DynamicBitmap const> bitmap = picture.DecodeAsStored(problem);
        if (!bitmap) {
            Warn(Warning::Code::PictureMissing, picture.GetPath(), problem.m_Text);
            return false;
        }
        if (reduce) {
            bitmap = Raster::Reduce(*bitmap, std::min(key.m_Width, bitmap->GetWidth()),
                                    std::min(key.m_Height, bitmap->GetHeight()));
        }
        image = Pack(*bitmap, picture.ReadProfile());
    }
    m_Known.emplace(key, image);
    return true;
}

bool PdfPictures::FromBitmap(PlacedPicture const & placed, std::uint32_t & image)
{
    Raster::DynamicBitmap const & bitmap = *placed.m_Bitmap;
    Raster::ColourSpace const space = Raster::SpaceOfFormat(bitmap.GetFormat());
    bool const writable = space == Raster::ColourSpace::Grey || space == Raster::ColourSpace::Rgb ||
                          space == Raster::ColourSpace::Cmyk;
    if (!writable || bitmap.GetFormat() == Raster::Format::RgbaFloat || bitmap.GetPixels().empty()) {
        Warn(Warning::Code::PictureMissing, String(),
             Kernel::LocalisedString("A bitmap of this format can't be written to a PDF file.", "Output"));
        return false;
    }
    Key const key{Kernel::HashBytes128(bitmap.GetPixels().data(), bitmap.GetPixels().size()), bitmap.GetWidth(),
                  bitmap.GetHeight()};
    auto const [known, added] = m_Known.try_emplace(key, 0);
    if (added) {
        known->second = Pack(bitmap, placed.m_BitmapProfile);
    }
    image = known->second;
    return true;
}

SpillRange PdfPictures::Deflate(std::string_view data)
{
    std::string_view const packed = m_Deflater.Compress(data, PdfCompressor::Deflater::Effort::Thorough);
    return m_Spill.Append(packed.data(), packed.size());
}

void PdfPictures::SetColourSpace(PdfImage & image, Raster::ColourSpace space,
                                 Kernel::Consolidated<Raster::ICCProfile> const & profile)
{
    // The output intent says what the document's own numbers mean; grey needs no profile beside it. What is in another
    // space brings its profile along.
    Raster::ColourSpace const own = Raster::SpaceOfFormat(m_Schema.GetColourFormat());
    Kernel::Consolidated<Raster::ICCProfile> const standard = m_Schema.GetProfiles().ForSpace(space);
    bool const fits = profile && profile->GetSpace() == space;
    bool const device = (!fits || profile->IsSame(*standard)) && (space == own || space == Raster::ColourSpace::Grey);
    if (device) {
        image.m_Entries += std::string("/ColorSpace") + DeviceSpace(space);
    } else {
        image.m_Profile = m_Resources.AddProfile(fits ? profile : standard) + 1;
    }
}

bool PdfPictures::TakeJpeg(Raster::Picture const & picture, Raster::Picture::Bytes const & bytes, std::uint32_t & image)
{
    std::vector<Raster::JpegSegment> segments;
    Raster::PictureInfo info;
    try {
        segments = Raster::ScanJpeg(*bytes, false);
        Raster::ReadJpegInfo(segments, info);
    } catch (Raster::PictureFault const &) {
        // Decoding will say what is wrong.
        return false;
    }
    // Without the XMP packets, since tools that edit a PDF's metadata look for packets all over the file.
    std::string data = "\xFF\xD8";
    for (Raster::JpegSegment const & segment : segments) {
        if (!Raster::IsJpegXmp(segment)) {
            data += AsText(bytes->data() + segment.m_Begin, segment.m_End - segment.m_Begin);
        }
    }
    data += "\xFF\xD9";
    PdfImage result;
    result.m_Width = info.m_Width;
    result.m_Height = info.m_Height;
    result.m_Entries = "/Filter/DCTDecode/BitsPerComponent 8";
    if (info.m_IsInverted) {
        result.m_Entries += "/Decode[1 0 1 0 1 0 1 0]";
    }
    SetColourSpace(result, info.m_Space, picture.ReadProfile());
    result.m_Data = m_Spill.Append(data.data(), data.size());
    image = m_Resources.AddImage(std::move(result));
    return true;
}

bool PdfPictures::TakePng(Raster::Picture const & picture, Raster::Picture::Bytes const & bytes, std::uint32_t & image)
{
    Raster::PictureInfo info;
    std::string data;
    std::string palette;
    try {
        std::vector<Raster::PngChunk> const chunks = Raster::ScanPng(*bytes, false);
        Raster::ReadPngInfo(chunks, info);
        for (Raster::PngChunk const & chunk : chunks) {
            if (chunk.m_Type == Raster::PngType("IDAT")) {
                data += AsText(chunk.m_Data.data(), chunk.m_Data.size());
            } else if (chunk.m_Type == Raster::PngType("PLTE")) {
                palette = AsText(chunk.m_Data.data(), chunk.m_Data.size());
            }
        }
    } catch (Raster::PictureFault const &) {
        return false;
    }
    bool const reduceTo8 = info.m_BitsPerChannel == 16 && !m_Schema.GetOptions().GetSettings().m_Keep16Bit;
    if (info.m_IsInterlaced || info.m_HasAlpha || reduceTo8 || (info.m_IsPalette && palette.size() < 3) ||
        !IsSoundPngData(data, info)) {
        return false;
    }
    PdfImage result;
    result.m_Width = info.m_Width;
    result.m_Height = info.m_Height;
    std::string const bits = std::to_string(info.m_StoredBits);
    bool const oneChannel = info.m_IsPalette || info.m_Space == Raster::ColourSpace::Grey;
    result.m_Entries = "/Filter/FlateDecode/BitsPerComponent " + bits + "/DecodeParms<</Predictor 15/Colors " +
                       (oneChannel ? "1" : "3") + "/BitsPerComponent " + bits + "/Columns " +
                       std::to_string(info.m_Width) + ">>";
    if (info.m_IsPalette) {
        result.m_Entries += "/ColorSpace[/Indexed/DeviceRGB " + std::to_string(palette.size() / 3 - 1) + "<";
        static char const digits[] = "0123456789ABCDEF";
        for (char const character : palette.substr(0, palette.size() / 3 * 3)) {
            result.m_Entries += digits[static_cast<unsigned char>(character) >> 4];
            result.m_Entries += digits[character & 15];
        }
        result.m_Entries += ">]";
    } else {
        SetColourSpace(result, info.m_Space, picture.ReadProfile());
    }
    result.m_Data = m_Spill.Append(data.data(), data.size());
    image = m_Resources.AddImage(std::move(result));
    return true;
}

std::uint32_t PdfPictures::Pack(Raster::DynamicBitmap const & bitmap,
                                Kernel::Consolidated<Raster::ICCProfile> const & profile)
{
    bool const reduceTo8 = !m_Schema.GetOptions().GetSettings().m_Keep16Bit;
    Planes const planes = Separate(bitmap, reduceTo8);
    std::string const bits = Raster::BytesPerChannel(bitmap.GetFormat()) == 2 && !reduceTo8 ? "16" : "8";
    std::string const entries = "/Filter/FlateDecode/BitsPerComponent " + bits;
    PdfImage result;
    result.m_Width = bitmap.GetWidth();
    result.m_Height = bitmap.GetHeight();
    result.m_Entries = entries;
    SetColourSpace(result, Raster::SpaceOfFormat(bitmap.GetFormat()), profile);
    if (!planes.m_IsOpaque) {
        PdfImage mask;
        mask.m_Width = result.m_Width;
        mask.m_Height = result.m_Height;
        mask.m_Entries = entries + "/ColorSpace/DeviceGray";
        mask.m_Data = Deflate(planes.m_Alpha);
        result.m_SoftMask = m_Resources.AddImage(std::move(mask)) + 1;
    }
    result.m_Data = Deflate(planes.m_Colour);
    return m_Resources.AddImage(std::move(result));
}

}
