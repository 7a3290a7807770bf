#include "framework/raster/PngEncoder.h"

#include "framework/kernel/Assert.h"
#include "framework/raster/PixelConversion.h"

#include <algorithm>
#include <cmath>
#include <csetjmp>
#include <cstring>
#include <png.h>
#include <zlib.h>

namespace Raster
{

namespace
{

void WriteToData(png_structp png, png_bytep bytes, std::size_t size)
{
    static_cast<CompressedRasterData *>(png_get_io_ptr(png))->Append(bytes, size);
}

void NothingToFlush(png_structp) {}
void IgnoreWarning(png_structp, png_const_charp) {}
/// libpng's own would print the message first.
[[noreturn]] void LeaveQuietly(png_structp png, png_const_charp)
{
    png_longjmp(png, 1);
}

/// What the file says besides its pixels.
struct PngHeader
{
    png_uint_32 m_Width;
    png_uint_32 m_Height;
    int m_Compression;
    /// Pixels to the metre; 0 states none.
    png_uint_32 m_Density;
    /// Null for sRGB.
    ICCProfile const * m_Profile;
};

/// libpng leaves by longjmp, so nothing in this frame has a destructor.
bool WriteRows(png_structp png, png_infop info, PngHeader const & header, png_bytepp rows)
{
    if (setjmp(png_jmpbuf(png))) {
        return false;
    }
    // A profile that libpng finds fault with is left out, and does not end the file.
    png_set_benign_errors(png, 1);
    png_set_IHDR(png, info, header.m_Width, header.m_Height, 8, PNG_COLOR_TYPE_RGB_ALPHA, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_BASE, PNG_FILTER_TYPE_BASE);
    png_set_compression_level(png, header.m_Compression);
    // zlib's strategy for filtered pixels passes over short matches, of which pages of text are made.
    png_set_compression_strategy(png, Z_DEFAULT_STRATEGY);
    if (header.m_Profile) {
        png_set_iCCP(png, info, "ICC profile", PNG_COMPRESSION_TYPE_BASE,
                     header.m_Profile->GetBytes().data(),
                     static_cast<png_uint_32>(header.m_Profile->GetBytes().size()));
    } else {
        png_set_sRGB(png, info, PNG_sRGB_INTENT_RELATIVE);
    }
    if (header.m_Density > 0) {
        png_set_pHYs(png, info, header.m_Density, header.m_Density, PNG_RESOLUTION_METER);
    }
    png_write_info(png, info);
    png_write_image(png, rows);
    png_write_end(png, nullptr);
    return true;
}

/// Converts one pixel of each run of equal ones. Pages are mostly paper, and the engine takes long over a pixel.
class RunConverter
{
public:
    RunConverter(Format source, Format target)
        : m_SourceSize(BytesPerPixel(source)),
          m_TargetSize(BytesPerPixel(target))
    {
    }

