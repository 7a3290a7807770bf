#include "framework/document/DocumentRecords.h"

#include "framework/document/DocumentNode.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/ShapeNode.h"
#include "framework/kernel/PortablePath.h"

#include <cmath>
#include <utility>

using Kernel::IDTag;
using Kernel::InSerialiser;
using Kernel::OutSerialiser;

namespace
{

/// From this version of the page setup and of spreads on, each side of a page has a bleed of its own; before, the
/// document had one width for all sides of all pages.
constexpr unsigned short FourBleedsVersion = 2;

}

#define KORVANE_DOCUMENT_RECORD(Record, uid, version)                                                                  \
    Kernel::ClassProperties const Record::ms_ClassProperties(Kernel::ClassUID(uid), &Record::CreateObject, version,    \
                                                             {}, nullptr);                                             \
    static Kernel::ClassPropertiesBase::Init const s_Init##Record(Record::ms_ClassProperties);

KORVANE_DOCUMENT_RECORD(MetadataRecord, "DcMe", 1)
KORVANE_DOCUMENT_RECORD(PageSetupRecord, "DcPs", FourBleedsVersion)
KORVANE_DOCUMENT_RECORD(SectionRecord, "DcSe", 1)
KORVANE_DOCUMENT_RECORD(SwatchRecord, "DcSw", 1)
KORVANE_DOCUMENT_RECORD(ItemRecord, "DcIt", 1)
KORVANE_DOCUMENT_RECORD(SpreadRecord, "DcSp", FourBleedsVersion)
KORVANE_DOCUMENT_RECORD(FlowRecord, "DcFl", 1)
KORVANE_DOCUMENT_RECORD(BookmarkRecord, "DcBm", 1)
KORVANE_DOCUMENT_RECORD(PictureRecord, "DcPi", 1)

namespace
{

/// Farther than any page reaches; keeps the arithmetic of a forged file finite.
constexpr double MaximumCoordinate = 1e6;

bool IsSane(double value)
{
    return std::isfinite(value) && std::abs(value) <= MaximumCoordinate;
}

bool IsSane(Kernel::Rect const & rect)
{
    return IsSane(rect.left) && IsSane(rect.top) && IsSane(rect.right) && IsSane(rect.bottom) &&
           rect.left <= rect.right && rect.top <= rect.bottom;
}

bool AreMargins(Kernel::Rect const & margins)
{
    return IsSane(margins.left) && IsSane(margins.top) && IsSane(margins.right) && IsSane(margins.bottom);
}

/// Space, four components, alpha.
void SaveColour(OutSerialiser & out, IDTag tag, std::optional<Raster::Colour> const & colour)
{
    if (colour) {
        std::vector<float> const values{static_cast<float>(colour->m_Space),
                                        colour->m_Components[0],
                                        colour->m_Components[1],
                                        colour->m_Components[2],
                                        colour->m_Components[3],
                                        colour->m_Alpha};
        out.SaveArray(tag, values);
    }
}

std::optional<Raster::Colour> LoadColour(InSerialiser const & in, IDTag tag)
{
    std::vector<float> values;
    if (!in.LoadArray(tag, values) || 6 != values.size() || !(1 <= values[0] && values[0] <= 4)) {
        return std::nullopt;
    }
    Raster::Colour colour;
    colour.m_Space = static_cast<Raster::ColourSpace>(static_cast<int>(values[0]));
    std::copy(values.begin() + 1, values.begin() + 5, colour.m_Components.begin());
    colour.m_Alpha = values[5];
    return colour;
}

void AppendRect(std::vector<double> & values, Kernel::Rect const & rect)
{
    values.insert(values.end(), {rect.left, rect.top, rect.right, rect.bottom});
}

Kernel::Rect RectAt(std::vector<double> const & values, std::size_t index)
{
    return {values[index], values[index + 1], values[index + 2], values[index + 3]};
}

}

void MetadataRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("titl"), m_Values.m_Title);
    out.SaveType(IDTag("auth"), m_Values.m_Author);
    out.SaveType(IDTag("subj"), m_Values.m_Subject);
    out.SaveType(IDTag("tags"), m_Values.m_Tags);
    out.SaveType(IDTag("lang"), m_Values.m_Language);
    out.SaveType(IDTag("crea"), m_Values.m_Created);
    out.SaveType(IDTag("modi"), m_Values.m_Modified);
}

bool MetadataRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    in.LoadType(IDTag("titl"), m_Values.m_Title);
    in.LoadType(IDTag("auth"), m_Values.m_Author);
    in.LoadType(IDTag("subj"), m_Values.m_Subject);
    in.LoadType(IDTag("tags"), m_Values.m_Tags);
    in.LoadType(IDTag("lang"), m_Values.m_Language);
    in.LoadType(IDTag("crea"), m_Values.m_Created);
    in.LoadType(IDTag("modi"), m_Values.m_Modified);
    return true;
}

void PageSetupRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("size"), m_Setup.m_PageSize);
    out.SaveType(IDTag("bled"), m_Setup.m_Bleed);
    out.SaveType(IDTag("facg"), m_Setup.m_FacingPages);
    out.SaveType(IDTag("vert"), m_Setup.m_VerticalStack);
    out.SaveType(IDTag("chst"), m_Setup.m_ChapterStart);
    out.SaveType(IDTag("mas1"), m_Setup.m_FirstMaster);
    out.SaveType(IDTag("masb"), m_Setup.m_BodyMaster);
    out.SaveType(IDTag("grid"), m_Setup.m_GridIncrement);
    out.SaveType(IDTag("grst"), m_Setup.m_GridStart);
    out.SaveType(IDTag("nhed"), m_Setup.m_NotesHeading);
}

bool PageSetupRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short version)
{
    in.LoadType(IDTag("size"), m_Setup.m_PageSize);
    // The last programs of format 1 wrote four bleeds already, the first ones a single number.
    double bleed = 0;
    if (!in.LoadType(IDTag("bled"), m_Setup.m_Bleed) && version < FourBleedsVersion &&
        in.LoadType(IDTag("bled"), bleed)) {
        m_Setup.m_Bleed = {bleed, bleed, bleed, bleed};
    }
    in.LoadType(IDTag("facg"), m_Setup.m_FacingPages);
    in.LoadType(IDTag("vert"), m_Setup.m_VerticalStack);
    in.LoadType(IDTag("chst"), m_Setup.m_ChapterStart);
    in.LoadType(IDTag("mas1"), m_Setup.m_FirstMaster);
    in.LoadType(IDTag("masb"), m_Setup.m_BodyMaster);
    in.LoadType(IDTag("grid"), m_Setup.m_GridIncrement);
    in.LoadType(IDTag("grst"), m_Setup.m_GridStart);
    in.LoadType(IDTag("nhed"), m_Setup.m_NotesHeading);
    return IsSane(m_Setup.m_PageSize.width) && IsSane(m_Setup.m_PageSize.height) && 0 < m_Setup.m_PageSize.width &&
           0 < m_Setup.m_PageSize.height && AreMargins(m_Setup.m_Bleed) && IsSane(m_Setup.m_GridIncrement) &&
           IsSane(m_Setup.m_GridStart) && m_Setup.m_ChapterStart <= ChapterStart::RightPage;
}

void SectionRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("page"), m_Values.m_StartPageIndex);
    out.SaveType(IDTag("numb"), m_Values.m_StartNumberingAt);
    out.SaveType(IDTag("rest"), m_Values.m_RestartPageNumbering);
    out.SaveType(IDTag("incl"), m_Values.m_IncludeOnExport);
    out.SaveType(IDTag("form"), m_Values.m_Format);
    out.SaveType(IDTag("pref"), m_Values.m_Prefix);
}

