#include "framework/document/PagePainter.h"

#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/ShapeNode.h"
#include "framework/kernel/Format.h"

namespace RenderTree = Renderer::RenderTree;
using Transform = Raster::AffineTransform::Params;

namespace
{

bool Meets(Kernel::Rect const & a, Kernel::Rect const & b)
{
    return a.left < b.right && b.left < a.right && a.top < b.bottom && b.top < a.bottom;
}

/// The largest rectangle of these proportions within `rect`, in its middle.
Kernel::Rect Fitted(Kernel::Rect const & rect, double width, double height)
{
    double const scale = std::min(rect.Width() / width, rect.Height() / height);
    double const dx = (rect.Width() - scale * width) / 2;
    double const dy = (rect.Height() - scale * height) / 2;
    return {rect.left + dx, rect.top + dy, rect.right - dx, rect.bottom - dy};
}

RenderTree::Role RoleOf(Story::LayoutItem::Role role, unsigned int headingLevel)
{
    using Of = Story::LayoutItem::Role;
    switch (role) {
    case Of::Heading:
        return static_cast<RenderTree::Role>(static_cast<unsigned int>(RenderTree::Role::Heading1) +
                                             std::clamp(headingLevel, 1U, 6U) - 1);
    case Of::ListMarker:
        return RenderTree::Role::ListItem;
    case Of::NoteNumber:
    case Of::NoteText:
        return RenderTree::Role::Note;
    case Of::TableCell:
        return RenderTree::Role::TableCell;
    case Of::Code:
        return RenderTree::Role::Code;
    case Of::Quotation:
        return RenderTree::Role::Quotation;
    case Of::Caption:
        return RenderTree::Role::Caption;
    case Of::Text:
    case Of::NoteReference:
    case Of::Generated:
        break;
    }
    return RenderTree::Role::Paragraph;
}

}

void PagePainter::Paint(ExportableInterface::ExportParams const & params,
                        VisibilityInterface::VisibilityTestOptions const & visibility, RenderTree::DisplayList & list,
                        std::vector<RenderTree::Warning> * warnings)
{
    list.Clear();
    m_List = &list;
    m_Warnings = warnings;
    m_Visibility = visibility;
    for (std::size_t i = 0; i < params.m_Nodes.size(); ++i) {
        Node const & node = *params.m_Nodes[i];
        Kernel::Rect const clip = i < params.m_Clips.size() ? params.m_Clips[i] : Kernel::Rect::Empty();
        Transform const transform = params.TransformOf(i);
        RenderTree::Group group;
        group.m_Transform = transform;
        if (!clip.IsEmpty()) {
            group.m_Clip = Renderer::Path::Rectangle(transform.MapBounds(clip));
        }
        list.BeginGroup(std::move(group));
        if (auto const * const spread = dynamic_cast<SpreadNode const *>(&node)) {
            PaintSpread(*spread, clip.IsEmpty() ? spread->GetSpreadExtents(true, true, true) : clip);
        } else {
            PaintItem(node, {}, {});
        }
        list.EndGroup();
    }
}

RunningTextSetter::Fields PagePainter::FieldsOf(SpreadNode const & spread, int page) const
{
    RunningTextSetter::Fields fields;
    Kernel::JailCounted<DocumentNode> const document = spread.GetDocumentNode();
    int const first = spread.GetFirstPageIndex();
    if (document && 0 <= first) {
        fields.m_PageNumber = document->GetFormattedPageNumber(static_cast<unsigned int>(first + page));
        fields.m_DocumentTitle = document->GetRunningTitle();
        String const & publication = document->GetPublicationTitle();
        fields.m_PublicationTitle = publication.Empty() ? fields.m_DocumentTitle : publication;
    }
    return fields;
}

void PagePainter::PaintSpread(SpreadNode const & spread, Kernel::RectT<double> const & clip)
{
    for (NodeChildListType const list : {NodeChildListUnder, NodeChildListItems, NodeChildListOver}) {
        // Running heads come behind the text, so that copied text reads on from page to page.
        if (NodeChildListUnder == list && m_Visibility.m_MasterItems) {
            PaintMasterItems(spread, clip, list);
        }
        for (Kernel::JailCounted<Node> const & item : spread.GetChildren(list)) {
            if (Meets(item->GetSpreadBaseBox(true), clip)) {
                PaintItem(*item, {}, {});
            }
        }
        if (NodeChildListUnder != list && m_Visibility.m_MasterItems) {
            PaintMasterItems(spread, clip, list);
        }
    }
}

