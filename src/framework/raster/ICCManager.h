#pragma once

#include "framework/raster/ICCProfile.h"

namespace Raster
{

/// How colours outside of the target's gamut are brought into it (ICC.1).
enum class RenderingIntent : int
{
    Perceptual = 0,
    RelativeColorimetric = 1,
    Saturation = 2,
    AbsoluteColorimetric = 3,
};

/// The process's default profiles: sRGB for RGB formats, a grey with sRGB's tone curve, FOGRA39 coated for CMYK, CIE Lab
/// (D50). They are built or read at first use, are the same bytes on every machine, and any thread may ask for them.
class ICCManager
{
public:
    /// The profiles in which a document's numbers are meant, one a colour space, and how colours go from one to another.
    /// A plain value; a null profile means the manager's default for that space.
    struct ICCProfileSet
    {
        Kernel::Consolidated<ICCProfile> m_Rgb;
        Kernel::Consolidated<ICCProfile> m_Grey;
        Kernel::Consolidated<ICCProfile> m_Cmyk;
        Kernel::Consolidated<ICCProfile> m_Lab;
        RenderingIntent m_Intent = RenderingIntent::RelativeColorimetric;
        bool m_BlackPointCompensation = true;

        /// The profile of a space, the manager's default if the set names none; null for `ColourSpace::None`.
        [[nodiscard]] Kernel::Consolidated<ICCProfile> ForSpace(ColourSpace space) const;
        /// Same profiles by content, same intent, same compensation.
        friend bool operator==(ICCProfileSet const & a, ICCProfileSet const & b);
    };

    [[nodiscard]] static ICCManager & GetInstance();

    /// Null for the formats that hold only alpha.
    [[nodiscard]] Kernel::Consolidated<ICCProfile> GetDefaultProfileForFormat(Format format) const;
    [[nodiscard]] Kernel::Consolidated<ICCProfile> GetDefaultProfileForSpace(ColourSpace space) const;

private:
    ICCManager();

    Kernel::Consolidated<ICCProfile> m_Rgb;
    Kernel::Consolidated<ICCProfile> m_Grey;
    Kernel::Consolidated<ICCProfile> m_Cmyk;
    Kernel::Consolidated<ICCProfile> m_Lab;
};

}
