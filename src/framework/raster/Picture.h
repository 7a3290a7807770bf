#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "framework/kernel/LocalisedString.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/ICCProfile.h"

namespace Raster
{

/// File formats that a picture may have; told from the content.
enum class PictureKind
{
    Png,
    Jpeg,
};

/// Why a picture can't be had.
struct PictureProblem
{
    enum class Code
    {
        None,
        NotFound,
        AccessDenied,
        ReadError,
        /// None of the kinds that are read.
        UnknownKind,
        Truncated,
        Corrupt,
        /// Declares more pixels than the limit.
        TooLarge,
        /// A form of the format that is not read (12-bit JPEG, for example).
        Unsupported,
        /// Needs a password that is not known.
        Locked,
        /// The file has fewer pages.
        NoSuchPage,
    };

    Code m_Code = Code::None;
    /// Path of the file, empty for a picture in memory.
    String m_Path;
    /// One sentence that names the file and what is wrong with it.
    String m_Text;
    /// The rest of that sentence behind the file's name, such as "is damaged (%1)", and its value.
    Kernel::LocalisedString m_What;
    String m_Detail;
};

/// Fills in a problem: `what` is the rest of a sentence that begins with the picture's name, such as "is damaged (%1)",
/// and `detail` what stands for %1 in it.
void Report(PictureProblem & problem, PictureProblem::Code code, String const & path,
            Kernel::LocalisedString const & what, String const & detail);
void Report(PictureProblem & problem, PictureProblem::Code code, String const & path,
            Kernel::LocalisedString const & what);

/// What a picture's header says. Nothing is decoded for it.
struct PictureInfo
{
    PictureKind m_Kind = PictureKind::Png;
    /// Pixels as stored, before orientation.
    int m_Width = 0;
    int m_Height = 0;
    ColourSpace m_Space = ColourSpace::Rgb;
    /// 8 or 16 once decoded; palettes and fewer bits count as 8.
    int m_BitsPerChannel = 8;
    /// Bits of a sample in the file: 1, 2, 4, 8 or 16.
    int m_StoredBits = 8;
    bool m_HasAlpha = false;
    bool m_IsPalette = false;
    bool m_IsInterlaced = false;
    /// CMYK with the inverted polarity that an Adobe marker announces.
    bool m_IsInverted = false;
    /// The file's extension promises another kind.
    bool m_WrongExtension = false;
    /// Exif orientation: 1 upright, 3 half turn, 6 to be turned clockwise by a quarter, 8 anticlockwise, even ones
    /// mirrored (TIFF 6.0, tag 274).
    int m_Orientation = 1;
    /// Pixels per inch along the stored width and height, 0 if the file does not say.
    double m_DpiX = 0;
    double m_DpiY = 0;

    /// Orientations 5 to 8 swap width and height.
    [[nodiscard]] bool IsTurned() const { return m_Orientation >= 5; }
    [[nodiscard]] int UprightWidth() const { return IsTurned() ? m_Height : m_Width; }
    [[nodiscard]] int UprightHeight() const { return IsTurned() ? m_Width : m_Height; }
    [[nodiscard]] double UprightDpiX() const { return IsTurned() ? m_DpiY : m_DpiX; }
    [[nodiscard]] double UprightDpiY() const { return IsTurned() ? m_DpiX : m_DpiY; }
};

/// A PNG or JPEG file. Opening it reads the header only; pixels and bytes are read when they are asked for, and are not
/// kept. Immutable: any thread may call anything at any time. The file may go or change meanwhile; the operations that
/// read it say so.
class Picture : public virtual Kernel::Countable
{
public:
    /// Greatest width and height, and greatest count of pixels, that are accepted.
    static constexpr int MaximumSide = 65500;
    static constexpr std::int64_t MaximumPixels = 200'000'000;

    using Bytes = std::shared_ptr<std::vector<unsigned char> const>;

    /// Null with a reason in `problem` if the file is missing, unreadable, of another kind, or has a damaged header.
    [[nodiscard]] static Kernel::Counted<Picture const> FromFile(String const & path, PictureProblem & problem);
    /// The same for a picture in memory; `name` stands for it in texts.
    [[nodiscard]] static Kernel::Counted<Picture const> FromBytes(Bytes bytes, String const & name,
                                                                  PictureProblem & problem);

    [[nodiscard]] PictureInfo const & GetInfo() const { return m_Info; }
    /// The path, or the name of a picture in memory.
    [[nodiscard]] String const & GetPath() const { return m_Path; }

    /// The whole file. Null with a reason if it can't be read.
    [[nodiscard]] Bytes ReadBytes(PictureProblem & problem) const;

    /// The pixels upright: Rgba8, Rgba16, GreyAlpha8, GreyAlpha16 or Cmyka8, by the picture's space and bits; CMYK with
    /// 0 for no ink. Null with a reason if the file is truncated or damaged anywhere.
    [[nodiscard]] Kernel::Counted<DynamicBitmap const> Decode(PictureProblem & problem) const;
    /// The same as stored, without regard to orientation.
    [[nodiscard]] Kernel::Counted<DynamicBitmap const> DecodeAsStored(PictureProblem & problem) const;

    /// The embedded profile if it is sound and fits the picture's space, otherwise null.
    [[nodiscard]] Kernel::Consolidated<ICCProfile> ReadProfile() const;

private:
    Picture() = default;

    String m_Path;
    /// Null for a picture in a file.
    Bytes m_Bytes;
    PictureInfo m_Info;
};

/// A picture's file as it is, of whatever kind. Null with a reason if it is missing, no file, or can't be read.
[[nodiscard]] Picture::Bytes ReadPictureFile(String const & path, PictureProblem & problem);

}
