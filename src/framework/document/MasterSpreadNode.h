#pragma once

#include "framework/document/SpreadNode.h"

/// A pattern for pages: running heads, folios and backgrounds, and the place of the main text.
///
/// A facing-page master has a left page and a right page beside it, in that order; others have one. A page of the
/// document that uses it draws the items that lie on its side of the master, moved to its own place.
class MasterSpreadNode : public SpreadNode
{
public:
    MasterSpreadNode() = default;
    MasterSpreadNode(String name, std::vector<SpreadPage> pages, std::vector<Kernel::RectT<double>> textRects)
        : SpreadNode(std::move(pages)),
          m_Name(std::move(name)),
          m_TextRects(std::move(textRects))
    {
    }

    [[nodiscard]] Kind GetKind() const override { return Kind::MasterSpread; }
    /// Unique in the document: it is how pages in a file name their master.
    [[nodiscard]] String const & GetName() const { return m_Name; }
    void SetName(String const & name) { m_Name = name; }

    /// The page of the master that serves pages of that side.
    [[nodiscard]] int GetPageForSide(PageSide side) const;
    /// Where the main flow's frame lies, relative to the top left of a page of that side.
    [[nodiscard]] Kernel::RectT<double> GetTextRect(PageSide side) const;
    [[nodiscard]] std::vector<Kernel::RectT<double>> const & GetTextRects() const { return m_TextRects; }
    /// One for each page of the master, relative to that page's top left.
    void SetTextRects(std::vector<Kernel::RectT<double>> rects) { m_TextRects = std::move(rects); }

private:
    String m_Name;
    std::vector<Kernel::RectT<double>> m_TextRects;
};
