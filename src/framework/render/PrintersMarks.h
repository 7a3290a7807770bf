#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"
#include "framework/kernel/UnitValueConverter.h"
#include "framework/render/PageBoxes.h"

namespace Renderer
{

/// Which marks are drawn outside of a page, and where. Lengths in points.
struct PrintersMarksOptions
{
    bool m_CropMarks = false;
    bool m_RegistrationMarks = false;
    /// From the trimmed page to the marks. An export that shows a wider bleed moves them out to its edge.
    double m_Offset = 8.5;
    double m_Length = 14;
    double m_LineWidth = 0.25;

    [[nodiscard]] bool HasAny() const { return m_CropMarks || m_RegistrationMarks; }
    friend bool operator==(PrintersMarksOptions const &, PrintersMarksOptions const &) = default;
};

/// The frame of one output page: from the rectangle that is the trimmed page, in the coordinates that positions on it
/// are given in, to the boxes of the page in the file. Set up once, then shared and only read.
class PrintersMarksHelper : public virtual Kernel::Countable
{
public:
    /// `rect` is the trimmed page in points. The converter may be null.
    PrintersMarksHelper(Kernel::Rect const & rect, Kernel::Counted<Kernel::UnitValueConverter const> converter);

    void SetOptions(PrintersMarksOptions const & options) { m_Options = options; }
    /// The output's file name.
    void SetFilename(String const & filename) { m_Filename = filename; }
    void SetIsIncludeBleed(bool includeBleed) { m_IncludeBleed = includeBleed; }

    [[nodiscard]] Kernel::Rect const & GetRect() const { return m_Rect; }
    [[nodiscard]] PrintersMarksOptions const & GetOptions() const { return m_Options; }
    [[nodiscard]] String const & GetFilename() const { return m_Filename; }
    [[nodiscard]] bool IsIncludeBleed() const { return m_IncludeBleed; }
    [[nodiscard]] Kernel::Counted<Kernel::UnitValueConverter const> const & GetConverter() const { return m_Converter; }

    /// Room that the marks take on each side beyond the trimmed page; 0 without marks.
    [[nodiscard]] double GetMarksWidth() const;

    /// The boxes of a page with these bleed margins, in the coordinates of the rectangle. The bleed counts only if it is
    /// to be included; the media box holds it and the marks.
    [[nodiscard]] PageBoxes GetBoxes(BleedMargins const & bleed) const;

    /// A position in the rectangle's coordinates as the distance from the trimmed page's top left corner, y down.
    [[nodiscard]] Kernel::Point FromTopLeft(Kernel::Point const & position) const
    {
        return {position.x - m_Rect.left, position.y - m_Rect.top};
    }

private:
    Kernel::Rect m_Rect;
    Kernel::Counted<Kernel::UnitValueConverter const> m_Converter;
    PrintersMarksOptions m_Options;
    String m_Filename;
    bool m_IncludeBleed = false;
};

}
