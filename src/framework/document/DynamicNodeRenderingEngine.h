#pragma once

#include "framework/document/Node.h"
#include "framework/raster/AffineTransform.h"
#include "framework/raster/DynamicBitmap.h"
#include "framework/raster/ICCManager.h"
#include "framework/raster/ResamplerType.h"
#include "framework/render/DisplayList.h"
#include "framework/render/RenderingFilter.h"

#include <deque>

/// Renders a node of a document, a spread or an item on one, into pixels as they are asked for: in tiles, of which it
/// keeps those made last.
///
/// What the node looks like is read once, on making the engine, under the document's reader lock, which the caller holds;
/// after that the engine needs neither lock nor document. One thread at a time.
class DynamicNodeRenderingEngine : public virtual Kernel::Countable
{
public:
    /// Tiles that are kept; one more drops the oldest.
    static constexpr std::size_t MaximumTiles = 10;
    /// Pixels across and down; tiles at the right and bottom edges are smaller. As large as a preview may be, so that a
    /// preview is one tile, for which each placed picture is unpacked once.
    static constexpr int TileSide = 1024;

    /// How pixels are made.
    struct Colours
    {
        enum Raster::Format m_Format = Raster::Format::Rgba8;
        Raster::ICCManager::ICCProfileSet m_Profiles;
    };

    /// \param filter changes the finished pixels; null for none
    /// \param width, height pixels of the whole picture
    /// \param toPixels leads from the spread's coordinates to the picture's pixels
    /// \param down, up how placed pictures are scaled
    /// \param isPartOfSpread the node is shown by itself: neither paper nor items of a master come with it
    [[nodiscard]] static Kernel::Counted<DynamicNodeRenderingEngine>
    Create(Kernel::JailCounted<Node> const & node, Node::NodeRenderOptions const & options,
           Kernel::Counted<Renderer::RenderingFilter const> filter, int width, int height,
           Raster::AffineTransform::Params const & toPixels, enum Raster::ResamplerType down,
           enum Raster::ResamplerType up, Colours colours, bool isPartOfSpread);

    /// Copies what lies in the rectangle, in pixels of the picture, to the same place of a bitmap in the engine's format;
    /// fractions of pixels count whole, and what lies beside picture or bitmap is left out. False if there is no memory
    /// for a tile.
    [[nodiscard]] bool Draw(Raster::DynamicBitmap & bitmap, Kernel::RectT<double> const & area);

    [[nodiscard]] enum Raster::Format GetFormat() const { return m_Colours.m_Format; }

    /// Tiles that are kept at the moment, and those made in all.
    [[nodiscard]] std::size_t GetTileCount() const { return m_Tiles.size(); }
    [[nodiscard]] int GetRenderedTileCount() const { return m_RenderedTiles; }

private:
    struct Tile
    {
        int m_Column;
        int m_Row;
        Kernel::Counted<Raster::DynamicBitmap const> m_Pixels;
    };

    DynamicNodeRenderingEngine() = default;

    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap const> GetTile(int column, int row);
    [[nodiscard]] Kernel::Counted<Raster::DynamicBitmap> Render(int column, int row) const;

    Renderer::RenderTree::DisplayList m_List;
    /// The paper of the pages; nothing for a transparent ground.
    Renderer::RenderTree::DisplayList m_Paper;
    Kernel::Counted<Renderer::RenderingFilter const> m_Filter;
    int m_Width = 0;
    int m_Height = 0;
    Raster::AffineTransform::Params m_ToPixels;
    enum Raster::ResamplerType m_Down = Raster::ResamplerBilinear;
    enum Raster::ResamplerType m_Up = Raster::ResamplerBilinear;
    Colours m_Colours;
    /// Oldest first.
    std::deque<Tile> m_Tiles;
    int m_RenderedTiles = 0;
};