void PagePainter::PaintMasterItems(SpreadNode const & spread, Kernel::RectT<double> const & clip,
                                   NodeChildListType list)
{
    Kernel::JailCounted<DocumentNode> const document = spread.GetDocumentNode();
    for (int i = 0; document && i < spread.GetPageCount(); ++i) {
        SpreadPage const & page = spread.GetPages()[static_cast<std::size_t>(i)];
        Kernel::JailCounted<MasterSpreadNode> const master =
            page.m_Master.Empty() || !Meets(spread.GetPageExtents(i, true), clip) ? nullptr
                                                                                  : document->FindMaster(page.m_Master);
        if (!master) {
            continue;
        }
        int const masterPage = master->GetPageForSide(page.m_Side);
        Kernel::Rect const source = master->GetPageRect(masterPage);
        Kernel::Point const offset{page.m_Rect.left - source.left, page.m_Rect.top - source.top};
        RunningTextSetter::Fields const fields = FieldsOf(spread, i);
        m_RunningTexts.SetStyleSheet(document->GetStyleSheet());
        for (Kernel::JailCounted<Node> const & item : master->GetChildren(list)) {
            Kernel::Rect const box = item->GetSpreadBaseBox(false);
            if (masterPage == master->FindPage({(box.left + box.right) / 2, (box.top + box.bottom) / 2})) {
                m_List->BeginMark({RenderTree::Role::Artifact, {}, {}});
                PaintItem(*item, fields, offset);
                m_List->EndMark();
            }
        }
    }
}

void PagePainter::PaintItem(Node const & item, RunningTextSetter::Fields const & fields, Kernel::PointT<double> offset)
{
    switch (item.GetKind()) {
    case Node::Kind::TextFrame:
        PaintFrame(static_cast<TextFrameNode const &>(item));
        break;
    case Node::Kind::RunningText:
        m_RunningTexts.Draw(static_cast<RunningTextNode const &>(item), fields, offset, *m_List);
        break;
    case Node::Kind::Shape: {
        auto const & shape = static_cast<ShapeNode const &>(item);
        Kernel::Rect const rect = shape.GetRect().Moved(offset.x, offset.y);
        if (shape.GetFill()) {
            m_List->FillRect(rect, *shape.GetFill());
        }
        if (shape.GetStroke() && 0 < shape.GetStrokeWidth()) {
            Renderer::Stroke stroke;
            stroke.m_Width = shape.GetStrokeWidth();
            m_List->StrokePath(Renderer::Path::Rectangle(rect), *shape.GetStroke(), stroke);
        }
        break;
    }
    case Node::Kind::Picture: {
        Raster::PictureProblem problem;
        Kernel::Counted<Raster::Picture const> const picture =
            Raster::Picture::FromFile(static_cast<PictureNode const &>(item).GetPath(), problem);
        Kernel::Rect rect = item.GetSpreadBaseBox(false).Moved(offset.x, offset.y);
        if (picture && 0 < picture->GetInfo().UprightWidth() && 0 < picture->GetInfo().UprightHeight()) {
            rect = Fitted(rect, picture->GetInfo().UprightWidth(), picture->GetInfo().UprightHeight());
        }
        PaintPicture(picture, problem, rect, String());
        break;
    }
    case Node::Kind::EmbeddedDocument: {
        auto const & node = static_cast<EmbeddedDocumentNode const &>(item);
        Raster::PictureProblem problem;
        auto const drawing = RenderTree::PlacedDrawing::OpenFile(node.GetPath(), node.GetPassword(), problem);
        Kernel::Rect rect = item.GetSpreadBaseBox(false).Moved(offset.x, offset.y);
        if (drawing) {
            rect = Fitted(rect, drawing->GetSize().width, drawing->GetSize().height);
        }
        PaintDrawing(drawing, problem, rect, String());
        break;
    }
    default:
        break;
    }
}

