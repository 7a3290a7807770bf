#pragma once

#include "framework/document/ExportableInterface.h"
#include "framework/document/SpreadNode.h"

/// Whole nodes: a spread goes out as one page, with all its pages side by side.
class ExportableNodes : public ExportableInterface
{
public:
    void SetFromNode(Kernel::JailCounted<Node> node);
    /// Pixels of a bitmap made from it; zero: as large as the node at the output's resolution.
    void SetBitmapSize(int width, int height) { m_BitmapSize = {width, height}; }
    [[nodiscard]] Kernel::SizeT<int> GetBitmapSize() const { return m_BitmapSize; }

    void GetMultiPageExportParams(DocumentController const & document, std::vector<ExportParams> & params,
                                  bool singlePages) const override;

private:
    std::vector<Kernel::JailCounted<Node>> m_Nodes;
    Kernel::SizeT<int> m_BitmapSize;
};

/// Single pages of spreads and blank areas, put together on one output page.
///
/// Each part is first moved so that its own top left comes to the origin, then by its transform. The output page is
/// what all parts cover together.
class ExportablePages : public ExportableInterface
{
public:
    void AddPage(Kernel::Counted<SpreadNode const> spread, int page, Raster::AffineTransform::Params transform);
    /// A blank area: without and with its bleed.
    void AddPaddingRect(Kernel::RectT<double> const & rect, Kernel::RectT<double> const & bleedRect,
                        Raster::AffineTransform::Params transform);

    void GetMultiPageExportParams(DocumentController const & document, std::vector<ExportParams> & params,
                                  bool singlePages) const override;

protected:
    struct Part
    {
        /// Null for a blank area.
        Kernel::Counted<SpreadNode const> m_Spread;
        /// -1: all pages of the spread.
        int m_Page = -1;
        Kernel::RectT<double> m_Rect;
        Kernel::RectT<double> m_BleedRect;
        Raster::AffineTransform::Params m_Transform;
    };
    void AddPart(Part part) { m_Parts.push_back(std::move(part)); }

private:
    /// What is drawn of a part, in coordinates of its spread: its bleed ends where another part begins.
    [[nodiscard]] Kernel::Rect ShownOf(Part const & part) const;

    std::vector<Part> m_Parts;
};

/// Whole spreads and blank areas, put together in the same way.
class ExportableSpreads : public ExportablePages
{
public:
    void AddSpread(Kernel::Counted<SpreadNode const> spread, Raster::AffineTransform::Params transform);
};
