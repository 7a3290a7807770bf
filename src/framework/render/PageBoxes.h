#pragma once

#include "framework/kernel/Geometry.h"

namespace Renderer
{

/// Bleed beyond the trimmed page on each side, in points.
struct BleedMargins
{
    double m_Left = 0;
    double m_Top = 0;
    double m_Right = 0;
    double m_Bottom = 0;
    friend bool operator==(BleedMargins const &, BleedMargins const &) = default;
};

/// The page boxes (ISO 32000-2, 14.11.2) in the display list's coordinates, y down. An empty rectangle stands for the
/// default: bleed, trim and art box as the crop box, crop box as the media box.
struct PageBoxes
{
    Kernel::Rect m_Media = Kernel::Rect::Empty();
    Kernel::Rect m_Crop = Kernel::Rect::Empty();
    Kernel::Rect m_Bleed = Kernel::Rect::Empty();
    Kernel::Rect m_Trim = Kernel::Rect::Empty();
    Kernel::Rect m_Art = Kernel::Rect::Empty();

    /// A page without bleed and marks.
    [[nodiscard]] static PageBoxes Plain(Kernel::Rect const & page)
    {
        PageBoxes boxes;
        boxes.m_Media = page;
        return boxes;
    }

    /// The trim box, or what stands for it.
    [[nodiscard]] Kernel::Rect const & GetTrim() const
    {
        return !m_Trim.IsEmpty() ? m_Trim : !m_Crop.IsEmpty() ? m_Crop : m_Media;
    }
    friend bool operator==(PageBoxes const &, PageBoxes const &) = default;
};

}
