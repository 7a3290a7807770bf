#include "framework/raster/ICCProfile.h"

#include "framework/kernel/HashAccumulator.h"

#include <lcms2.h>
#include <memory>

namespace Raster
{

namespace
{

struct ProfileCloser
{
    void operator()(void * handle) const { cmsCloseProfile(handle); }
};
using ProfileHandle = std::unique_ptr<void, ProfileCloser>;

ColourSpace SpaceOf(cmsColorSpaceSignature signature)
{
    switch (signature) {
    case cmsSigGrayData:
        return ColourSpace::Grey;
    case cmsSigRgbData:
        return ColourSpace::Rgb;
    case cmsSigCmykData:
        return ColourSpace::Cmyk;
    case cmsSigLabData:
        return ColourSpace::Lab;
    default:
        return ColourSpace::None;
    }
}

}

Kernel::Consolidated<ICCProfile> ICCProfile::FromBytes(std::vector<unsigned char> bytes, String & reason)
{
    ProfileHandle const handle(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size())));
    if (!handle) {
        reason = "The colour profile is damaged.";
        return nullptr;
    }
    ColourSpace const space = SpaceOf(cmsGetColorSpace(handle.get()));
    if (space == ColourSpace::None) {
        reason = "The colour profile is not for grey, RGB, CMYK or Lab colours.";
        return nullptr;
    }
    Kernel::Counted<ICCProfile> profile(new ICCProfile);
    char name[256] = {};
    cmsGetProfileInfoASCII(handle.get(), cmsInfoDescription, "en", "US", name, sizeof(name));
    profile->m_Description = name[0] ? name : "Unnamed profile";
    profile->m_Space = space;
    profile->m_Hash = Kernel::HashBytes64(bytes.data(), bytes.size());
    profile->m_Bytes = std::move(bytes);
    return Kernel::Counted<ICCProfile const>(profile);
}

bool ICCProfile::IsSame(ICCProfile const & other) const
{
    return this == &other || (m_Hash == other.m_Hash && m_Bytes == other.m_Bytes);
}

}
