#pragma once

#include "framework/kernel/Geometry.h"
#include "framework/kernel/StringT.h"

/// What a reference needs to know of an anchor while the anchor's document is not open. A plain value.
struct AnchorInfo
{
    /// Identity of the anchor, in UUID form.
    String m_Uid;
    /// The name that users see.
    String m_Name;
    /// Target in coordinates of its spread.
    Kernel::PointT<double> m_TargetPoint;
    /// Position of that spread in its document.
    int m_SpreadIndex = 0;
    bool m_IsPDFBookmark = false;
    bool m_IsTOCEntry = false;
    /// The texts that a reference may show, by `UpdateCrossReferencesCommandHelper::FillAnchorInfo`: the text of the
    /// anchor's paragraph.
    String m_ReferenceText1;
    /// The paragraph's number or label; empty if it has none.
    String m_ReferenceText2;
    /// The formatted number of the page.
    String m_ReferenceText3;
    /// The document's title.
    String m_ReferenceText4;
    /// The text of the nearest heading at or before the anchor.
    String m_ReferenceText5;
    String m_ChapterName;
    /// The document's file name without extension.
    String m_ReferenceText6;
    /// Position of the chapter in its book.
    int m_ChapterIndex = 0;

    friend bool operator==(AnchorInfo const &, AnchorInfo const &) = default;
};
