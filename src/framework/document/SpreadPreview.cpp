#include "framework/document/SpreadPreview.h"

#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DynamicNodeRenderingEngine.h"
#include "framework/document/VantraController.h"
#include "framework/raster/Picture.h"
#include "framework/raster/PngEncoder.h"
#include "framework/raster/Resample.h"

#include <algorithm>

using Transform = Raster::AffineTransform::Params;

Kernel::Counted<Raster::DynamicBitmap>
SpreadPreview::Render(Kernel::Counted<DocumentController const> const & document, int spreadIndex)
{
    VantraController & application = VantraController::GetInstance();
    if (Kernel::Counted<DocumentController> const known = application.GetMutableDocumentController(document)) {
        known->EnsureGlyphs();
    }
    Kernel::Counted<DynamicNodeRenderingEngine> engine;
    Kernel::Counted<Raster::DynamicBitmap> const bitmap = Kernel::MakeCounted<Raster::DynamicBitmap>();
    Kernel::Rect area;
    {
        DocumentControllerSession const session(document);
        Kernel::JailCounted<SpreadNode> const spread = document->GetDocument()->GetSpreadAtIndex(spreadIndex);
        Kernel::Rect const extents = spread ? spread->GetSpreadExtents(true, false, false) : Kernel::Rect::Empty();
        double const w = extents.Width();
        double const h = extents.Height();
        if (!(w > 0 && h > 0)) {
            return nullptr;
        }
        constexpr double largest = 1 << 30;
        int size = static_cast<int>(std::min(std::max(w, h), largest));
        while (size > MaximumSide) {
            size >>= 1;
        }
        int width = size;
        int height = size;
        if (w > h) {
            height = std::min(size, static_cast<int>(h * (size / w)));
        } else {
            width = std::min(size, static_cast<int>(w * (size / h)));
        }
        width = std::max(width, 1);
        height = std::max(height, 1);

        Transform const toPixels =
            Transform::Translation(-extents.left, -extents.top).Then(Transform::Scale(width / w, height / h));
        Kernel::JailCounted<Node> const solo = document->GetSoloNode();
        bool const isPart = solo && solo != spread && solo->GetSpreadNode() == spread;
        // Whether the paper shows is a matter of the picture that is made from the bitmap.
        Node::NodeRenderOptions options;
        options.m_TransparentBackground = true;
        engine = DynamicNodeRenderingEngine::Create(
            isPart ? solo : Kernel::JailCounted<Node>(spread), options, nullptr, width, height, toPixels,
            application.GetDownViewResamplerType(), application.GetUpViewResamplerType(),
            {document->GetFormat(), document->GetProfiles()}, isPart);
        bitmap->Create(width, height, engine->GetFormat(), Raster::MipmapMode::OnDemand,
                       Raster::HardwareCachePolicy::Default);
        area = Kernel::RoundedOutwards(toPixels.MapBounds(spread->GetInvalidRect()), 1e-6);
    }
    return engine->Draw(*bitmap, area) ? bitmap : nullptr;
}

Kernel::Counted<Kernel::RawData> SpreadPreview::Encode(Raster::DynamicBitmap const & bitmap, double width, double height,
                                                       bool transparent,
                                                       Kernel::Consolidated<Raster::ICCProfile> const & profile,
                                                       Raster::ICCManager::ICCProfileSet const & profiles)
{
    if (!(width > 0 && height > 0) || bitmap.GetPixels().empty()) {
        return nullptr;
    }
    int const imageWidth = width > height ? PngSide : static_cast<int>(width * PngSide / height);
    int const imageHeight = width > height ? static_cast<int>(height * PngSide / width) : PngSide;
    // A strip so thin that it has no pixel left shows nobody anything.
    if (imageWidth < 1 || imageHeight < 1) {
        return nullptr;
    }
    Raster::DynamicBuffer buffer;
    buffer.Create(imageWidth, imageHeight, bitmap.GetFormat());
    buffer.Clear(nullptr);
    if (!transparent && Raster::SpaceOfFormat(bitmap.GetFormat()) != Raster::ColourSpace::None) {
        buffer.Fill(Raster::DynamicPixel({255, 255, 255, 255}, bitmap.GetFormat()));
    }
    Raster::Resample(bitmap,
                     Transform::Scale(static_cast<double>(bitmap.GetWidth()) / imageWidth,
                                      static_cast<double>(bitmap.GetHeight()) / imageHeight),
                     buffer);
    auto const data = Kernel::MakeCounted<Raster::CompressedRasterData>();
    Raster::PNGBase png(data, imageWidth, imageHeight, Raster::ExportOptions());
    if (!png.Write(buffer, profile, Raster::ICCManager::GetInstance().GetDefaultProfileForFormat(Raster::Format::Rgba8),
                   profiles.m_Intent, profiles.m_BlackPointCompensation)) {
        return nullptr;
    }
    return data->RelinquishOwnership();
}

Kernel::Counted<Kernel::RawData>
SpreadPreview::EncodeFirst(Raster::DynamicBitmap const & bitmap,
                           Kernel::Counted<DocumentController const> const & document)
{
    Kernel::Rect bounds = Kernel::Rect::Empty();
    bool transparent = false;
    {
        DocumentControllerSession const session(document);
        if (Kernel::JailCounted<SpreadNode> const spread = document->GetDocument()->GetSpreadAtIndex(0)) {
            bounds = spread->GetSpreadBounds();
            transparent = spread->HasTransparentBackground();
        }
    }
    return Encode(bitmap, bounds.Width(), bounds.Height(), transparent, document->GetProfile(),
                  document->GetProfiles());
}

Kernel::Counted<Raster::DynamicBitmap const> SpreadPreview::Decode(Kernel::RawData const & png, Raster::Format format,
                                                                   Raster::ICCManager::ICCProfileSet const & profiles)
{
    auto const bytes = std::make_shared<std::vector<unsigned char>>(png.GetData(), png.GetData() + png.GetSize());
    Raster::PictureProblem problem;
    auto const picture = Raster::Picture::FromBytes(bytes, "preview", problem);
    // Asked before anything is unpacked: the file may be anybody's.
    if (!picture || picture->GetInfo().m_Width > PngSide || picture->GetInfo().m_Height > PngSide) {
        return nullptr;
    }
    Kernel::Counted<Raster::DynamicBitmap const> const bitmap = picture->Decode(problem);
    return bitmap ? Raster::ConvertBitmap(*bitmap, nullptr, format, profiles.ForSpace(Raster::SpaceOfFormat(format)),
                                          profiles.m_Intent, profiles.m_BlackPointCompensation)
                  : nullptr;
}
