#pragma once

#include "framework/document/ArtboardInterface.h"
#include "framework/document/Node.h"

#include <vector>

/// The side of the fold on which a page lies.
enum class PageSide : std::uint8_t
{
    /// Pages are not facing each other.
    Single,
    /// Even page numbers.
    Left,
    /// Odd page numbers.
    Right
};

/// One page of a spread. A plain value.
struct SpreadPage
{
    /// Trimmed area on the spread.
    Kernel::RectT<double> m_Rect;
    /// Bleed margins: left, top, right, bottom.
    Kernel::RectT<double> m_Bleed;
    PageSide m_Side = PageSide::Single;
    /// Name of the master whose items are drawn with the page's own; empty for none, as on a blank page.
    String m_Master;
    /// Holds no frame of the main flow: it was added to end the document on the right side.
    bool m_Blank = false;

    friend bool operator==(SpreadPage const &, SpreadPage const &) = default;
};

/// Pages that lie side by side (or one above the other), with the items on them.
///
/// The origin of its coordinates is the top left of its first page. Its position among the document's spreads is
/// `GetNodeIndex`.
class SpreadNode : public Node, public ArtboardInterface
{
public:
    SpreadNode() = default;
    explicit SpreadNode(std::vector<SpreadPage> pages) : m_Pages(std::move(pages)) {}

    [[nodiscard]] Kind GetKind() const override { return Kind::Spread; }
    [[nodiscard]] Kernel::RectT<double> GetSpreadBaseBox(bool includeStroke) const override;

    [[nodiscard]] int GetPageCount() const override { return static_cast<int>(m_Pages.size()); }
    [[nodiscard]] Kernel::RectT<double> GetPageRect(int page) const override;
    [[nodiscard]] Kernel::RectT<double> GetPageBleed(int page) const override;
    [[nodiscard]] Kernel::RectT<double> GetPageExtents(int page, bool includeBleed) const override;

    [[nodiscard]] std::vector<SpreadPage> const & GetPages() const { return m_Pages; }
    void SetPages(std::vector<SpreadPage> pages) { m_Pages = std::move(pages); }

    /// Index in the document of the spread's first page; -1 for a spread that is in no document.
    [[nodiscard]] int GetFirstPageIndex() const;
    /// The page that holds the point, or else the nearest one; -1 without pages.
    [[nodiscard]] int FindPage(Kernel::PointT<double> point) const;

    /// The area of all its pages, without bleed.
    [[nodiscard]] Kernel::RectT<double> GetSpreadBounds() const;
    /// The area of its pages if `includePages`, with their bleed if `includeBleed`, and of everything that lies on the
    /// spread, on a page or not, if `includeItems`. Empty if there is nothing of the kind.
    [[nodiscard]] Kernel::RectT<double> GetSpreadExtents(bool includePages, bool includeBleed, bool includeItems) const;

    /// All that may look different once the spread has changed: its pages with their bleed, and everything on it.
    [[nodiscard]] Kernel::RectT<double> GetInvalidRect() const { return GetSpreadExtents(true, true, true); }

    /// Previews of this spread keep the paper transparent.
    [[nodiscard]] bool HasTransparentBackground() const { return m_TransparentBackground; }
    void SetTransparentBackground(bool transparent) { m_TransparentBackground = transparent; }

private:
    std::vector<SpreadPage> m_Pages;
    bool m_TransparentBackground = false;
};
