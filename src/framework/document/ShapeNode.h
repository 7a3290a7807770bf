#pragma once

#include "framework/document/Node.h"
#include "framework/raster/Colour.h"

#include <optional>

/// A rectangle with a fill, a stroke, or both. A rule is a thin filled rectangle.
class ShapeNode : public Node
{
public:
    ShapeNode(Kernel::RectT<double> rect, std::optional<Raster::Colour> fill, std::optional<Raster::Colour> stroke,
              double strokeWidth)
        : m_Rect(rect),
          m_Fill(fill),
          m_Stroke(stroke),
          m_StrokeWidth(strokeWidth)
    {
    }

    [[nodiscard]] Kind GetKind() const override { return Kind::Shape; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool includeStroke) const override;
    [[nodiscard]] Kernel::RectT<double> const & GetRect() const { return m_Rect; }
    [[nodiscard]] std::optional<Raster::Colour> const & GetFill() const { return m_Fill; }
    [[nodiscard]] std::optional<Raster::Colour> const & GetStroke() const { return m_Stroke; }
    /// The stroke runs along the edge, half inside, half outside.
    [[nodiscard]] double GetStrokeWidth() const { return m_StrokeWidth; }

private:
    Kernel::RectT<double> m_Rect;
    std::optional<Raster::Colour> m_Fill;
    std::optional<Raster::Colour> m_Stroke;
    double m_StrokeWidth;
};
