#include "framework/raster/ICCProfile.h"

#include "framework/kernel/HashAccumulator.h"
#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/LocalisedString.h"
#include "framework/kernel/OutSerialiser.h"

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

Kernel::ClassProperties const ICCProfile::ms_ClassProperties(
    Kernel::ClassUID("ICCP"), [] { return Kernel::Counted<Kernel::Serialisable>(new ICCProfile); }, 1, {}, nullptr);
static Kernel::ClassPropertiesBase::Init const s_ICCProfileInit(ICCProfile::GetTypeClassProperties());

bool ICCProfile::Take(std::vector<unsigned char> bytes, String & reason)
{
    ProfileHandle const handle(cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size())));
    if (!handle) {
        reason = Kernel::LocalisedString("The colour profile is damaged.", "Picture");
        return false;
    }
    m_Space = SpaceOf(cmsGetColorSpace(handle.get()));
    if (m_Space == ColourSpace::None) {
        reason = Kernel::LocalisedString("The colour profile is not for grey, RGB, CMYK or Lab colours.", "Picture");
        return false;
    }
    char name[256] = {};
    cmsGetProfileInfoASCII(handle.get(), cmsInfoDescription, "en", "US", name, sizeof(name));
    m_Description = name[0] ? name : "Unnamed profile";
    m_Hash = Kernel::HashBytes64(bytes.data(), bytes.size());
    m_Bytes = std::move(bytes);
    return true;
}

Kernel::Consolidated<ICCProfile> ICCProfile::FromBytes(std::vector<unsigned char> bytes, String & reason)
{
    Kernel::Counted<ICCProfile> profile(new ICCProfile);
    return profile->Take(std::move(bytes), reason) ? Kernel::Counted<ICCProfile const>(profile) : nullptr;
}

void ICCProfile::Save(Kernel::OutSerialiser & out) const
{
    out.SaveData("Data", m_Bytes);
}

bool ICCProfile::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    std::span<std::uint8_t const> bytes;
    String reason;
    return in.LoadData("Data", bytes) && Take({bytes.begin(), bytes.end()}, reason);
}

Kernel::ClassProperties const & ICCProfile::GetObjectClassProperties() const
{
    return ms_ClassProperties;
}

Kernel::ClassProperties const & ICCProfile::GetTypeClassProperties()
{
    return ms_ClassProperties;
}

bool ICCProfile::IsSame(ICCProfile const & other) const
{
    return this == &other || (m_Hash == other.m_Hash && m_Bytes == other.m_Bytes);
}

}