bool SectionRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    in.LoadType(IDTag("page"), m_Values.m_StartPageIndex);
    in.LoadType(IDTag("numb"), m_Values.m_StartNumberingAt);
    in.LoadType(IDTag("rest"), m_Values.m_RestartPageNumbering);
    in.LoadType(IDTag("incl"), m_Values.m_IncludeOnExport);
    in.LoadType(IDTag("form"), m_Values.m_Format);
    in.LoadType(IDTag("pref"), m_Values.m_Prefix);
    return m_Values.m_Format <= PageNumberFormat::None;
}

void SwatchRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("name"), m_Swatch.m_Name);
    SaveColour(out, IDTag("colr"), m_Swatch.m_Colour);
}

bool SwatchRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    in.LoadType(IDTag("name"), m_Swatch.m_Name);
    std::optional<Raster::Colour> const colour = LoadColour(in, IDTag("colr"));
    m_Swatch.m_Colour = colour.value_or(Raster::Colour::Black());
    return colour.has_value();
}

void ItemRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("kind"), m_Kind);
    out.SaveType(IDTag("list"), m_List);
    out.SaveType(IDTag("rect"), m_Rect);
    switch (static_cast<Node::Kind>(m_Kind)) {
    case Node::Kind::TextFrame:
        out.SaveType(IDTag("flow"), m_Flow);
        out.SaveType(IDTag("fram"), m_Frame);
        break;
    case Node::Kind::Picture:
    case Node::Kind::EmbeddedDocument:
        out.SaveType(IDTag("path"), m_Path);
        out.SaveType(IDTag("guid"), m_Guid);
        out.SaveType(IDTag("prot"), m_Protected);
        break;
    case Node::Kind::RunningText:
        out.SaveArray(IDTag("prtf"), m_PartFields);
        out.SaveType(IDTag("prtt"), m_PartTexts);
        out.SaveType(IDTag("algn"), m_Alignment);
        out.SaveType(IDTag("styl"), m_Style);
        break;
    default:
        SaveColour(out, IDTag("fill"), m_Fill);
        SaveColour(out, IDTag("strk"), m_Stroke);
        out.SaveType(IDTag("strw"), m_StrokeWidth);
    }
}

bool ItemRecord::Load(InSerialiser const & in, Kernel::FileStore & store, unsigned short)
{
    in.LoadType(IDTag("kind"), m_Kind);
    in.LoadType(IDTag("list"), m_List);
    in.LoadType(IDTag("rect"), m_Rect);
    in.LoadType(IDTag("flow"), m_Flow);
    in.LoadType(IDTag("fram"), m_Frame);
    in.LoadType(IDTag("path"), m_Path);
    m_Path = Kernel::PortablePath::Resolve(m_Path, store.GetPath());
    in.LoadType(IDTag("guid"), m_Guid);
    in.LoadType(IDTag("prot"), m_Protected);
    in.LoadArray(IDTag("prtf"), m_PartFields);
    in.LoadType(IDTag("prtt"), m_PartTexts);
    in.LoadType(IDTag("algn"), m_Alignment);
    in.LoadType(IDTag("styl"), m_Style);
    m_Fill = LoadColour(in, IDTag("fill"));
    m_Stroke = LoadColour(in, IDTag("strk"));
    in.LoadType(IDTag("strw"), m_StrokeWidth);
    return IsSane(m_Rect) && NodeChildListUnder <= m_List && m_List <= NodeChildListOver;
}