void PagePainter::PaintFrame(TextFrameNode const & frame)
{
    Kernel::Counted<TextFlow> const flow = frame.GetTextFlow();
    Kernel::Counted<Story::Layout const> const layout = flow ? flow->GetLayout() : nullptr;
    std::size_t const number = static_cast<std::size_t>(frame.GetFrameIndex());
    if (!layout || layout->GetFrames().size() <= number || !flow->EnsureGlyphData()) {
        return;
    }
    Kernel::JailCounted<DocumentNode> const document = frame.GetDocumentNode();
    Story::LayoutItem::Frame const & laidOut = layout->GetFrames()[number];
    Kernel::Point const origin{frame.GetRect().left, frame.GetRect().top};
    using BoxKind = Story::LayoutItem::Box::Kind;
    for (Story::LayoutItem::Box const & box : layout->GetBoxes(laidOut)) {
        if (BoxKind::Strike != box.m_Kind) {
            PaintBox(*layout, box, origin);
        }
    }
    PaintLines(*layout, laidOut, origin);
    for (Story::LayoutItem::Picture const & picture : layout->GetPictures(laidOut)) {
        PaintTextPicture(document.Get(), PictureReference::Parse(layout->GetString(picture.m_DataId)),
                         {origin.x + picture.m_Left, origin.y + picture.m_Top, origin.x + picture.m_Right,
                          origin.y + picture.m_Bottom},
                         layout->GetString(picture.m_AltText));
    }
    for (Story::LayoutItem::Box const & box : layout->GetBoxes(laidOut)) {
        if (BoxKind::Strike == box.m_Kind) {
            PaintBox(*layout, box, origin);
        }
    }
}

void PagePainter::PaintLines(Story::Layout const & layout, Story::LayoutItem::Frame const & frame,
                             Kernel::PointT<double> origin)
{
    auto const headings = layout.GetHeadings();
    auto const levelAt = [&headings](std::uint32_t offset) {
        auto const after =
            std::upper_bound(headings.begin(), headings.end(), offset,
                             [](std::uint32_t place, auto const & heading) { return place < heading.m_StoryOffset; });
        return after == headings.begin() ? 1U : std::prev(after)->m_Level;
    };
    bool open = false;
    for (Story::LayoutItem::Line const & line : layout.GetLines(frame)) {
        auto const runs = layout.GetRuns(line);
        if (!open || 0 != (line.m_Flags & Story::LayoutItem::Line::ParagraphBegin)) {
            if (open) {
                m_List->EndMark();
            }
            auto const role = runs.empty() ? Story::LayoutItem::Role::Text
                                           : static_cast<Story::LayoutItem::Role>(runs.front().m_Role);
            m_List->BeginMark({RoleOf(role, levelAt(line.m_StoryOffset)), {}, {}});
            open = true;
        }
        for (Story::LayoutItem::Run const & run : runs) {
            auto const glyphs = layout.GetGlyphs(run);
            auto const offsets = layout.GetOffsets(run);
            m_Glyphs.resize(glyphs.size());
            for (std::size_t i = 0; i < glyphs.size(); ++i) {
                Typeset::PlacedGlyph & placed = m_Glyphs[i];
                std::uint16_t const text = glyphs[i].m_Text;
                placed.m_Glyph = glyphs[i].m_Glyph;
                placed.m_Flags = static_cast<std::uint16_t>(
                    (text & Story::LayoutItem::Glyph::Space ? Typeset::PlacedGlyph::Space : 0) |
                    (text & Story::LayoutItem::Glyph::Synthetic ? Typeset::PlacedGlyph::Synthetic : 0) |
                    (text & Story::LayoutItem::Glyph::Missing ? Typeset::PlacedGlyph::Missing : 0));
                placed.m_Cluster = text & Story::LayoutItem::Glyph::ClusterMask;
                placed.m_Advance = glyphs[i].m_Advance;
                placed.m_OffsetX = offsets.empty() ? 0 : offsets[i].m_X;
                placed.m_OffsetY = offsets.empty() ? 0 : -offsets[i].m_Y;
            }
            RenderTree::GlyphRun drawn;
            drawn.m_Face = layout.GetFonts()[run.m_Font].m_Face;
            drawn.m_Size = run.m_Size;
            drawn.m_Colour = ToRasterColour(layout.GetColour(run.m_Colour));
            drawn.m_Origin = {origin.x + run.m_X, origin.y + run.m_Baseline};
            drawn.m_Level = run.m_Flags & Story::LayoutItem::Run::RightToLeft ? 1 : 0;
            if (drawn.m_Face) {
                m_List->DrawGlyphs(drawn, m_Glyphs, layout.GetText(run), 0);
            }
        }
    }
    if (open) {
        m_List->EndMark();
    }
}

