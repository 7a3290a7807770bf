#include "framework/raster/DynamicBitmap.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/OutSerialiser.h"

#include <libdeflate.h>
#include <memory>

namespace Raster
{

namespace
{

/// Quick; what it leaves is mostly long runs of zeros.
constexpr int Level = 5;
/// Deflate makes at most 258 bytes of 2 bits (RFC 1951, 3.2.5), and a little more of what is the same for all.
constexpr std::size_t GreatestRatio = 1040;

/// A row with its bytes sorted by their place in the pixel, each as the difference to the pixel before: flat areas
/// become zeros, and the equal channels of a grey row repeat each other.
void Predict(std::uint8_t const * row, std::size_t width, std::size_t pixelSize, std::uint8_t * predicted)
{
    for (std::size_t place = 0; place < pixelSize; ++place) {
        std::uint8_t before = 0;
        for (std::size_t x = 0; x < width; ++x) {
            std::uint8_t const value = row[x * pixelSize + place];
            *predicted++ = static_cast<std::uint8_t>(value - before);
            before = value;
        }
    }
}

void Restore(std::uint8_t const * predicted, std::size_t width, std::size_t pixelSize, std::uint8_t * row)
{
    for (std::size_t place = 0; place < pixelSize; ++place) {
        std::uint8_t value = 0;
        for (std::size_t x = 0; x < width; ++x) {
            value = static_cast<std::uint8_t>(value + *predicted++);
            row[x * pixelSize + place] = value;
        }
    }
}

}

Kernel::ClassProperties const DynamicBitmap::ms_ClassProperties(
    Kernel::ClassUID("DyBm"), [] { return Kernel::Counted<Kernel::Serialisable>(Kernel::MakeCounted<DynamicBitmap>()); },
    1, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_DynamicBitmapInit(DynamicBitmap::GetTypeClassProperties());

void DynamicBitmap::Save(Kernel::OutSerialiser & out) const
{
    out.SaveType("frmt", GetFormat());
    out.SaveType("wdth", GetWidth());
    out.SaveType("hght", GetHeight());
    out.SaveType("mipm", m_Mipmaps);
    out.SaveType("cach", m_Policy);
    std::vector<std::uint8_t> rows(GetPixels().size());
    for (int y = 0; y < GetHeight(); ++y) {
        Predict(GetRow(y), static_cast<std::size_t>(GetWidth()), BytesPerPixel(GetFormat()),
                rows.data() + static_cast<std::size_t>(y) * GetRowBytes());
    }
    std::unique_ptr<libdeflate_compressor, void (*)(libdeflate_compressor *)> const compressor(
        libdeflate_alloc_compressor(Level), libdeflate_free_compressor);
    KORVANE_ASSERT(compressor);
    std::vector<std::uint8_t> packed(libdeflate_deflate_compress_bound(compressor.get(), rows.size()));
    packed.resize(
        libdeflate_deflate_compress(compressor.get(), rows.data(), rows.size(), packed.data(), packed.size()));
    out.SaveData("pixl", packed);
}

bool DynamicBitmap::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    int format = -1;
    int width = -1;
    int height = -1;
    std::span<std::uint8_t const> packed;
    if (!in.LoadType("frmt", format) || !in.LoadType("wdth", width) || !in.LoadType("hght", height) ||
        !in.LoadData("pixl", packed)) {
        return false;
    }
    if (!IsFormat(format) || width < 0 || height < 0 || width > MaximumStoredSide || height > MaximumStoredSide) {
        return false;
    }
    in.LoadType("mipm", m_Mipmaps);
    in.LoadType("cach", m_Policy);
    std::size_t const size = static_cast<std::size_t>(width) * static_cast<std::size_t>(height) *
                             BytesPerPixel(static_cast<Format>(format));
    if (size > MaximumStoredBytes || size > packed.size() * GreatestRatio) {
        return false;
    }
    std::unique_ptr<libdeflate_decompressor, void (*)(libdeflate_decompressor *)> const decompressor(
        libdeflate_alloc_decompressor(), libdeflate_free_decompressor);
    KORVANE_ASSERT(decompressor);
    std::vector<std::uint8_t> rows(size);
    if (libdeflate_deflate_decompress(decompressor.get(), packed.data(), packed.size(), rows.data(), rows.size(),
                                      nullptr) != LIBDEFLATE_SUCCESS) {
        return false;
    }
    Allocate(width, height, static_cast<Format>(format));
    for (int y = 0; y < height; ++y) {
        Restore(rows.data() + static_cast<std::size_t>(y) * GetRowBytes(), static_cast<std::size_t>(width),
                BytesPerPixel(GetFormat()), GetRow(y));
    }
    return true;
}

Kernel::ClassProperties const & DynamicBitmap::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & DynamicBitmap::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

}
