// The outline of the book's PDF: a root for each chapter, and the chapter's own bookmarks below it.

#include "core/BookChapter.h"
#include "framework/document/AnchorVisitor.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/PDFBookmarkManager.h"
#include "framework/document/Selection.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/TextFrameNode.h"
#include "framework/render/PdfBookmark.h"
#include "framework/render/PrintersMarks.h"
#include "output/ExportBookCommand.h"

namespace Book
{

namespace
{

/// The box of what is selected, in coordinates of its spread; empty if it has none.
Kernel::Rect SpreadBoxOf(Selection const & selection)
{
    Raster::AffineTransform::Params transform;
    Kernel::Rect items = Kernel::Rect::Empty();
    bool hasText = false;
    for (Kernel::JailCounted<Node> const & node : selection) {
        items = items.United(node->GetSpreadBaseBox(true));
        if (Kernel::Counted<TextNode const> const text = hasText ? nullptr : Kernel::CountedCast<TextNode const>(node)) {
            transform = text->GetStoryToDomainTransform();
            hasText = true;
        }
    }
    Kernel::Rect const box = selection.GetTextSelectionBaseBox();
    return box.IsEmpty() ? items : transform.MapBounds(box);
}

}

void ExportBookCommand::CollatePDFBookmarksForChapter(Kernel::Counted<BookChapter const> chapter,
                                                      Kernel::Counted<DocumentController const> document)
{
    int const index = IndexFromChapter(chapter);
    Kernel::Size const offset = GetChapterFirstPageOffset(index);
    auto const root = Kernel::MakeCounted<Renderer::PdfBookmark>();
    root->m_Title = chapter->GetName();
    root->m_Page = GetChapterOffset(index) + 1;
    root->m_PrintersMarks = GetPrintersMarksForTarget(root->m_Page);
    root->m_Position = {offset.width, offset.height};
    m_Bookmarks.push_back(root);

    DocumentControllerSession const session(document);
    AnchorVisitor visitor(false);
    visitor.Visit(document->GetDocument());
    std::vector<Kernel::Counted<AnchorInstance const>> anchors;
    visitor.GetSortedAndFiltered(document, anchors);

    std::map<Kernel::Counted<AnchorInstance const>, Kernel::Counted<Renderer::PdfBookmark>> made;
    for (Kernel::Counted<AnchorInstance const> const & anchor : anchors) {
        if (!anchor->IsPDFBookmark()) {
            continue;
        }
        Kernel::Counted<AnchorInstance const> const parent = visitor.GetParentInstance(document, anchor);
        // A parent without a bookmark of its own has a null entry, and its children stand beside the chapters.
        Kernel::Counted<Renderer::PdfBookmark const> const parentBookmark = parent ? made[parent] : root;

        Kernel::Counted<Selection const> const created = anchor->CreateSelection();
        if (!created) {
            continue;
        }
        Kernel::Counted<Selection const> const selection = created->ClonePromotingRestrictedItems();
        Kernel::JailCounted<SpreadNode> const spread = selection->GetSingleSpreadNode();
        if (!spread) {
            continue;
        }
        Kernel::Rect box = SpreadBoxOf(*selection);
        int const page = OutputPageFromSpreadRect(document, spread, box);
        if (page == -1 || box.IsEmpty()) {
            continue;
        }
        auto const bookmark = Kernel::MakeCounted<Renderer::PdfBookmark>();
        bookmark->m_Title = anchor->GetName();
        bookmark->m_Parent = parentBookmark;
        bookmark->m_PrintersMarks = GetPrintersMarksForTarget(page);
        bookmark->m_Position = {box.left, box.top};
        bookmark->m_Page = page;
        if (!bookmark->m_Title.Empty()) {
            m_Bookmarks.push_back(bookmark);
        }
        made[anchor] = bookmark;
    }
}

}