void PagePainter::PaintBox(Story::Layout const & layout, Story::LayoutItem::Box const & box,
                           Kernel::PointT<double> origin)
{
    Kernel::Rect const rect{origin.x + box.m_Left, origin.y + box.m_Top, origin.x + box.m_Right,
                            origin.y + box.m_Bottom};
    if (Story::LayoutItem::Box::Kind::MissingPicture == box.m_Kind) {
        PaintMissing(rect);
        return;
    }
    Raster::Colour const colour = ToRasterColour(layout.GetColour(box.m_Colour));
    m_List->BeginMark({RenderTree::Role::Artifact, {}, {}});
    if (0 < box.m_Stroke) {
        Renderer::Stroke stroke;
        stroke.m_Width = box.m_Stroke;
        m_List->StrokePath(Renderer::Path::Rectangle(rect), colour, stroke);
    } else {
        m_List->FillRect(rect, colour);
    }
    m_List->EndMark();
}

void PagePainter::PaintPicture(Kernel::Counted<Raster::Picture const> const & picture,
                               Raster::PictureProblem const & problem, Kernel::RectT<double> const & rect,
                               String const & altText)
{
    m_List->BeginMark({RenderTree::Role::Figure, {}, altText});
    if (picture) {
        m_List->DrawPicture(picture, {rect.Width(), 0, 0, rect.Height(), rect.left, rect.top});
    } else {
        PaintMissing(rect);
        WarnOf(problem);
    }
    m_List->EndMark();
}

void PagePainter::PaintTextPicture(DocumentNode const * document, PictureReference const & reference,
                                   Kernel::RectT<double> const & rect, String const & altText)
{
    Raster::PictureProblem problem;
    auto const entry = document ? document->GetPictures()->FindEntry(reference.m_Id) : std::nullopt;
    if (entry && entry->m_DrawingKind) {
        PaintDrawing(document->GetPictures()->GetDrawing(reference, document->GetPicturePassword(reference.m_Id),
                                                         problem),
                     problem, rect, altText);
    } else {
        PaintPicture(document ? document->GetPictures()->Get(reference.m_Id, problem) : nullptr, problem, rect,
                     altText);
    }
}

void PagePainter::PaintDrawing(Kernel::Counted<RenderTree::PlacedDrawing const> const & drawing,
                               Raster::PictureProblem const & problem, Kernel::RectT<double> const & rect,
                               String const & altText)
{
    m_List->BeginMark({RenderTree::Role::Figure, {}, altText});
    if (drawing) {
        m_List->DrawDrawing(drawing, {rect.Width(), 0, 0, rect.Height(), rect.left, rect.top});
    } else {
        PaintMissing(rect);
        WarnOf(problem);
    }
    m_List->EndMark();
}

void PagePainter::WarnOf(Raster::PictureProblem const & problem)
{
    if (m_Warnings) {
        m_Warnings->push_back({Raster::PictureProblem::Code::Locked == problem.m_Code
                                   ? RenderTree::Warning::Code::PictureLocked
                                   : RenderTree::Warning::Code::PictureMissing,
                               0, problem.m_Path, problem.m_Text});
    }
}

void PagePainter::PaintMissing(Kernel::RectT<double> const & rect)
{
    Renderer::Path path = Renderer::Path::Rectangle(rect);
    path.MoveTo(rect.left, rect.top);
    path.LineTo(rect.right, rect.bottom);
    path.MoveTo(rect.right, rect.top);
    path.LineTo(rect.left, rect.bottom);
    Renderer::Stroke stroke;
    stroke.m_Width = 0.5;
    m_List->StrokePath(std::move(path), Raster::Colour::Grey(0.5F), stroke);
}
