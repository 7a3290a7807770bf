#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"

/// Where the chapter after this document begins, and so how this one ends.
enum class ChapterStart : std::uint8_t
{
    /// On the next page, whatever its side.
    NextPage,
    /// On a right-hand page: a facing-page document gets a blank left-hand page at its end where it needs one.
    RightPage
};

/// The shape of a document's pages, and how a growing flow makes new ones. A plain value; lengths in points.
struct PageSetup
{
    Kernel::SizeT<double> m_PageSize{419.528, 595.276};
    /// Bleed margins of every page: left, top, right, bottom.
    Kernel::RectT<double> m_Bleed;
    bool m_FacingPages = true;
    /// Facing pages lie one above the other rather than side by side.
    bool m_VerticalStack = false;
    ChapterStart m_ChapterStart = ChapterStart::NextPage;
    /// Master of the first page of a flow, and of the pages after it.
    String m_FirstMaster;
    String m_BodyMaster;
    /// Distance of the baselines of the grid, 0 for none, and of the first one from the top of a text frame.
    double m_GridIncrement = 0;
    double m_GridStart = 0;
    /// Stands over the notes at the end of the flow, in the document's language.
    String m_NotesHeading = "Notes";

    friend bool operator==(PageSetup const &, PageSetup const &) = default;
};