Kernel::Counted<ItemRecord> ItemRecord::FromNode(Node const & node, DocumentNode const & document,
                                                  DocumentLinks const & links)
{
    Kernel::Counted<ItemRecord> record = Kernel::MakeCounted<ItemRecord>();
    record->m_Kind = static_cast<std::uint8_t>(node.GetKind());
    record->m_List = static_cast<std::uint8_t>(node.GetParentList());
    record->m_Rect = node.GetSpreadBaseBox(false);
    if (auto const * const frame = dynamic_cast<TextFrameNode const *>(&node)) {
        auto const & flows = document.GetTextFlows();
        auto const flow = std::find(flows.begin(), flows.end(), frame->GetTextFlow());
        record->m_Flow = flow == flows.end() ? -1 : static_cast<std::int32_t>(flow - flows.begin());
        record->m_Frame = frame->GetFrameIndex();
    } else if (auto const * const picture = dynamic_cast<PictureNode const *>(&node)) {
        auto const link = links.m_PlacedFiles.find(picture->GetPath());
        record->m_Path = link == links.m_PlacedFiles.end() ? picture->GetPath() : link->second;
        record->m_Guid = picture->GetGUID();
        auto const * const embedded = dynamic_cast<EmbeddedDocumentNode const *>(&node);
        record->m_Protected = embedded && embedded->IsProtected();
    } else if (auto const * const text = dynamic_cast<RunningTextNode const *>(&node)) {
        for (RunningTextPart const & part : text->GetParts()) {
            record->m_PartFields.push_back(static_cast<std::uint8_t>(part.m_Field));
            record->m_PartTexts.push_back(part.m_Text);
        }
        record->m_Alignment = static_cast<std::uint8_t>(text->GetAlignment());
        record->m_Style = text->GetStyle();
    } else if (auto const * const shape = dynamic_cast<ShapeNode const *>(&node)) {
        record->m_Fill = shape->GetFill();
        record->m_Stroke = shape->GetStroke();
        record->m_StrokeWidth = shape->GetStrokeWidth();
    }
    return record;
}

Kernel::JailCounted<Node>
ItemRecord::MakeNode(std::vector<std::vector<Kernel::JailCounted<TextFrameNode>>> & frames) const
{
    switch (static_cast<Node::Kind>(m_Kind)) {
    case Node::Kind::TextFrame: {
        if (m_Flow < 0 || static_cast<std::int32_t>(frames.size()) <= m_Flow || m_Frame < 0) {
            return nullptr;
        }
        auto & chain = frames[static_cast<std::size_t>(m_Flow)];
        std::size_t const place = static_cast<std::size_t>(m_Frame);
        // A chain's frames are listed in order, spread by spread: a gap is damage.
        if (place != chain.size()) {
            return nullptr;
        }
        chain.push_back(Kernel::MakeCounted<TextFrameNode>(m_Rect));
        return chain.back();
    }
    case Node::Kind::Picture:
        return Kernel::MakeCounted<PictureNode>(m_Rect, m_Path, m_Guid);
    case Node::Kind::EmbeddedDocument:
        return Kernel::MakeCounted<EmbeddedDocumentNode>(m_Rect, m_Path, m_Guid, m_Protected);
    case Node::Kind::RunningText: {
        if (m_PartFields.size() != m_PartTexts.size() ||
            static_cast<std::uint8_t>(RunningTextAlignment::Right) < m_Alignment) {
            return nullptr;
        }
        std::vector<RunningTextPart> parts;
        for (std::size_t i = 0; i < m_PartFields.size(); ++i) {
            if (static_cast<std::uint8_t>(RunningTextField::DocumentTitle) < m_PartFields[i]) {
                return nullptr;
            }
            parts.push_back({static_cast<RunningTextField>(m_PartFields[i]), m_PartTexts[i]});
        }
        return Kernel::MakeCounted<RunningTextNode>(m_Rect, std::move(parts),
                                                    static_cast<RunningTextAlignment>(m_Alignment), m_Style);
    }
    case Node::Kind::Shape:
        return IsSane(m_StrokeWidth) ? Kernel::MakeCounted<ShapeNode>(m_Rect, m_Fill, m_Stroke, m_StrokeWidth)
                                     : nullptr;
    default:
        return nullptr;
    }
}

void SpreadRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("name"), m_Name);
    std::vector<double> numbers;
    std::vector<std::uint8_t> sides;
    std::vector<String> masters;
    for (SpreadPage const & page : m_Pages) {
        AppendRect(numbers, page.m_Rect);
        AppendRect(numbers, page.m_Bleed);
        sides.push_back(static_cast<std::uint8_t>(static_cast<unsigned>(page.m_Side) | (page.m_Blank ? 0x80U : 0U)));
        masters.push_back(page.m_Master);
    }
    out.SaveArray(IDTag("page"), numbers);
    out.SaveArray(IDTag("side"), sides);
    out.SaveType(IDTag("mast"), masters);
    std::vector<double> textRects;
    for (Kernel::Rect const & rect : m_TextRects) {
        AppendRect(textRects, rect);
    }
    out.SaveArray(IDTag("text"), textRects);
    out.SaveType(IDTag("trbg"), m_TransparentBackground);
    out.SaveObjects(IDTag("item"), m_Items);
}

bool SpreadRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short version)
{
    in.LoadType(IDTag("name"), m_Name);
    std::vector<double> numbers;
    std::vector<std::uint8_t> sides;
    std::vector<String> masters;
    std::vector<double> textRects;
    in.LoadArray(IDTag("page"), numbers);
    in.LoadArray(IDTag("side"), sides);
    in.LoadType(IDTag("mast"), masters);
    in.LoadArray(IDTag("text"), textRects);
    in.LoadType(IDTag("trbg"), m_TransparentBackground);
    in.LoadObjects(IDTag("item"), m_Items);
    m_LacksBleed = version < FourBleedsVersion && numbers.size() == 4 * sides.size();
    std::size_t const perPage = m_LacksBleed ? 4 : 8;
    if (numbers.size() != perPage * sides.size() || masters.size() != sides.size() || 0 != textRects.size() % 4 ||
        sides.empty()) {
        return false;
    }
    for (std::size_t i = 0; i < sides.size(); ++i) {
        SpreadPage page;
        page.m_Rect = RectAt(numbers, perPage * i);
        if (!m_LacksBleed) {
            page.m_Bleed = RectAt(numbers, perPage * i + 4);
        }
        page.m_Side = static_cast<PageSide>(sides[i] & 0x7F);
        page.m_Blank = 0 != (sides[i] & 0x80);
        page.m_Master = masters[i];
        if (!IsSane(page.m_Rect) || !AreMargins(page.m_Bleed) || PageSide::Right < page.m_Side) {
            return false;
        }
        m_Pages.push_back(std::move(page));
    }
    for (std::size_t i = 0; i < textRects.size(); i += 4) {
        m_TextRects.push_back(RectAt(textRects, i));
        if (!IsSane(m_TextRects.back())) {
            return false;
        }
    }
    return true;
}

void SpreadRecord::FromNode(SpreadNode const & spread, DocumentNode const & document, DocumentLinks const & links)
{
    m_Pages = spread.GetPages();
    m_TransparentBackground = spread.HasTransparentBackground();
    for (NodeChildListType const list : {NodeChildListUnder, NodeChildListItems, NodeChildListOver}) {
        for (Kernel::JailCounted<Node> const & item : spread.GetChildren(list)) {
            m_Items.push_back(ItemRecord::FromNode(*item, document, links));
        }
    }
}

void SpreadRecord::CompleteBleed(Kernel::RectT<double> const & bleed)
{
    if (!std::exchange(m_LacksBleed, false)) {
        return;
    }
    for (SpreadPage & page : m_Pages) {
        page.m_Bleed = bleed;
    }
}

void SpreadRecord::FillNode(SpreadNode & spread,
                            std::vector<std::vector<Kernel::JailCounted<TextFrameNode>>> & frames) const
{
    spread.SetPages(m_Pages);
    spread.SetTransparentBackground(m_TransparentBackground);
    for (Kernel::Counted<ItemRecord> const & record : m_Items) {
        // An item of a kind that only a later program knows is left out; so is a damaged one.
        if (Kernel::JailCounted<Node> const node = record ? record->MakeNode(frames) : nullptr) {
            spread.AppendChild(record->GetList(), node);
        }
    }
}

