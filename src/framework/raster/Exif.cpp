#include "framework/raster/PictureReader.h"

namespace Raster
{

namespace
{

/// Numbers of a TIFF structure (TIFF 6.0), whichever way round they stand. What lies outside reads as 0.
class TiffReader
{
public:
    explicit TiffReader(PictureBytes bytes) : m_Bytes(bytes)
    {
        m_Big = bytes.size() >= 2 && bytes[0] == 'M' && bytes[1] == 'M';
        m_Sound = bytes.size() >= 8 && (m_Big || (bytes[0] == 'I' && bytes[1] == 'I')) && Read16(2) == 42;
    }

    [[nodiscard]] bool IsSound() const { return m_Sound; }

    [[nodiscard]] std::uint32_t Read16(std::size_t at) const
    {
        if (at + 2 > m_Bytes.size()) {
            return 0;
        }
        return m_Big ? ReadBig16(m_Bytes.data() + at)
                     : static_cast<std::uint32_t>(m_Bytes[at + 1]) << 8 | m_Bytes[at];
    }

    [[nodiscard]] std::uint32_t Read32(std::size_t at) const
    {
        return m_Big ? Read16(at) << 16 | Read16(at + 2) : Read16(at + 2) << 16 | Read16(at);
    }

    [[nodiscard]] double ReadRational(std::size_t at) const
    {
        std::uint32_t const under = Read32(at + 4);
        return under == 0 ? 0 : static_cast<double>(Read32(at)) / under;
    }

private:
    PictureBytes m_Bytes;
    bool m_Big = false;
    bool m_Sound = false;
};

}

void ReadExif(PictureBytes exif, PictureInfo & info)
{
    TiffReader const tiff(exif);
    if (!tiff.IsSound()) {
        return;
    }
    std::size_t const directory = tiff.Read32(4);
    std::uint32_t const count = tiff.Read16(directory);
    double dpiX = 0;
    double dpiY = 0;
    double unit = 1;
    for (std::uint32_t i = 0; i < count; ++i) {
        std::size_t const entry = directory + 2 + std::size_t(i) * 12;
        switch (tiff.Read16(entry)) {
        case 274:
            if (std::uint32_t const orientation = tiff.Read16(entry + 8); orientation >= 1 && orientation <= 8) {
                info.m_Orientation = static_cast<int>(orientation);
            }
            break;
        case 282:
            dpiX = tiff.ReadRational(tiff.Read32(entry + 8));
            break;
        case 283:
            dpiY = tiff.ReadRational(tiff.Read32(entry + 8));
            break;
        case 296:
            // 2 is the inch, 3 the centimetre.
            unit = tiff.Read16(entry + 8) == 3 ? 2.54 : 1;
            break;
        default:
            break;
        }
    }
    if (info.m_DpiX == 0 && info.m_DpiY == 0) {
        info.m_DpiX = dpiX * unit;
        info.m_DpiY = dpiY * unit;
    }
}

}
