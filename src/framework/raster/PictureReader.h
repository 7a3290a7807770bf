#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "framework/raster/Picture.h"

namespace Raster
{

/// What is wrong with a picture's data; `Picture` adds the file's name.
struct PictureFault
{
    PictureProblem::Code m_Code;
    /// The rest of a sentence that begins with the file's name, such as "ends too early".
    Kernel::LocalisedString m_What;
};

[[nodiscard]] inline PictureFault EndsTooEarly()
{
    return {PictureProblem::Code::Truncated, Kernel::LocalisedString("ends too early", "Picture")};
}

using PictureBytes = std::span<unsigned char const>;

/// Big-endian numbers, as PNG and JPEG have them.
[[nodiscard]] inline std::uint16_t ReadBig16(unsigned char const * at)
{
    return static_cast<std::uint16_t>(at[0] << 8 | at[1]);
}
[[nodiscard]] inline std::uint32_t ReadBig32(unsigned char const * at)
{
    return static_cast<std::uint32_t>(ReadBig16(at)) << 16 | ReadBig16(at + 2);
}

/// Throws a fault if the size is none, or beyond the limits of `Picture`.
void CheckPictureSize(std::uint32_t width, std::uint32_t height);

/// Takes orientation and, where the picture has said nothing, resolution from Exif data (a TIFF header and its first
/// directory). Damaged data are passed by.
void ReadExif(PictureBytes exif, PictureInfo & info);

/// One chunk of a PNG file (ISO 15948).
struct PngChunk
{
    std::uint32_t m_Type;
    PictureBytes m_Data;
};

[[nodiscard]] constexpr std::uint32_t PngType(char const (&name)[5])
{
    return static_cast<std::uint32_t>(name[0]) << 24 | static_cast<std::uint32_t>(name[1]) << 16 |
           static_cast<std::uint32_t>(name[2]) << 8 | static_cast<std::uint32_t>(name[3]);
}

[[nodiscard]] bool IsPng(PictureBytes bytes);
/// The chunks up to IEND with their checksums tested, or up to the first IDAT if only the header is wanted. Throws a
/// fault.
[[nodiscard]] std::vector<PngChunk> ScanPng(PictureBytes bytes, bool headerOnly);
/// Fills in what the chunks before the pixels say. Throws a fault.
void ReadPngInfo(std::vector<PngChunk> const & chunks, PictureInfo & info);
/// The bytes of the embedded profile, empty if there is none or it is damaged.
[[nodiscard]] std::vector<unsigned char> ReadPngProfile(std::vector<PngChunk> const & chunks);
/// Throws a fault.
[[nodiscard]] Kernel::Counted<DynamicBitmap> DecodePng(PictureBytes bytes, PictureInfo const & info);

/// One segment of a JPEG file (ITU T.81, annex B): its marker, and what follows the length.
struct JpegSegment
{
    int m_Marker;
    PictureBytes m_Data;
    /// Where the marker begins, and where the next segment does; a scan's segment includes its coded data.
    std::size_t m_Begin;
    std::size_t m_End;
};

[[nodiscard]] bool IsJpeg(PictureBytes bytes);
/// The segments up to the end of the image, or up to the first scan if only the header is wanted. Throws a fault.
[[nodiscard]] std::vector<JpegSegment> ScanJpeg(PictureBytes bytes, bool headerOnly);
void ReadJpegInfo(std::vector<JpegSegment> const & segments, PictureInfo & info);
[[nodiscard]] std::vector<unsigned char> ReadJpegProfile(std::vector<JpegSegment> const & segments);
/// An XMP packet, or the continuation of one.
[[nodiscard]] bool IsJpegXmp(JpegSegment const & segment);
[[nodiscard]] Kernel::Counted<DynamicBitmap> DecodeJpeg(PictureBytes bytes, PictureInfo const & info);

}
