#include "framework/raster/PictureReader.h"

#include "framework/kernel/LocalisedString.h"

#include <csetjmp>
#include <cstring>
#include <libdeflate.h>
#include <memory>
#include <png.h>

namespace Raster
{

namespace
{

using Code = PictureProblem::Code;

constexpr unsigned char Signature[] = {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'};
/// Deflate can't pack better than this, so fewer bytes can't hold the declared pixels.
constexpr std::uint64_t BestRatio = 1032;
constexpr std::size_t LargestProfile = std::size_t(1) << 24;

struct Source
{
    PictureBytes m_Bytes;
    std::size_t m_Position = 0;
};

void ReadFromSource(png_structp png, png_bytep target, std::size_t size)
{
    Source & source = *static_cast<Source *>(png_get_io_ptr(png));
    if (size > source.m_Bytes.size() - source.m_Position) {
        png_error(png, "ends too early");
    }
    std::memcpy(target, source.m_Bytes.data() + source.m_Position, size);
    source.m_Position += size;
}

void IgnoreWarning(png_structp, png_const_charp) {}
/// libpng's own would print the message first.
[[noreturn]] void LeaveQuietly(png_structp png, png_const_charp)
{
    png_longjmp(png, 1);
}

/// libpng leaves by longjmp, so nothing in this frame has a destructor.
bool ReadRows(png_structp png, png_infop info, DynamicBitmap * bitmap, png_bytep * rows)
{
    if (setjmp(png_jmpbuf(png))) {
        return false;
    }
    png_read_info(png, info);
    int const type = png_get_color_type(png, info);
    png_set_expand(png);
    if (png_get_bit_depth(png, info) == 16) {
        png_set_swap(png);
    }
    if (!(type & PNG_COLOR_MASK_ALPHA) && !png_get_valid(png, info, PNG_INFO_tRNS)) {
        png_set_add_alpha(png, 0xFFFF, PNG_FILLER_AFTER);
    }
    png_set_interlace_handling(png);
    png_read_update_info(png, info);
    if (png_get_rowbytes(png, info) != bitmap->GetRowBytes()) {
        return false;
    }
    png_read_image(png, rows);
    png_read_end(png, nullptr);
    return true;
}

}

bool IsPng(PictureBytes bytes)
{
    return bytes.size() >= sizeof(Signature) && std::memcmp(bytes.data(), Signature, sizeof(Signature)) == 0;
}

std::vector<PngChunk> ScanPng(PictureBytes bytes, bool headerOnly)
{
    std::vector<PngChunk> chunks;
    std::size_t position = sizeof(Signature);
    while (true) {
        if (bytes.size() < position + 12) {
            throw EndsTooEarly();
        }
        std::uint32_t const length = ReadBig32(bytes.data() + position);
        PngChunk chunk{ReadBig32(bytes.data() + position + 4), {}};
        if (chunks.empty() && chunk.m_Type != PngType("IHDR")) {
            throw PictureFault{Code::Corrupt, Kernel::LocalisedString("does not begin with its header", "Picture")};
        }
        if (headerOnly && chunk.m_Type == PngType("IDAT")) {
            return chunks;
        }
        if (length > bytes.size() - position - 12) {
            throw EndsTooEarly();
        }
        std::uint32_t const sum = libdeflate_crc32(0, bytes.data() + position + 4, std::size_t(length) + 4);
        if (sum != ReadBig32(bytes.data() + position + 8 + length)) {
            throw PictureFault{Code::Corrupt, Kernel::LocalisedString("is damaged: a checksum is wrong", "Picture")};
        }
        chunk.m_Data = bytes.subspan(position + 8, length);
        chunks.push_back(chunk);
        if (chunk.m_Type == PngType("IEND")) {
            return chunks;
        }
        position += std::size_t(length) + 12;
    }
}

void ReadPngInfo(std::vector<PngChunk> const & chunks, PictureInfo & info)
{
    PictureBytes const header = chunks.front().m_Data;
    if (header.size() != 13) {
        throw PictureFault{Code::Corrupt, Kernel::LocalisedString("has a damaged header", "Picture")};
    }
    std::uint32_t const width = ReadBig32(header.data());
    std::uint32_t const height = ReadBig32(header.data() + 4);
    CheckPictureSize(width, height);
    info.m_Kind = PictureKind::Png;
    info.m_Width = static_cast<int>(width);
    info.m_Height = static_cast<int>(height);
    info.m_StoredBits = header[8];
    int const type = header[9];
    bool const depthFits = type == 0   ? (header[8] & (header[8] - 1)) == 0 && header[8] >= 1 && header[8] <= 16
                           : type == 3 ? (header[8] & (header[8] - 1)) == 0 && header[8] >= 1 && header[8] <= 8
                                       : header[8] == 8 || header[8] == 16;
    if (type == 1 || type == 5 || type > 6 || !depthFits || header[12] > 1) {
        throw PictureFault{Code::Corrupt, Kernel::LocalisedString("has a damaged header", "Picture")};
    }
    info.m_BitsPerChannel = header[8] == 16 ? 16 : 8;
    info.m_Space = type == 0 || type == 4 ? ColourSpace::Grey : ColourSpace::Rgb;
    info.m_IsPalette = type == 3;
    info.m_HasAlpha = type >= 4;
    info.m_IsInterlaced = header[12] == 1;
    for (PngChunk const & chunk : chunks) {
        if (chunk.m_Type == PngType("tRNS")) {
            info.m_HasAlpha = true;
        } else if (chunk.m_Type == PngType("pHYs") && chunk.m_Data.size() == 9 && chunk.m_Data[8] == 1) {
            info.m_DpiX = ReadBig32(chunk.m_Data.data()) * 0.0254;
            info.m_DpiY = ReadBig32(chunk.m_Data.data() + 4) * 0.0254;
        } else if (chunk.m_Type == PngType("eXIf")) {
            ReadExif(chunk.m_Data, info);
        }
    }
}

std::vector<unsigned char> ReadPngProfile(std::vector<PngChunk> const & chunks)
{
    for (PngChunk const & chunk : chunks) {
        if (chunk.m_Type != PngType("iCCP")) {
            continue;
        }
        // Name, zero, method 0, zlib data.
        auto const end = std::find(chunk.m_Data.begin(), chunk.m_Data.end(), static_cast<unsigned char>(0));
        std::size_t const start = static_cast<std::size_t>(end - chunk.m_Data.begin()) + 2;
        if (start >= chunk.m_Data.size()) {
            return {};
        }
        std::unique_ptr<libdeflate_decompressor, void (*)(libdeflate_decompressor *)> const inflater(
            libdeflate_alloc_decompressor(), libdeflate_free_decompressor);
        for (std::size_t room = 1 << 16; room <= LargestProfile; room *= 4) {
            std::vector<unsigned char> profile(room);
            std::size_t size = 0;
            libdeflate_result const result = libdeflate_zlib_decompress(
                inflater.get(), chunk.m_Data.data() + start, chunk.m_Data.size() - start, profile.data(), room, &size);
            if (result == LIBDEFLATE_SUCCESS) {
                profile.resize(size);
                return profile;
            }
            if (result != LIBDEFLATE_INSUFFICIENT_SPACE) {
                return {};
            }
        }
    }
    return {};
}

Kernel::Counted<DynamicBitmap> DecodePng(PictureBytes bytes, PictureInfo const & info)
{
    std::uint64_t packed = 0;
    for (PngChunk const & chunk : ScanPng(bytes, false)) {
        packed += chunk.m_Type == PngType("IDAT") ? chunk.m_Data.size() : 0;
    }
    std::uint64_t const pixels = static_cast<std::uint64_t>(info.m_Width) * static_cast<std::uint64_t>(info.m_Height);
    if (pixels * static_cast<std::uint64_t>(info.m_StoredBits) / 8 / BestRatio > packed) {
        throw PictureFault{Code::Truncated,
                           Kernel::LocalisedString("has fewer data than its size asks for", "Picture")};
    }
    bool const grey = info.m_Space == ColourSpace::Grey;
    bool const deep = info.m_BitsPerChannel == 16;
    Kernel::Counted<DynamicBitmap> bitmap = Kernel::MakeCounted<DynamicBitmap>();
    bitmap->Create(info.m_Width, info.m_Height,
                   grey ? (deep ? Format::GreyAlpha16 : Format::GreyAlpha8) : (deep ? Format::Rgba16 : Format::Rgba8),
                   MipmapMode::None, HardwareCachePolicy::Default);
    std::vector<png_bytep> rows;
    for (int y = 0; y < info.m_Height; ++y) {
        rows.push_back(bitmap->GetRow(y));
    }
    Source source{bytes};
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, LeaveQuietly, IgnoreWarning);
    png_infop pngInfo = png ? png_create_info_struct(png) : nullptr;
    bool read = false;
    if (pngInfo) {
        png_set_read_fn(png, &source, ReadFromSource);
        png_set_user_limits(png, Picture::MaximumSide, Picture::MaximumSide);
        read = ReadRows(png, pngInfo, bitmap.Get(), rows.data());
    }
    png_destroy_read_struct(&png, &pngInfo, nullptr);
    if (!read) {
        throw PictureFault{Code::Corrupt,
                           Kernel::LocalisedString("is damaged: its pixels can't be unpacked", "Picture")};
    }
    return bitmap;
}

}
