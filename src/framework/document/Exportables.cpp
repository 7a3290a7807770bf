#include "framework/document/Exportables.h"

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"

using Transform = Raster::AffineTransform::Params;

namespace
{

/// Parts that are no further apart than this touch, in points.
constexpr double Touching = 0.005;

/// From the coordinates of a part's spread to those of the output page.
Transform PlaceOf(Kernel::Rect const & rect, Transform const & transform)
{
    return Transform::Translation(-rect.left, -rect.top).Then(transform);
}

/// One page of a spread as a part: its own top left at the origin.
void AddPartTo(ExportableInterface::ExportParams & params, Kernel::JailCounted<Node> const & node,
               Kernel::Rect const & rect, Kernel::Rect const & bleedRect, Transform const & transform)
{
    Transform const placed = PlaceOf(rect, transform);
    params.m_Rect = params.m_Rect.United(placed.MapBounds(rect));
    params.m_BleedRect = params.m_BleedRect.United(placed.MapBounds(bleedRect));
    if (node) {
        params.m_Nodes.push_back(node);
        params.m_Transforms.push_back(placed);
        params.m_Clips.push_back(bleedRect);
    }
}

String LabelOf(DocumentController const & document, SpreadNode const & spread, int page)
{
    int const first = spread.GetFirstPageIndex();
    return first < 0
               ? String()
               : document.GetDocument()->GetFormattedPageNumber(static_cast<unsigned int>(first + std::max(page, 0)));
}

Kernel::JailCounted<SpreadNode> Mutable(Kernel::Counted<SpreadNode const> const & spread)
{
    // The parameters hold nodes of the document's own tree, to be read under its lock.
    return Kernel::JailCounted<SpreadNode>(const_cast<SpreadNode *>(spread.Get()));
}

ExportableInterface::ExportParams EmptyParams(bool includeBackground)
{
    ExportableInterface::ExportParams params;
    params.m_Rect = Kernel::Rect::Empty();
    params.m_BleedRect = Kernel::Rect::Empty();
    params.m_IncludeBackground = includeBackground;
    return params;
}

}

void ExportableNodes::SetFromNode(Kernel::JailCounted<Node> node)
{
    m_Nodes.assign(1, std::move(node));
}

void ExportableNodes::GetMultiPageExportParams(DocumentController const & document, std::vector<ExportParams> & params,
                                               bool singlePages) const
{
    for (Kernel::JailCounted<Node> const & node : m_Nodes) {
        Kernel::JailCounted<SpreadNode> const spread = Kernel::CountedCast<SpreadNode>(node);
        if (!spread) {
            ExportParams page = EmptyParams(IsIncludeBackground());
            AddPartTo(page, node, node->GetSpreadBaseBox(true), node->GetSpreadBaseBox(true), {});
            params.push_back(std::move(page));
        } else if (singlePages) {
            for (int i = 0; i < spread->GetPageCount(); ++i) {
                ExportParams page = EmptyParams(IsIncludeBackground());
                AddPartTo(page, spread, spread->GetPageExtents(i, false), spread->GetPageExtents(i, true), {});
                page.m_Label = LabelOf(document, *spread, i);
                params.push_back(std::move(page));
            }
        } else {
            ExportParams page = EmptyParams(IsIncludeBackground());
            AddPartTo(page, spread, spread->GetSpreadExtents(true, false, false),
                      spread->GetSpreadExtents(true, true, false), {});
            page.m_Label = LabelOf(document, *spread, 0);
            params.push_back(std::move(page));
        }
    }
}

void ExportablePages::AddPage(Kernel::Counted<SpreadNode const> spread, int page,
                              Raster::AffineTransform::Params transform)
{
    Kernel::Rect const rect = spread->GetPageExtents(page, false);
    Kernel::Rect const bleedRect = spread->GetPageExtents(page, true);
    m_Parts.push_back({std::move(spread), page, rect, bleedRect, transform});
}

void ExportablePages::AddPaddingRect(Kernel::RectT<double> const & rect, Kernel::RectT<double> const & bleedRect,
                                     Raster::AffineTransform::Params transform)
{
    m_Parts.push_back({nullptr, -1, rect, bleedRect, transform});
}

Kernel::Rect ExportablePages::ShownOf(Part const & part) const
{
    Kernel::Rect const place = PlaceOf(part.m_Rect, part.m_Transform).MapBounds(part.m_Rect);
    Kernel::Rect shown = part.m_BleedRect;
    for (Part const & other : m_Parts) {
        if (&other == &part || other.m_Rect.IsEmpty()) {
            continue;
        }
        Kernel::Rect const otherPlace = PlaceOf(other.m_Rect, other.m_Transform).MapBounds(other.m_Rect);
        if (otherPlace.left > place.right - Touching) {
            shown.right = part.m_Rect.right;
        }
        if (otherPlace.right < place.left + Touching) {
            shown.left = part.m_Rect.left;
        }
        if (otherPlace.top > place.bottom - Touching) {
            shown.bottom = part.m_Rect.bottom;
        }
        if (otherPlace.bottom < place.top + Touching) {
            shown.top = part.m_Rect.top;
        }
    }
    return shown;
}

void ExportablePages::GetMultiPageExportParams(DocumentController const & document, std::vector<ExportParams> & params,
                                               bool) const
{
    ExportParams output = EmptyParams(IsIncludeBackground());
    for (Part const & part : m_Parts) {
        if (part.m_Rect.IsEmpty()) {
            continue;
        }
        AddPartTo(output, part.m_Spread ? Mutable(part.m_Spread) : nullptr, part.m_Rect, part.m_BleedRect,
                  part.m_Transform);
        if (part.m_Spread) {
            output.m_Clips.back() = ShownOf(part);
        }
        if (part.m_Spread && output.m_Label.Empty()) {
            // A page of the next chapter has its number from its own document.
            output.m_Label = LabelOf(document, *part.m_Spread, part.m_Page);
        }
    }
    if (m_Parts.size() == 1 && m_Parts.front().m_Spread && m_Parts.front().m_Page > 0) {
        bool const vertical = document.GetDocument()->IsVerticalStack();
        output.m_IsBelowPrevious = vertical;
        output.m_IsBesidePrevious = !vertical;
    }
    if (!output.m_Rect.IsEmpty()) {
        params.push_back(std::move(output));
    }
}

void ExportableSpreads::AddSpread(Kernel::Counted<SpreadNode const> spread, Raster::AffineTransform::Params transform)
{
    Kernel::Rect const rect = spread->GetSpreadExtents(true, false, false);
    Kernel::Rect const bleedRect = spread->GetSpreadExtents(true, true, false);
    AddPart({std::move(spread), -1, rect, bleedRect, transform});
}