    void Convert(ColourTransform const & transform, std::uint8_t const * source, std::uint8_t * target,
                 std::size_t pixels)
    {
        m_Source.clear();
        m_Lengths.clear();
        for (std::size_t x = 0; x < pixels; ++x, source += m_SourceSize) {
            if (x == 0 || 0 != std::memcmp(source, source - m_SourceSize, m_SourceSize)) {
                m_Source.insert(m_Source.end(), source, source + m_SourceSize);
                m_Lengths.push_back(0);
            }
            ++m_Lengths.back();
        }
        m_Target.resize(m_Lengths.size() * m_TargetSize);
        transform.Convert(m_Source.data(), m_Target.data(), m_Lengths.size());
        std::uint8_t const * pixel = m_Target.data();
        for (std::size_t const length : m_Lengths) {
            for (std::size_t i = 0; i < length; ++i, target += m_TargetSize) {
                std::memcpy(target, pixel, m_TargetSize);
            }
            pixel += m_TargetSize;
        }
    }

private:
    std::size_t const m_SourceSize;
    std::size_t const m_TargetSize;
    std::vector<std::uint8_t> m_Source;
    std::vector<std::uint8_t> m_Target;
    std::vector<std::size_t> m_Lengths;
};

}

void CompressedRasterData::Append(void const * data, std::size_t size)
{
    auto const * bytes = static_cast<std::uint8_t const *>(data);
    m_Bytes.insert(m_Bytes.end(), bytes, bytes + size);
}

Kernel::Counted<Kernel::RawData> CompressedRasterData::RelinquishOwnership()
{
    Kernel::Counted<Kernel::RawData> data = Kernel::MakeCounted<Kernel::RawData>(std::move(m_Bytes));
    m_Bytes.clear();
    return data;
}

Kernel::Counted<DynamicBitmap> ConvertBitmap(DynamicBase const & bitmap, Kernel::Consolidated<ICCProfile> const & source,
                                             Format format, Kernel::Consolidated<ICCProfile> const & target,
                                             RenderingIntent intent, bool blackPointCompensation)
{
    using Layout = ColourTransform::Layout;
    ColourSpace const from = SpaceOfFormat(bitmap.GetFormat());
    ColourSpace const to = SpaceOfFormat(format);
    if (from == ColourSpace::None || to == ColourSpace::None) {
        return nullptr;
    }
    Kernel::Counted<DynamicBitmap> converted = Kernel::MakeCounted<DynamicBitmap>();
    converted->Create(bitmap.GetWidth(), bitmap.GetHeight(), format, MipmapMode::OnDemand, HardwareCachePolicy::Default);
    ICCManager const & manager = ICCManager::GetInstance();
    Kernel::Consolidated<ICCProfile> const profile = source ? source : manager.GetDefaultProfileForSpace(from);
    Kernel::Consolidated<ICCProfile> const targetProfile = target ? target : manager.GetDefaultProfileForSpace(to);
    // Floats pass through 16 bits: what lies outside of 0 to 1 has no place in the profiles.
    bool const isFloat = BytesPerChannel(bitmap.GetFormat()) == 4;
    bool const isFloatTarget = BytesPerChannel(format) == 4;
    Kernel::Counted<ColourTransform const> const transform =
        profile->GetSpace() == from && targetProfile->GetSpace() == to && !profile->IsSame(*targetProfile)
            ? ColourTransform::Get(
                  profile, BytesPerChannel(bitmap.GetFormat()) == 1 ? Layout::Channels8Alpha : Layout::Channels16Alpha,
                  targetProfile, BytesPerChannel(format) == 1 ? Layout::Channels8Alpha : Layout::Channels16Alpha, intent,
                  blackPointCompensation)
            : nullptr;
    if (!transform) {
        ConvertPixels(bitmap, *converted);
        return converted;
    }
    std::size_t const width = static_cast<std::size_t>(bitmap.GetWidth());
    RunConverter runs(isFloat ? Format::Rgba16 : bitmap.GetFormat(), format);
    std::vector<float> wide(isFloat || isFloatTarget ? width * 4 : 0);
    std::vector<std::uint16_t> deep(wide.size());
    for (int y = 0; y < bitmap.GetHeight(); ++y) {
        void const * row = bitmap.GetRow(y);
        if (isFloat) {
            ToFloatPixels(bitmap.GetFormat(), row, wide.data(), width);
            FromFloatPixels(Format::Rgba16, wide.data(), deep.data(), width);
            row = deep.data();
        }
        if (isFloatTarget) {
            transform->Convert(row, deep.data(), width);
            ToFloatPixels(Format::Rgba16, deep.data(), wide.data(), width);
            FromFloatPixels(format, wide.data(), converted->GetRow(y), width);
        } else {
            runs.Convert(*transform, static_cast<std::uint8_t const *>(row), converted->GetRow(y), width);
        }
    }
    return converted;
}

PNGBase::PNGBase(Kernel::Counted<CompressedRasterData> data, int width, int height, ExportOptions const & options)
    : m_Data(std::move(data)), m_Width(width), m_Height(height), m_Options(options)
{
    KORVANE_ASSERT(m_Data);
}

bool PNGBase::Write(DynamicBase const & buffer, Kernel::Consolidated<ICCProfile> const & source,
                    Kernel::Consolidated<ICCProfile> const & destination, RenderingIntent intent,
                    bool blackPointCompensation)
{
    KORVANE_ASSERT(destination && destination->GetSpace() == ColourSpace::Rgb);
    if (buffer.GetWidth() != m_Width || buffer.GetHeight() != m_Height || m_Width < 1 || m_Height < 1) {
        return false;
    }
    Kernel::Counted<DynamicBitmap> const bitmap =
        ConvertBitmap(buffer, source, Format::Rgba8, destination, intent, blackPointCompensation);
    if (!bitmap) {
        return false;
    }
    bool const isStandard = destination->IsSame(*ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8));
    PngHeader const header{static_cast<png_uint_32>(m_Width), static_cast<png_uint_32>(m_Height),
                           std::clamp(m_Options.m_Compression, 1, 9),
                           static_cast<png_uint_32>(std::clamp(m_Options.m_Dpi / 0.0254 + 0.5, 0.0, 2147483647.0)),
                           isStandard ? nullptr : destination.Get()};
    std::vector<png_bytep> rows;
    for (int y = 0; y < m_Height; ++y) {
        rows.push_back(bitmap->GetRow(y));
    }
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, LeaveQuietly, IgnoreWarning);
    png_infop info = png ? png_create_info_struct(png) : nullptr;
    KORVANE_ASSERT(info);
    png_set_write_fn(png, m_Data.Get(), WriteToData, NothingToFlush);
    bool const isWritten = WriteRows(png, info, header, rows.data());
    png_destroy_write_struct(&png, &info);
    return isWritten;
}

}
