#pragma once

#include <cstdint>
#include <vector>

#include "framework/kernel/Serialisable.h"
#include "framework/raster/Format.h"

namespace Raster
{

/// Which scaled-down copies a bitmap keeps. This host keeps none; the number travels with the bitmap.
enum class MipmapMode : int
{
    None = 0,
    OnDemand = 4,
};

/// Where a bitmap may be cached besides memory. This host has no such place.
enum class HardwareCachePolicy : int
{
    Default = 0,
};

/// A pixel of 8-bit red, green, blue and alpha (not premultiplied).
struct Pixel
{
    std::uint8_t m_Red = 0;
    std::uint8_t m_Green = 0;
    std::uint8_t m_Blue = 0;
    std::uint8_t m_Alpha = 0;
};

/// One pixel of any format, as the bytes that a buffer of that format holds.
class DynamicPixel
{
public:
    /// The pixel in a format, by plain arithmetic without profiles.
    DynamicPixel(Pixel const & pixel, Format format);

    [[nodiscard]] Format GetFormat() const { return m_Format; }
    [[nodiscard]] std::uint8_t const * GetBytes() const { return m_Bytes; }

private:
    Format m_Format;
    alignas(float) std::uint8_t m_Bytes[16] = {};
};

/// Rows of pixels from the top, each row directly after the other. Owned by whoever makes it; not for concurrent writers.
class DynamicBase : public virtual Kernel::Countable
{
public:
    [[nodiscard]] int GetWidth() const { return m_Width; }
    [[nodiscard]] int GetHeight() const { return m_Height; }
    [[nodiscard]] Format GetFormat() const { return m_Format; }
    [[nodiscard]] std::size_t GetRowBytes() const { return static_cast<std::size_t>(m_Width) * BytesPerPixel(m_Format); }
    [[nodiscard]] std::uint8_t const * GetRow(int y) const { return m_Pixels.data() + Offset(y); }
    [[nodiscard]] std::uint8_t * GetRow(int y) { return m_Pixels.data() + Offset(y); }
    [[nodiscard]] std::vector<std::uint8_t> const & GetPixels() const { return m_Pixels; }

    /// Sets every pixel; the pixel's format must be this one's.
    void Fill(DynamicPixel const & pixel);

protected:
    /// Transparent pixels (all channels 0). Sizes below 0 count as 0.
    void Allocate(int width, int height, Format format);

private:
    [[nodiscard]] std::size_t Offset(int y) const { return static_cast<std::size_t>(y) * GetRowBytes(); }

    int m_Width = 0;
    int m_Height = 0;
    Format m_Format = Format::Rgba8;
    std::vector<std::uint8_t> m_Pixels;
};

/// A working buffer.
class DynamicBuffer : public DynamicBase
{
public:
    void Create(int width, int height, Format format) { Allocate(width, height, format); }
    /// Makes every pixel transparent; stops early when `*abort` becomes true. `abort` may be null.
    void Clear(bool const * abort);
};

/// A picture in memory that is kept and shared, and can lie in a tagged stream, where its pixels are packed without loss.
class DynamicBitmap : public DynamicBase, public Kernel::Serialisable
{
public:
    /// Greatest width and height, and greatest number of bytes, of a bitmap that is read from a stream.
    static constexpr int MaximumStoredSide = 32767;
    static constexpr std::size_t MaximumStoredBytes = std::size_t(256) << 20;

    void Create(int width, int height, Format format, MipmapMode mipmaps, HardwareCachePolicy policy);

    [[nodiscard]] MipmapMode GetMipmapMode() const { return m_Mipmaps; }
    [[nodiscard]] HardwareCachePolicy GetHardwareCachePolicy() const { return m_Policy; }

    void Save(Kernel::OutSerialiser & out) const override;
    /// False if format, size and packed pixels do not belong together; nothing is allocated by a size that they could
    /// not fill.
    bool Load(Kernel::InSerialiser const & in, Kernel::FileStore & store, unsigned short version) override;
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    [[nodiscard]] static Kernel::ClassProperties const & GetTypeClassProperties();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    MipmapMode m_Mipmaps = MipmapMode::None;
    HardwareCachePolicy m_Policy = HardwareCachePolicy::Default;
};

}
