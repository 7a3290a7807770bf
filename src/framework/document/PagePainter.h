#pragma once

#include "framework/document/DocumentNode.h"
#include "framework/document/ExportableInterface.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/RunningTextSetter.h"
#include "framework/render/DisplayList.h"
#include "framework/render/Warning.h"

/// Draws pages of a document into a display list: masters, text from the layout, pictures, shapes. What output and
/// previews show comes from here.
///
/// Reads the documents under their reader locks, which the caller holds. One thread uses a painter at a time; keep it
/// for many pages, as it remembers styles.
class PagePainter
{
public:
    /// Empties the list and draws one page of output. Each node is drawn with the styles and pictures of its own
    /// document: two chapters may share a page. `warnings` may be null.
    void Paint(ExportableInterface::ExportParams const & params,
               VisibilityInterface::VisibilityTestOptions const & visibility, Renderer::RenderTree::DisplayList & list,
               std::vector<Renderer::RenderTree::Warning> * warnings);

private:
    void PaintSpread(SpreadNode const & spread, Kernel::RectT<double> const & clip);
    void PaintMasterItems(SpreadNode const & spread, Kernel::RectT<double> const & clip, NodeChildListType list);
    void PaintItem(Node const & item, RunningTextSetter::Fields const & fields, Kernel::PointT<double> offset);
    void PaintFrame(TextFrameNode const & frame);
    void PaintLines(Story::Layout const & layout, Story::LayoutItem::Frame const & frame,
                    Kernel::PointT<double> origin);
    void PaintBox(Story::Layout const & layout, Story::LayoutItem::Box const & box, Kernel::PointT<double> origin);
    void PaintTextPicture(DocumentNode const * document, PictureReference const & reference,
                          Kernel::RectT<double> const & rect, String const & altText);
    void PaintDrawing(Kernel::Counted<Renderer::RenderTree::PlacedDrawing const> const & drawing,
                      Raster::PictureProblem const & problem, Kernel::RectT<double> const & rect,
                      String const & altText);
    void WarnOf(Raster::PictureProblem const & problem);
    void PaintPicture(Kernel::Counted<Raster::Picture const> const & picture, Raster::PictureProblem const & problem,
                      Kernel::RectT<double> const & rect, String const & altText);
    void PaintMissing(Kernel::RectT<double> const & rect);
    [[nodiscard]] RunningTextSetter::Fields FieldsOf(SpreadNode const & spread, int page) const;

    RunningTextSetter m_RunningTexts;
    std::vector<Typeset::PlacedGlyph> m_Glyphs;

    // Of the page that is being painted.
    Renderer::RenderTree::DisplayList * m_List = nullptr;
    std::vector<Renderer::RenderTree::Warning> * m_Warnings = nullptr;
    VisibilityInterface::VisibilityTestOptions m_Visibility;
};
