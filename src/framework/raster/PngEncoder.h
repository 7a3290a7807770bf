#pragma once

#include "framework/kernel/RawData.h"
#include "framework/raster/ColourTransform.h"
#include "framework/raster/DynamicBitmap.h"

namespace Raster
{

/// How pictures are encoded.
struct ExportOptions
{
    /// 1 quick to 12 small.
    int m_Compression = 6;
    /// Pixels to the inch for the file to state; 0 states none.
    double m_Dpi = 0;
};

/// The bytes of an encoded picture.
class CompressedRasterData : public virtual Kernel::Countable
{
public:
    void Append(void const * data, std::size_t size);
    [[nodiscard]] std::vector<std::uint8_t> const & GetBytes() const { return m_Bytes; }
    /// Gives the bytes away; this object is empty afterwards.
    [[nodiscard]] Kernel::Counted<Kernel::RawData> RelinquishOwnership();

private:
    std::vector<std::uint8_t> m_Bytes;
};

/// Writes one PNG file (ISO 15948) of 8-bit red, green, blue and alpha into compressed data.
class PNGBase
{
public:
    /// The size is that of the buffers that are written.
    PNGBase(Kernel::Counted<CompressedRasterData> data, int width, int height, ExportOptions const & options);

    /// Writes the whole file from a buffer of any format with colours. They are converted from the source profile, which
    /// null makes the format's default, to the destination profile, which must be RGB. False if the buffer has another
    /// size, holds no colours, or there is no transform.
    [[nodiscard]] bool Write(DynamicBase const & buffer, Kernel::Consolidated<ICCProfile> const & source,
                             Kernel::Consolidated<ICCProfile> const & destination, RenderingIntent intent,
                             bool blackPointCompensation);

private:
    void WriteChunk(char const (&type)[5], std::string_view data);

    Kernel::Counted<CompressedRasterData> m_Data;
    int m_Width;
    int m_Height;
    ExportOptions m_Options;
};

/// A bitmap in 8-bit red, green, blue and alpha in the target profile; null if it holds no colours or there is no
/// transform. A null source profile means the format's default.
[[nodiscard]] Kernel::Counted<DynamicBitmap> ConvertToRgba8(DynamicBase const & bitmap,
                                                            Kernel::Consolidated<ICCProfile> const & source,
                                                            Kernel::Consolidated<ICCProfile> const & target,
                                                            RenderingIntent intent, bool blackPointCompensation);

}
