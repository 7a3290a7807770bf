#include "framework/raster/ICCManager.h"

#include "framework/kernel/Assert.h"

#include <cstring>
#include <lcms2.h>

// The default CMYK profile lies in the library itself, so that output never depends on what is installed.
__asm__(".section .rodata\n"
        ".balign 16\n"
        ".global korvane_cmyk_profile\n"
        ".hidden korvane_cmyk_profile\n"
        "korvane_cmyk_profile:\n"
        ".incbin \"" KORVANE_CMYK_PROFILE "\"\n"
        ".global korvane_cmyk_profile_end\n"
        ".hidden korvane_cmyk_profile_end\n"
        "korvane_cmyk_profile_end:\n"
        ".previous\n");
extern "C" unsigned char const korvane_cmyk_profile[];
extern "C" unsigned char const korvane_cmyk_profile_end[];

namespace Raster
{

namespace
{

/// The bytes of a profile that the colour engine has made, without the day on which it did so.
Kernel::Consolidated<ICCProfile> Finish(cmsHPROFILE handle)
{
    KORVANE_ASSERT(handle);
    cmsUInt32Number size = 0;
    cmsSaveProfileToMem(handle, nullptr, &size);
    std::vector<unsigned char> bytes(size);
    cmsSaveProfileToMem(handle, bytes.data(), &size);
    cmsCloseProfile(handle);
    // Date of making and profile id (ICC.1, 7.2).
    static constexpr unsigned char date[] = {0x07, 0xEA, 0, 1, 0, 1, 0, 0, 0, 0, 0, 0};
    std::memcpy(bytes.data() + 24, date, sizeof(date));
    std::memset(bytes.data() + 84, 0, 16);
    String reason;
    Kernel::Consolidated<ICCProfile> profile = ICCProfile::FromBytes(std::move(bytes), reason);
    KORVANE_ASSERT(profile);
    return profile;
}

void Describe(cmsHPROFILE handle, wchar_t const * name)
{
    cmsMLU * const text = cmsMLUalloc(nullptr, 1);
    cmsMLUsetWide(text, "en", "US", name);
    cmsWriteTag(handle, cmsSigProfileDescriptionTag, text);
    cmsMLUfree(text);
}

Kernel::Consolidated<ICCProfile> MakeGrey()
{
    // The curve of sRGB (IEC 61966-2-1), so that grey and equal red, green and blue are one colour.
    cmsFloat64Number const curve[] = {2.4, 1 / 1.055, 0.055 / 1.055, 1 / 12.92, 0.04045};
    cmsToneCurve * const tone = cmsBuildParametricToneCurve(nullptr, 4, curve);
    cmsHPROFILE const handle = cmsCreateGrayProfile(cmsD50_xyY(), tone);
    cmsFreeToneCurve(tone);
    Describe(handle, L"Grey with the sRGB curve");
    return Finish(handle);
}

Kernel::Consolidated<ICCProfile> MakeRgb()
{
    cmsHPROFILE const handle = cmsCreate_sRGBProfile();
    Describe(handle, L"sRGB");
    return Finish(handle);
}

bool IsSame(Kernel::Consolidated<ICCProfile> const & a, Kernel::Consolidated<ICCProfile> const & b)
{
    return a == b || (a && b && a->IsSame(*b));
}

}

ICCManager::ICCManager()
    : m_Rgb(MakeRgb()), m_Grey(MakeGrey()), m_Lab(Finish(cmsCreateLab4Profile(nullptr)))
{
    String reason;
    m_Cmyk = ICCProfile::FromBytes({korvane_cmyk_profile, korvane_cmyk_profile_end}, reason);
    KORVANE_ASSERT(m_Cmyk);
}

ICCManager & ICCManager::GetInstance()
{
    static ICCManager instance;
    return instance;
}

Kernel::Consolidated<ICCProfile> ICCManager::GetDefaultProfileForFormat(Format format) const
{
    return GetDefaultProfileForSpace(SpaceOfFormat(format));
}

Kernel::Consolidated<ICCProfile> ICCManager::GetDefaultProfileForSpace(ColourSpace space) const
{
    switch (space) {
    case ColourSpace::None:
        return nullptr;
    case ColourSpace::Grey:
        return m_Grey;
    case ColourSpace::Rgb:
        return m_Rgb;
    case ColourSpace::Cmyk:
        return m_Cmyk;
    case ColourSpace::Lab:
        return m_Lab;
    }
    return nullptr;
}

Kernel::Consolidated<ICCProfile> ICCManager::ICCProfileSet::ForSpace(ColourSpace space) const
{
    Kernel::Consolidated<ICCProfile> const & own = space == ColourSpace::Rgb    ? m_Rgb
                                                   : space == ColourSpace::Grey ? m_Grey
                                                   : space == ColourSpace::Cmyk ? m_Cmyk
                                                                                : m_Lab;
    return own && space != ColourSpace::None ? own : GetInstance().GetDefaultProfileForSpace(space);
}

bool operator==(ICCManager::ICCProfileSet const & a, ICCManager::ICCProfileSet const & b)
{
    return IsSame(a.m_Rgb, b.m_Rgb) && IsSame(a.m_Grey, b.m_Grey) && IsSame(a.m_Cmyk, b.m_Cmyk) &&
           IsSame(a.m_Lab, b.m_Lab) && a.m_Intent == b.m_Intent &&
           a.m_BlackPointCompensation == b.m_BlackPointCompensation;
}

}
