#include "framework/document/DynamicNodeRenderingEngine.h"

#include "framework/document/PagePainter.h"
#include "framework/kernel/Assert.h"
#include "framework/raster/PngEncoder.h"
#include "framework/raster/Resample.h"
#include "framework/render/RasterSink.h"

#include <algorithm>
#include <cmath>
#include <cstring>

Kernel::Counted<DynamicNodeRenderingEngine>
DynamicNodeRenderingEngine::Create(Kernel::JailCounted<Node> const & node, Node::NodeRenderOptions const & options,
                                   Kernel::Counted<Renderer::RenderingFilter const> filter, int width, int height,
                                   Raster::AffineTransform::Params const & toPixels, enum Raster::ResamplerType down,
                                   enum Raster::ResamplerType up, Colours colours, bool isPartOfSpread)
{
    KORVANE_ASSERT(node && width >= 1 && height >= 1);
    Kernel::Counted<DynamicNodeRenderingEngine> const engine(new DynamicNodeRenderingEngine);
    engine->m_Filter = std::move(filter);
    engine->m_Width = width;
    engine->m_Height = height;
    engine->m_ToPixels = toPixels;
    engine->m_Down = down;
    engine->m_Up = up;
    engine->m_Colours = std::move(colours);

    ExportableInterface::ExportParams params;
    params.m_Nodes = {node};
    VisibilityInterface::VisibilityTestOptions visibility;
    visibility.m_MasterItems = options.m_IncludeMasterItems && !isPartOfSpread;
    PagePainter().Paint(params, visibility, engine->m_List, nullptr);
    auto const * const spread = dynamic_cast<SpreadNode const *>(node.Get());
    for (int page = 0; spread && !isPartOfSpread && !options.m_TransparentBackground && page < spread->GetPageCount();
         ++page) {
        engine->m_Paper.FillRect(spread->GetPageRect(page), Raster::Colour::White());
    }
    return engine;
}

Kernel::Counted<Raster::DynamicBitmap> DynamicNodeRenderingEngine::Render(int column, int row) const
{
    int const left = column * TileSide;
    int const top = row * TileSide;
    int const width = std::min(TileSide, m_Width - left);
    int const height = std::min(TileSide, m_Height - top);
    Raster::AffineTransform::Params const toTile =
        m_ToPixels.Then(Raster::AffineTransform::Params::Translation(-left, -top));
    auto const schema = Kernel::MakeCounted<Renderer::RenderTree::Schema>();
    schema->SetColourFormatAndProfiles(Raster::Format::Rgba8, m_Colours.m_Profiles);
    Renderer::RenderTree::RasterSink sink(schema);
    sink.SetResamplers(m_Down, m_Up);
    Kernel::Counted<Raster::DynamicBitmap> pixels = sink.Draw(m_List, width, height, toTile, nullptr);
    if (pixels && !m_Paper.IsEmpty()) {
        auto const paper = sink.Draw(m_Paper, width, height, toTile, nullptr);
        if (!paper) {
            return nullptr;
        }
        Raster::Resample(*pixels, {}, *paper);
        pixels = paper;
    }
    if (!pixels || m_Colours.m_Format == Raster::Format::Rgba8) {
        return pixels;
    }
    Raster::ICCManager::ICCProfileSet const & profiles = m_Colours.m_Profiles;
    return Raster::ConvertBitmap(*pixels, profiles.ForSpace(Raster::ColourSpace::Rgb), m_Colours.m_Format,
                                 profiles.ForSpace(Raster::SpaceOfFormat(m_Colours.m_Format)), profiles.m_Intent,
                                 profiles.m_BlackPointCompensation);
}

Kernel::Counted<Raster::DynamicBitmap const> DynamicNodeRenderingEngine::GetTile(int column, int row)
{
    auto const kept = std::find_if(m_Tiles.begin(), m_Tiles.end(), [column, row](Tile const & tile) {
        return tile.m_Column == column && tile.m_Row == row;
    });
    if (kept != m_Tiles.end()) {
        return kept->m_Pixels;
    }
    Kernel::Counted<Raster::DynamicBitmap> const pixels = Render(column, row);
    if (!pixels) {
        return nullptr;
    }
    if (m_Filter) {
        m_Filter->Apply(*pixels);
    }
    if (m_Tiles.size() == MaximumTiles) {
        m_Tiles.pop_front();
    }
    m_Tiles.push_back({column, row, pixels});
    ++m_RenderedTiles;
    return pixels;
}

bool DynamicNodeRenderingEngine::Draw(Raster::DynamicBitmap & bitmap, Kernel::RectT<double> const & area)
{
    KORVANE_ASSERT(bitmap.GetFormat() == m_Colours.m_Format);
    Kernel::Rect const whole{0, 0, static_cast<double>(std::min(m_Width, bitmap.GetWidth())),
                             static_cast<double>(std::min(m_Height, bitmap.GetHeight()))};
    Kernel::Rect const cut = whole.Intersected(area);
    if (cut.IsEmpty()) {
        return true;
    }
    int const left = static_cast<int>(std::floor(cut.left));
    int const top = static_cast<int>(std::floor(cut.top));
    int const right = static_cast<int>(std::ceil(cut.right));
    int const bottom = static_cast<int>(std::ceil(cut.bottom));
    std::size_t const pixelSize = Raster::BytesPerPixel(bitmap.GetFormat());
    for (int tileTop = top / TileSide * TileSide; tileTop < bottom; tileTop += TileSide) {
        for (int tileLeft = left / TileSide * TileSide; tileLeft < right; tileLeft += TileSide) {
            Kernel::Counted<Raster::DynamicBitmap const> const tile = GetTile(tileLeft / TileSide, tileTop / TileSide);
            if (!tile) {
                return false;
            }
            int const from = std::max(left, tileLeft);
            int const to = std::min(right, tileLeft + TileSide);
            for (int y = std::max(top, tileTop); y < std::min(bottom, tileTop + TileSide); ++y) {
                std::memcpy(bitmap.GetRow(y) + static_cast<std::size_t>(from) * pixelSize,
                            tile->GetRow(y - tileTop) + static_cast<std::size_t>(from - tileLeft) * pixelSize,
                            static_cast<std::size_t>(std::max(0, to - from)) * pixelSize);
            }
        }
    }
    return true;
}
