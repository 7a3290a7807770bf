#include "framework/raster/PngEncoder.h"

#include "framework/kernel/Assert.h"

#include <cmath>
#include <cstring>
#include <libdeflate.h>
#include <memory>

namespace Raster
{

namespace
{

void AppendBig32(std::string & text, std::uint32_t value)
{
    for (int shift = 24; shift >= 0; shift -= 8) {
        text += static_cast<char>(value >> shift & 0xFF);
    }
}

/// The PNG's rows, each behind the number of the filter that looks best for it: the least sum of absolute values
/// (ISO 15948, 12.8).
std::string FilteredRows(DynamicBitmap const & bitmap)
{
    constexpr std::size_t step = 4;
    std::size_t const size = bitmap.GetRowBytes();
    std::vector<std::uint8_t> const nothing(size, 0);
    std::string rows;
    rows.reserve((size + 1) * static_cast<std::size_t>(bitmap.GetHeight()));
    std::string tries[5];
    for (int y = 0; y < bitmap.GetHeight(); ++y) {
        std::uint8_t const * const row = bitmap.GetRow(y);
        std::uint8_t const * const above = y > 0 ? bitmap.GetRow(y - 1) : nothing.data();
        int best = 0;
        unsigned long bestSum = ~0UL;
        for (int filter = 0; filter < 5; ++filter) {
            std::string & tried = tries[filter];
            tried.assign(1, static_cast<char>(filter));
            unsigned long sum = 0;
            for (std::size_t i = 0; i < size; ++i) {
                int const left = i >= step ? row[i - step] : 0;
                int const up = above[i];
                int const corner = i >= step ? above[i - step] : 0;
                int const guess = left + up - corner;
                int const nearLeft = std::abs(guess - left);
                int const nearUp = std::abs(guess - up);
                int const nearCorner = std::abs(guess - corner);
                int const paeth = nearLeft <= nearUp && nearLeft <= nearCorner ? left : nearUp <= nearCorner ? up : corner;
                int const predicted[] = {0, left, up, (left + up) / 2, paeth};
                auto const value = static_cast<std::int8_t>(row[i] - predicted[filter]);
                sum += static_cast<unsigned long>(std::abs(static_cast<int>(value)));
                tried += static_cast<char>(value);
            }
            if (sum < bestSum) {
                bestSum = sum;
                best = filter;
            }
        }
        rows += tries[best];
    }
    return rows;
}

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

Kernel::Counted<DynamicBitmap> ConvertToRgba8(DynamicBase const & bitmap, Kernel::Consolidated<ICCProfile> const & source,
                                              Kernel::Consolidated<ICCProfile> const & target, RenderingIntent intent,
                                              bool blackPointCompensation)
{
    using Layout = ColourTransform::Layout;
    ColourSpace const space = SpaceOfFormat(bitmap.GetFormat());
    KORVANE_ASSERT(target && target->GetSpace() == ColourSpace::Rgb);
    if (space == ColourSpace::None || (source && source->GetSpace() != space)) {
        return nullptr;
    }
    Kernel::Counted<DynamicBitmap> converted = Kernel::MakeCounted<DynamicBitmap>();
    converted->Create(bitmap.GetWidth(), bitmap.GetHeight(), Format::Rgba8, MipmapMode::None,
                      HardwareCachePolicy::Default);
    std::size_t const bytes = BytesPerChannel(bitmap.GetFormat());
    bool const isFloat = bytes == 4;
    // Floats are brought to 16 bits first: what lies outside of 0 to 1 has no place in the target.
    Kernel::Counted<ColourTransform const> const transform =
        ColourTransform::Get(source ? source : ICCManager::GetInstance().GetDefaultProfileForSpace(space),
                             bytes == 1 ? Layout::Channels8Alpha : Layout::Channels16Alpha, target,
                             Layout::Channels8Alpha, intent, blackPointCompensation);
    if (!transform) {
        return nullptr;
    }
    std::size_t const width = static_cast<std::size_t>(bitmap.GetWidth());
    std::vector<std::uint16_t> deep(isFloat ? width * 4 : 0);
    for (int y = 0; y < bitmap.GetHeight(); ++y) {
        void const * row = bitmap.GetRow(y);
        if (isFloat) {
            for (std::size_t i = 0; i < deep.size(); ++i) {
                float value = 0;
                std::memcpy(&value, bitmap.GetRow(y) + i * sizeof(float), sizeof(float));
                deep[i] = static_cast<std::uint16_t>(std::lround(std::clamp(value, 0.0F, 1.0F) * 65535.0F));
            }
            row = deep.data();
        }
        transform->Convert(row, converted->GetRow(y), width);
    }
    return converted;
}

PNGBase::PNGBase(Kernel::Counted<CompressedRasterData> data, int width, int height, ExportOptions const & options)
    : m_Data(std::move(data)), m_Width(width), m_Height(height), m_Options(options)
{
    KORVANE_ASSERT(m_Data);
}

void PNGBase::WriteChunk(char const (&type)[5], std::string_view data)
{
    std::string chunk;
    AppendBig32(chunk, static_cast<std::uint32_t>(data.size()));
    chunk.append(type, 4);
    chunk += data;
    AppendBig32(chunk, libdeflate_crc32(0, chunk.data() + 4, chunk.size() - 4));
    m_Data->Append(chunk.data(), chunk.size());
}

bool PNGBase::Write(DynamicBase const & buffer, Kernel::Consolidated<ICCProfile> const & source,
                    Kernel::Consolidated<ICCProfile> const & destination, RenderingIntent intent,
                    bool blackPointCompensation)
{
    if (buffer.GetWidth() != m_Width || buffer.GetHeight() != m_Height || m_Width < 1 || m_Height < 1) {
        return false;
    }
    Kernel::Counted<DynamicBitmap> const bitmap =
        ConvertToRgba8(buffer, source, destination, intent, blackPointCompensation);
    if (!bitmap) {
        return false;
    }
    m_Data->Append("\x89PNG\r\n\x1A\n", 8);
    std::string header;
    AppendBig32(header, static_cast<std::uint32_t>(m_Width));
    AppendBig32(header, static_cast<std::uint32_t>(m_Height));
    // 8 bits, colours with alpha, deflate, the standard filters, not interlaced.
    header.append("\x08\x06\x00\x00\x00", 5);
    WriteChunk("IHDR", header);
    if (destination->IsSame(*ICCManager::GetInstance().GetDefaultProfileForFormat(Format::Rgba8))) {
        WriteChunk("sRGB", std::string_view("\x01", 1));
    }
    if (m_Options.m_Dpi > 0) {
        std::string density;
        auto const perMetre = static_cast<std::uint32_t>(std::lround(m_Options.m_Dpi / 0.0254));
        AppendBig32(density, perMetre);
        AppendBig32(density, perMetre);
        density += '\x01';
        WriteChunk("pHYs", density);
    }
    std::string const rows = FilteredRows(*bitmap);
    std::unique_ptr<libdeflate_compressor, void (*)(libdeflate_compressor *)> const compressor(
        libdeflate_alloc_compressor(m_Options.m_Compression), libdeflate_free_compressor);
    KORVANE_ASSERT(compressor);
    std::string packed(libdeflate_zlib_compress_bound(compressor.get(), rows.size()), '\0');
    packed.resize(
        libdeflate_zlib_compress(compressor.get(), rows.data(), rows.size(), packed.data(), packed.size()));
    WriteChunk("IDAT", packed);
    WriteChunk("IEND", {});
    return true;
}

}
