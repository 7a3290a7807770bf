#include "framework/raster/ColourTransform.h"

#include "framework/kernel/Assert.h"
#include "framework/kernel/Trace.h"

#include <lcms2.h>
#include <mutex>
#include <tuple>

namespace Raster
{

namespace
{

using Layout = ColourTransform::Layout;

cmsUInt32Number FormatOf(ColourSpace space, Layout layout)
{
    static constexpr int spaces[] = {PT_ANY, PT_GRAY, PT_RGB, PT_CMYK, PT_Lab};
    cmsUInt32Number format = COLORSPACE_SH(static_cast<unsigned>(spaces[static_cast<int>(space)])) |
                             CHANNELS_SH(static_cast<unsigned>(ChannelCount(space)));
    switch (layout) {
    case Layout::Native:
        return format | FLOAT_SH(1U) | BYTES_SH(4U);
    case Layout::Channels8:
        return format | BYTES_SH(1U);
    case Layout::Channels16:
        return format | BYTES_SH(2U);
    case Layout::Channels8Alpha:
        return format | BYTES_SH(1U) | EXTRA_SH(1U);
    case Layout::Channels16Alpha:
        return format | BYTES_SH(2U) | EXTRA_SH(1U);
    }
    return format;
}

struct Made
{
    std::mutex m_Lock;
    /// Keyed by the profiles' hashes and lengths, the layouts, the intent and the compensation.
    std::map<std::tuple<std::uint64_t, std::size_t, int, std::uint64_t, std::size_t, int, int, bool>,
             Kernel::Counted<ColourTransform const>>
        m_Transforms;
};

Made & AllMade()
{
    static Made made;
    return made;
}

struct ProfileCloser
{
    void operator()(void * handle) const { cmsCloseProfile(handle); }
};

std::unique_ptr<void, ProfileCloser> Open(ICCProfile const & profile)
{
    std::vector<unsigned char> const & bytes = profile.GetBytes();
    return std::unique_ptr<void, ProfileCloser>(
        cmsOpenProfileFromMem(bytes.data(), static_cast<cmsUInt32Number>(bytes.size())));
}

}

ColourTransform::~ColourTransform()
{
    cmsDeleteTransform(m_Handle);
}

Kernel::Counted<ColourTransform const>
ColourTransform::Get(Kernel::Consolidated<ICCProfile> const & source, Layout sourceLayout,
                     Kernel::Consolidated<ICCProfile> const & target, Layout targetLayout, RenderingIntent intent,
                     bool blackPointCompensation)
{
    KORVANE_ASSERT(source && target);
    Made & made = AllMade();
    std::lock_guard const lock(made.m_Lock);
    auto const [place, added] = made.m_Transforms.try_emplace(
        {source->GetHash(), source->GetBytes().size(), static_cast<int>(sourceLayout), target->GetHash(),
         target->GetBytes().size(), static_cast<int>(targetLayout), static_cast<int>(intent), blackPointCompensation},
        nullptr);
    if (added) {
        auto const from = Open(*source);
        auto const to = Open(*target);
        cmsUInt32Number flags = cmsFLAGS_NOCACHE | (blackPointCompensation ? cmsFLAGS_BLACKPOINTCOMPENSATION : 0U);
        if (sourceLayout == Layout::Channels8Alpha || sourceLayout == Layout::Channels16Alpha) {
            flags |= cmsFLAGS_COPY_ALPHA;
        }
        cmsHTRANSFORM const handle =
            from && to ? cmsCreateTransform(from.get(), FormatOf(source->GetSpace(), sourceLayout), to.get(),
                                            FormatOf(target->GetSpace(), targetLayout),
                                            static_cast<cmsUInt32Number>(intent), flags)
                       : nullptr;
        if (handle) {
            place->second = Kernel::Counted<ColourTransform const>(new ColourTransform(handle));
        } else {
            Kernel::Trace(Kernel::ConcatString({"Colour engine failed to create transform between ",
                                                source->GetDescription().View(), " and ",
                                                target->GetDescription().View(), "\r\n"}));
        }
    }
    return place->second;
}

void ColourTransform::Convert(void const * source, void * target, std::size_t pixels) const
{
    constexpr std::size_t most = std::size_t(1) << 24;
    KORVANE_ASSERT(pixels <= most);
    cmsDoTransform(m_Handle, source, target, static_cast<cmsUInt32Number>(pixels));
}

Colour ConvertColour(Colour const & colour, ColourSpace target, ICCManager::ICCProfileSet const & profiles)
{
    if (colour.m_Space == target || target == ColourSpace::None || colour.m_Space == ColourSpace::None) {
        return colour;
    }
    if (colour.m_Space == ColourSpace::Grey && target == ColourSpace::Cmyk) {
        return Colour::Cmyk(0, 0, 0, 1 - colour.m_Components[0], colour.m_Alpha);
    }
    Kernel::Counted<ColourTransform const> const transform =
        ColourTransform::Get(profiles.ForSpace(colour.m_Space), Layout::Native, profiles.ForSpace(target),
                             Layout::Native, profiles.m_Intent, profiles.m_BlackPointCompensation);
    Colour converted = colour;
    converted.m_Space = target;
    converted.m_Components = {};
    if (!transform) {
        return colour;
    }
    // The colour engine counts ink from 0 to 100.
    std::array<float, 4> from = colour.m_Components;
    if (colour.m_Space == ColourSpace::Cmyk) {
        for (float & component : from) {
            component *= 100;
        }
    }
    transform->Convert(from.data(), converted.m_Components.data(), 1);
    if (target != ColourSpace::Lab) {
        for (float & component : converted.m_Components) {
            component = std::clamp(target == ColourSpace::Cmyk ? component / 100 : component, 0.0F, 1.0F);
        }
    }
    return converted;
}

}
