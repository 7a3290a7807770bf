#include "framework/raster/PictureReader.h"

#include "framework/kernel/LocalisedString.h"

#include <csetjmp>
#include <cstdio>
#include <cstring>

#include <jpeglib.h>
#include <jerror.h>

namespace Raster
{

namespace
{

using Code = PictureProblem::Code;

constexpr int StartOfScan = 0xDA;
constexpr int EndOfImage = 0xD9;

bool StartsWith(PictureBytes data, std::string_view text)
{
    return data.size() >= text.size() && std::memcmp(data.data(), text.data(), text.size()) == 0;
}

/// Markers without a length: TEM, RST0 to RST7, SOI.
bool StandsAlone(int marker)
{
    return marker == 0x01 || (marker >= 0xD0 && marker <= 0xD8);
}

struct ErrorManager
{
    jpeg_error_mgr m_Base;
    std::jmp_buf m_Return;
    bool m_Damaged = false;
};

void LeaveByJump(j_common_ptr info)
{
    std::longjmp(reinterpret_cast<ErrorManager *>(info->err)->m_Return, 1);
}

void NoteMessage(j_common_ptr info, int level)
{
    // Oddities such as bytes before a marker are let be; missing or unreadable data are not.
    int const code = info->err->msg_code;
    if (level < 0 && (code == JWRN_HIT_MARKER || code == JWRN_JPEG_EOF || code == JWRN_HUFF_BAD_CODE)) {
        reinterpret_cast<ErrorManager *>(info->err)->m_Damaged = true;
    }
}

void NoOutput(j_common_ptr) {}

/// libjpeg leaves by longjmp, so nothing in this frame has a destructor.
bool ReadRows(jpeg_decompress_struct & jpeg, ErrorManager & errors, PictureBytes bytes, PictureInfo const & info,
              DynamicBitmap * bitmap)
{
    if (setjmp(errors.m_Return)) {
        return false;
    }
    jpeg_create_decompress(&jpeg);
    jpeg_mem_src(&jpeg, bytes.data(), bytes.size());
    jpeg_read_header(&jpeg, TRUE);
    jpeg.out_color_space = info.m_Space == ColourSpace::Grey ? JCS_GRAYSCALE
                           : info.m_Space == ColourSpace::Rgb ? JCS_EXT_RGBA
                                                              : JCS_CMYK;
    jpeg_start_decompress(&jpeg);
    if (static_cast<int>(jpeg.output_width) != bitmap->GetWidth() ||
        static_cast<int>(jpeg.output_height) != bitmap->GetHeight()) {
        return false;
    }
    while (jpeg.output_scanline < jpeg.output_height && !errors.m_Damaged) {
        // A row without alpha is no longer than one with it: it is read to the row's end and spread from there.
        std::uint8_t * const row = bitmap->GetRow(static_cast<int>(jpeg.output_scanline));
        std::size_t const channels = static_cast<std::size_t>(jpeg.output_components);
        std::size_t const width = jpeg.output_width;
        JSAMPROW target = row + bitmap->GetRowBytes() - width * channels;
        jpeg_read_scanlines(&jpeg, &target, 1);
        if (info.m_Space != ColourSpace::Rgb) {
            for (std::size_t x = 0; x < width; ++x) {
                std::uint8_t * const pixel = row + x * (channels + 1);
                for (std::size_t c = 0; c < channels; ++c) {
                    std::uint8_t const value = target[x * channels + c];
                    pixel[c] = info.m_IsInverted ? static_cast<std::uint8_t>(255 - value) : value;
                }
                pixel[channels] = 255;
            }
        }
    }
    if (!errors.m_Damaged) {
        jpeg_finish_decompress(&jpeg);
    }
    return true;
}

}

bool IsJpeg(PictureBytes bytes)
{
    return bytes.size() >= 3 && bytes[0] == 0xFF && bytes[1] == 0xD8 && bytes[2] == 0xFF;
}

std::vector<JpegSegment> ScanJpeg(PictureBytes bytes, bool headerOnly)
{
    std::vector<JpegSegment> segments;
    std::size_t position = 2;
    while (true) {
        std::size_t const begin = position;
        if (position + 1 >= bytes.size()) {
            throw EndsTooEarly();
        }
        if (bytes[position] != 0xFF) {
            throw PictureFault{Code::Corrupt, Kernel::LocalisedString("is damaged: a marker is missing", "Picture")};
        }
        while (position < bytes.size() && bytes[position] == 0xFF) {
            ++position;
        }
        if (position == bytes.size()) {
            throw EndsTooEarly();
        }
        int const marker = bytes[position++];
        if (marker == EndOfImage || (marker == StartOfScan && headerOnly)) {
            return segments;
        }
        if (StandsAlone(marker)) {
            continue;
        }
        if (position + 2 > bytes.size()) {
            throw EndsTooEarly();
        }
        std::size_t const length = ReadBig16(bytes.data() + position);
        if (length < 2) {
            throw PictureFault{Code::Corrupt,
                               Kernel::LocalisedString("is damaged: a segment has no length", "Picture")};
        }
        if (length > bytes.size() - position) {
            throw EndsTooEarly();
        }
        JpegSegment segment{marker, bytes.subspan(position + 2, length - 2), begin, position + length};
        position += length;
        if (marker == StartOfScan) {
            // Coded data go on to a marker that is neither a stuffed zero nor a restart.
            while (true) {
                void const * found = std::memchr(bytes.data() + position, 0xFF, bytes.size() - position);
                if (!found) {
                    throw EndsTooEarly();
                }
                position = static_cast<std::size_t>(static_cast<unsigned char const *>(found) - bytes.data());
                if (position + 1 >= bytes.size()) {
                    throw EndsTooEarly();
                }
                unsigned char const next = bytes[position + 1];
                if (next != 0 && next != 0xFF && !(next >= 0xD0 && next <= 0xD7)) {
                    break;
                }
                position += next == 0xFF ? 1 : 2;
            }
            segment.m_End = position;
        }
        segments.push_back(segment);
    }
}

void ReadJpegInfo(std::vector<JpegSegment> const & segments, PictureInfo & info)
{
    info.m_Kind = PictureKind::Jpeg;
    bool adobe = false;
    int components = 0;
    for (JpegSegment const & segment : segments) {
        PictureBytes const data = segment.m_Data;
        int const marker = segment.m_Marker;
        // Frame headers: SOF0 to SOF15 but for DHT, JPG and DAC.
        if (marker >= 0xC0 && marker <= 0xCF && marker != 0xC4 && marker != 0xC8 && marker != 0xCC) {
            if (data.size() < 6) {
                throw PictureFault{Code::Corrupt, Kernel::LocalisedString("has a damaged header", "Picture")};
            }
            if (marker > 0xC2 || data[0] != 8) {
                throw PictureFault{
                    Code::Unsupported,
                    Kernel::LocalisedString("is a lossless, arithmetic or 12-bit JPEG, which is not read", "Picture")};
            }
            CheckPictureSize(ReadBig16(data.data() + 3), ReadBig16(data.data() + 1));
            info.m_Height = ReadBig16(data.data() + 1);
            info.m_Width = ReadBig16(data.data() + 3);
            components = data[5];
        } else if (marker == 0xE0 && StartsWith(data, std::string_view("JFIF\0", 5)) && data.size() >= 12) {
            double const scale = data[7] == 1 ? 1.0 : data[7] == 2 ? 2.54 : 0.0;
            info.m_DpiX = ReadBig16(data.data() + 8) * scale;
            info.m_DpiY = ReadBig16(data.data() + 10) * scale;
        } else if (marker == 0xE1 && StartsWith(data, std::string_view("Exif\0\0", 6))) {
            ReadExif(data.subspan(6), info);
        } else if (marker == 0xEE && StartsWith(data, "Adobe")) {
            adobe = true;
        }
    }
    if (components != 1 && components != 3 && components != 4) {
        throw components == 0
            ? PictureFault{Code::Corrupt, Kernel::LocalisedString("has no frame header", "Picture")}
            : PictureFault{Code::Unsupported,
                           Kernel::LocalisedString("has a number of colour channels that is not read", "Picture")};
    }
    info.m_Space = components == 1 ? ColourSpace::Grey : components == 3 ? ColourSpace::Rgb : ColourSpace::Cmyk;
    info.m_IsInverted = components == 4 && adobe;
}

std::vector<unsigned char> ReadJpegProfile(std::vector<JpegSegment> const & segments)
{
    static constexpr std::string_view name("ICC_PROFILE\0", 12);
    std::vector<PictureBytes> parts(256);
    std::size_t count = 0;
    for (JpegSegment const & segment : segments) {
        if (segment.m_Marker == 0xE2 && StartsWith(segment.m_Data, name) && segment.m_Data.size() > name.size() + 2) {
            parts[segment.m_Data[name.size()]] = segment.m_Data.subspan(name.size() + 2);
            count = segment.m_Data[name.size() + 1];
        }
    }
    std::vector<unsigned char> profile;
    for (std::size_t part = 1; part <= count; ++part) {
        if (parts[part].empty()) {
            return {};
        }
        profile.insert(profile.end(), parts[part].begin(), parts[part].end());
    }
    return profile;
}

bool IsJpegXmp(JpegSegment const & segment)
{
    return segment.m_Marker == 0xE1 && (StartsWith(segment.m_Data, "http://ns.adobe.com/xap/1.0/") ||
                                        StartsWith(segment.m_Data, "http://ns.adobe.com/xmp/extension/"));
}

Kernel::Counted<DynamicBitmap> DecodeJpeg(PictureBytes bytes, PictureInfo const & info)
{
    static_cast<void>(ScanJpeg(bytes, false));
    Kernel::Counted<DynamicBitmap> bitmap = Kernel::MakeCounted<DynamicBitmap>();
    bitmap->Create(info.m_Width, info.m_Height,
                   info.m_Space == ColourSpace::Grey  ? Format::GreyAlpha8
                   : info.m_Space == ColourSpace::Rgb ? Format::Rgba8
                                                      : Format::Cmyka8,
                   MipmapMode::None, HardwareCachePolicy::Default);
    jpeg_decompress_struct jpeg{};
    ErrorManager errors{};
    jpeg.err = jpeg_std_error(&errors.m_Base);
    errors.m_Base.error_exit = LeaveByJump;
    errors.m_Base.emit_message = NoteMessage;
    errors.m_Base.output_message = NoOutput;
    bool const read = ReadRows(jpeg, errors, bytes, info, bitmap.Get());
    jpeg_destroy_decompress(&jpeg);
    if (!read || errors.m_Damaged) {
        throw PictureFault{Code::Corrupt,
                           Kernel::LocalisedString("is damaged: its pixels can't be unpacked", "Picture")};
    }
    return bitmap;
}

}