void FlowRecord::Save(OutSerialiser & out) const
{
    out.SaveObject(IDTag("stor"), m_Story, false);
    out.SaveType(IDTag("grow"), m_Growing);
    out.SaveType(IDTag("purp"), m_Purpose);
    out.SaveType(IDTag("layo"), m_HasLayout);
    out.SaveType(IDTag("hash"), m_LayoutHash);
    std::vector<String> paths;
    std::vector<std::int64_t> times;
    for (TextFlow::FontStamp const & font : m_Fonts) {
        paths.push_back(font.m_Path);
        times.push_back(font.m_Time.Nanoseconds());
    }
    out.SaveType(IDTag("fpth"), paths);
    out.SaveArray(IDTag("ftim"), times);
}

bool FlowRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    in.LoadObject(IDTag("stor"), m_Story);
    in.LoadType(IDTag("grow"), m_Growing);
    in.LoadType(IDTag("purp"), m_Purpose);
    in.LoadType(IDTag("layo"), m_HasLayout);
    in.LoadType(IDTag("hash"), m_LayoutHash);
    std::vector<String> paths;
    std::vector<std::int64_t> times;
    in.LoadType(IDTag("fpth"), paths);
    in.LoadArray(IDTag("ftim"), times);
    for (std::size_t i = 0; i < std::min(paths.size(), times.size()); ++i) {
        m_Fonts.push_back({paths[i], Kernel::TimeStamp(times[i])});
    }
    return static_cast<bool>(m_Story) && paths.size() == times.size();
}

void BookmarkRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("name"), m_Data->GetName());
    out.SaveType(IDTag("uid "), m_Data->GetUid());
    out.SaveType(IDTag("bkmk"), m_Data->IsPDFBookmark());
    out.SaveType(IDTag("toce"), m_Data->IsTOCEntry());
    out.SaveType(IDTag("levl"), static_cast<std::int32_t>(m_Data->GetLevel()));
}

bool BookmarkRecord::Load(InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    String name;
    String uid;
    bool isBookmark = false;
    bool isTocEntry = false;
    std::int32_t level = 0;
    in.LoadType(IDTag("name"), name);
    in.LoadType(IDTag("uid "), uid);
    in.LoadType(IDTag("bkmk"), isBookmark);
    in.LoadType(IDTag("toce"), isTocEntry);
    in.LoadType(IDTag("levl"), level);
    m_Data = Kernel::MakeCounted<Story::AnchorData>(name, isBookmark, isTocEntry, uid, level);
    return !uid.Empty();
}

void PictureRecord::Save(OutSerialiser & out) const
{
    out.SaveType(IDTag("pid "), m_Id);
    out.SaveType(IDTag("path"), m_Entry.m_SourcePath);
    out.SaveType(IDTag("time"), m_Entry.m_SourceTime);
    out.SaveType(IDTag("size"), m_Entry.m_Size);
    out.SaveType(IDTag("draw"), m_Entry.m_DrawingKind ? static_cast<std::uint8_t>(*m_Entry.m_DrawingKind)
                                                      : std::uint8_t(0));
    out.SaveType(IDTag("prot"), m_Entry.m_IsProtected);
}

bool PictureRecord::Load(InSerialiser const & in, Kernel::FileStore & store, unsigned short)
{
    in.LoadType(IDTag("pid "), m_Id);
    in.LoadType(IDTag("path"), m_Entry.m_SourcePath);
    m_Entry.m_SourcePath = Kernel::PortablePath::Resolve(m_Entry.m_SourcePath, store.GetPath());
    in.LoadType(IDTag("time"), m_Entry.m_SourceTime);
    in.LoadType(IDTag("size"), m_Entry.m_Size);
    in.LoadType(IDTag("prot"), m_Entry.m_IsProtected);
    using Kind = Renderer::RenderTree::PlacedDrawing::Kind;
    std::uint8_t kind = 0;
    in.LoadType(IDTag("draw"), kind);
    if (0 != kind) {
        m_Entry.m_DrawingKind = static_cast<Kind>(kind);
    }
    return !m_Id.Empty() && kind <= static_cast<std::uint8_t>(Kind::Svg);
}
