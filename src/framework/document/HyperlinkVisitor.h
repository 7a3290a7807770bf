#pragma once

#include "framework/document/Anchors.h"
#include "framework/document/Selection.h"
#include "framework/story/HyperlinkData.h"

/// One hyperlink as output needs it: where it leads and what of the spread it covers. A plain record, made for one use.
class HyperlinkData : public virtual Kernel::Countable
{
public:
    /// The address, file or mailbox, as the writer gave it.
    [[nodiscard]] String GetPath() const { return m_Story ? m_Story->GetPath() : String(); }
    [[nodiscard]] bool IncludeFileOnExport() const { return m_Story && m_Story->IncludeFileOnExport(); }

    Story::HyperlinkData::Type m_Type = Story::HyperlinkData::Type::Web;
    int m_PageIndex = -1;
    int m_SectionIndex = -1;
    int m_ChapterIndex = -1;
    /// The target of a link to an anchor: blind if it lies in another chapter.
    Kernel::Counted<AnchorInstance const> m_Anchor;
    /// Leads to the collated endnotes of the book.
    bool m_IsEndnotes = false;
    Kernel::Counted<Selection const> m_Selection;
    /// What is clickable, in spread coordinates.
    std::vector<Kernel::RectT<double>> m_Rects;
    bool m_IsActive = true;
    Kernel::Counted<Story::HyperlinkData const> m_Story;
};

/// Finds hyperlinks.
class HyperlinkVisitor
{
public:
    /// The hyperlinks of what the spread shows, in text order, each with its rectangles on that spread. A link that
    /// goes over several spreads appears on each. The caller holds the document's reader lock.
    static void CollateForExport(Kernel::Counted<DocumentController const> document,
                                 Kernel::JailNonCounted<SpreadNode> spread,
                                 std::vector<Kernel::Counted<HyperlinkData>> & links);
};
