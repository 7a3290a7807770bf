#pragma once

#include "framework/kernel/RawData.h"
#include "framework/raster/ColourTransform.h"
#include "framework/raster/DynamicBitmap.h"

namespace Raster
{

/// How pictures are encoded.
struct ExportOptions
{
    /// 1 quick to 9 small.
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

    /// Writes the whole file from a buffer of any format with colours, converted as `ConvertBitmap` does it. The
    /// destination profile must be RGB; the file states it. False if the buffer has another size or holds no colours.
    [[nodiscard]] bool Write(DynamicBase const & buffer, Kernel::Consolidated<ICCProfile> const & source,
                             Kernel::Consolidated<ICCProfile> const & destination, RenderingIntent intent,
                             bool blackPointCompensation);

private:
    Kernel::Counted<CompressedRasterData> m_Data;
    int m_Width;
    int m_Height;
    ExportOptions m_Options;
};

/// A bitmap in another format, converted from one profile to the other; null stands for the default of the format. Where
/// no transform applies, because a profile is for other colours than its format or the colour engine has none between
/// the two, plain arithmetic converts (`ConvertPixels`). Null if one of the formats holds no colours.
[[nodiscard]] Kernel::Counted<DynamicBitmap> ConvertBitmap(DynamicBase const & bitmap,
                                                           Kernel::Consolidated<ICCProfile> const & source,
                                                           Format format,
                                                           Kernel::Consolidated<ICCProfile> const & target,
                                                           RenderingIntent intent, bool blackPointCompensation);

/// The same to 8-bit red, green, blue and alpha.
[[nodiscard]] inline Kernel::Counted<DynamicBitmap>
ConvertToRgba8(DynamicBase const & bitmap, Kernel::Consolidated<ICCProfile> const & source,
               Kernel::Consolidated<ICCProfile> const & target, RenderingIntent intent, bool blackPointCompensation)
{
    return ConvertBitmap(bitmap, source, Format::Rgba8, target, intent, blackPointCompensation);
}

}
