#pragma once

#include "framework/document/ExportConfig.h"
#include "framework/document/Node.h"
#include "framework/raster/AffineTransform.h"

#include <vector>

class DocumentController;

/// Something that output can be made of: it tells the pages that it makes and what lies on them.
class ExportableInterface : public virtual Kernel::Countable
{
public:
    /// One page of output.
    struct ExportParams
    {
        /// The trimmed page in output coordinates.
        Kernel::RectT<double> m_Rect;
        /// The page with its bleed.
        Kernel::RectT<double> m_BleedRect;
        /// What is drawn, in this order.
        std::vector<Kernel::JailCounted<Node>> m_Nodes;
        /// One for each node, from its spread to the page; none at all means the identity for every node.
        std::vector<Raster::AffineTransform::Params> m_Transforms;
        /// For each node the part of its spread that is drawn; none at all means all of it. Coordinates of the spread.
        std::vector<Kernel::RectT<double>> m_Clips;
        /// The page's label in the output; empty if it has none.
        String m_Label;
        bool m_IncludeBackground = true;
        /// It is a later page of a spread that goes out page by page: to the right of the page before it, or below it.
        bool m_IsBesidePrevious = false;
        bool m_IsBelowPrevious = false;

        [[nodiscard]] Raster::AffineTransform::Params TransformOf(std::size_t node) const
        {
            return node < m_Transforms.size() ? m_Transforms[node] : Raster::AffineTransform::Params();
        }
    };

    /// What a finished output file is known to be.
    struct ExportResult
    {
        String m_Path;
        int m_PageCount = 0;
        /// When it was made, UTC, as in 2026-11-21T06:30:00Z; empty: as the document was last prepared for output.
        String m_Time;
    };

    /// Appends the pages. The caller holds the document's reader lock. `singlePages` divides spreads into their pages.
    virtual void GetMultiPageExportParams(DocumentController const & document, std::vector<ExportParams> & params,
                                          bool singlePages) const = 0;

    void SetExportConfig(Kernel::Consolidated<ExportConfig> config) { m_Config = std::move(config); }
    [[nodiscard]] Kernel::Consolidated<ExportConfig> const & GetExportConfig() const { return m_Config; }
    /// Paints the paper and what lies beneath the items.
    void SetIsIncludeBackground(bool include) { m_IncludeBackground = include; }
    [[nodiscard]] bool IsIncludeBackground() const { return m_IncludeBackground; }
    /// The pages become part of a book: their labels are those of the document's sections.
    void SetIsForBook() { m_ForBook = true; }
    [[nodiscard]] bool IsForBook() const { return m_ForBook; }

private:
    Kernel::Consolidated<ExportConfig> m_Config;
    bool m_IncludeBackground = true;
    bool m_ForBook = false;
};
