#pragma once

#include "framework/raster/Colour.h"
#include "framework/raster/ICCManager.h"

namespace Raster
{

/// A prepared conversion of colours between two profiles. Immutable; one object serves any number of threads at once, as
/// it keeps no cache of its last colour.
class ColourTransform : public virtual Kernel::Countable
{
public:
    /// How the numbers lie in memory. `Native` is floats, as in `Colour` without alpha; the others are whole pixels of
    /// 8- or 16-bit channels without or with a last alpha channel, which is copied.
    enum class Layout
    {
        Native,
        Channels8,
        Channels16,
        Channels8Alpha,
        Channels16Alpha,
    };

    /// The transform for these, from a table of those made before. Null if the colour engine has none between the two
    /// profiles, which is told to the diagnostic trace.
    [[nodiscard]] static Kernel::Counted<ColourTransform const>
    Get(Kernel::Consolidated<ICCProfile> const & source, Layout sourceLayout,
        Kernel::Consolidated<ICCProfile> const & target, Layout targetLayout, RenderingIntent intent,
        bool blackPointCompensation);

    ColourTransform(ColourTransform const &) = delete;
    ColourTransform & operator=(ColourTransform const &) = delete;
    ~ColourTransform() override;

    /// Converts `pixels` pixels; the two may be the same memory if the layouts are of one size.
    void Convert(void const * source, void * target, std::size_t pixels) const;

private:
    explicit ColourTransform(void * handle) : m_Handle(handle) {}

    void * m_Handle;
};

/// One colour in another space, through the set's profiles. A colour that is in the space already comes back as it is;
/// grey goes to CMYK as black ink alone, so that black text stays one ink. Alpha is kept.
[[nodiscard]] Colour ConvertColour(Colour const & colour, ColourSpace target, ICCManager::ICCProfileSet const & profiles);

}
