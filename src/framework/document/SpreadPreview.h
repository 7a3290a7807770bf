#pragma once

#include "framework/document/DocumentController.h"
#include "framework/kernel/RawData.h"
#include "framework/raster/DynamicBitmap.h"

/// Pictures of spreads for people who look for a file: bitmaps to keep, and the PNG that is made from one.
class SpreadPreview
{
public:
    /// A spread larger than this is halved until it is not. Smaller ones have one pixel to the point.
    static constexpr int MaximumSide = 1024;
    /// Longest side of the PNG, which is what file managers ask for at most.
    static constexpr int PngSide = 512;

    /// Renders the pages of a spread, or what a solo view of the spread shows alone, in the document's format, on a
    /// transparent ground. Null for a spread that is not there or whose pages have no area, or if there is no memory.
    /// Takes the document's reader lock; not for callers who hold a lock that a command of the document waits for.
    [[nodiscard]] static Kernel::Counted<Raster::DynamicBitmap>
    Render(Kernel::Counted<DocumentController const> const & document, int spreadIndex);

    /// The bitmap, scaled to a spread of these measures, as the bytes of a PNG in the default RGB profile. The longer
    /// side is `PngSide`, the other one is cut to whole pixels.
    /// \param transparent leaves the ground transparent; otherwise it is white
    /// \param profile, profiles of the document: what the bitmap's colours are meant in, and how they are converted
    /// Null for measures that leave a side without a pixel, and for a bitmap without colours.
    [[nodiscard]] static Kernel::Counted<Kernel::RawData>
    Encode(Raster::DynamicBitmap const & bitmap, double width, double height, bool transparent,
           Kernel::Consolidated<Raster::ICCProfile> const & profile,
           Raster::ICCManager::ICCProfileSet const & profiles);
    /// The same in the present shape, ground and colours of the document's first spread. Takes the document's reader
    /// lock.
    [[nodiscard]] static Kernel::Counted<Kernel::RawData>
    EncodeFirst(Raster::DynamicBitmap const & bitmap, Kernel::Counted<DocumentController const> const & document);

    /// The picture in such a PNG as a bitmap of this format. Null for bytes that are none, or hold a larger picture.
    [[nodiscard]] static Kernel::Counted<Raster::DynamicBitmap const>
    Decode(Kernel::RawData const & png, Raster::Format format, Raster::ICCManager::ICCProfileSet const & profiles);
};
