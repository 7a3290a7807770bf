#pragma once

#include <map>
#include <string>
#include <vector>

#include "framework/kernel/HashAccumulator.h"
#include "framework/render/DisplayList.h"
#include "framework/render/PdfCompressor.h"
#include "framework/render/PdfResources.h"
#include "framework/render/Schema.h"
#include "framework/render/Warning.h"

namespace Renderer::RenderTree
{

/// Makes image XObjects of placed pictures, each content once. JPEG data go into the file as they are, without their XMP
/// packets; PNG data too, where PDF knows their form; everything else is decoded and packed anew.
class PdfPictures
{
public:
    PdfPictures(PdfSchema const & schema, PdfResources & resources, PdfSpill & spill);

    /// Warnings go there, for this page, from now on. `warnings` may be null.
    void BeginPage(int page, std::vector<Warning> * warnings);

    /// The image for a placed picture that covers this many points; false with a warning if it can't be had.
    [[nodiscard]] bool ImageFor(PlacedPicture const & placed, Kernel::Size const & size, std::uint32_t & image);

private:
    /// A picture's content, and the size that it is reduced to.
    struct Key
    {
        Kernel::Hash128 m_Content;
        int m_Width = 0;
        int m_Height = 0;
        friend auto operator<=>(Key const &, Key const &) = default;
    };

    [[nodiscard]] bool FromPicture(Raster::Picture const & picture, Kernel::Size const & size, std::uint32_t & image);
    [[nodiscard]] bool FromBitmap(PlacedPicture const & placed, std::uint32_t & image);
    /// The data of the file as they are; false if PDF can't take them so.
    [[nodiscard]] bool TakeJpeg(Raster::Picture const & picture, Raster::Picture::Bytes const & bytes,
                                std::uint32_t & image);
    [[nodiscard]] bool TakePng(Raster::Picture const & picture, Raster::Picture::Bytes const & bytes,
                               std::uint32_t & image);
    std::uint32_t Pack(Raster::DynamicBitmap const & bitmap, Kernel::Consolidated<Raster::ICCProfile> const & profile);
    void SetColourSpace(PdfImage & image, Raster::ColourSpace space,
                        Kernel::Consolidated<Raster::ICCProfile> const & profile);
    SpillRange Deflate(std::string_view data);
    /// The pixels that the picture is to have at this size on the page: fewer than it has, if the options limit them.
    [[nodiscard]] bool IsReduced(Raster::PictureInfo const & info, Kernel::Size const & size, int & width,
                                 int & height) const;
    void Warn(Warning::Code code, String const & path, String const & text);
    void CheckResolution(Raster::Picture const & picture, Kernel::Size const & size);

    PdfSchema const & m_Schema;
    PdfResources & m_Resources;
    PdfSpill & m_Spill;
    PdfCompressor::Deflater m_Deflater;
    std::map<Key, std::uint32_t> m_Known;
    int m_Page = 0;
    std::vector<Warning> * m_Warnings = nullptr;
};

}
