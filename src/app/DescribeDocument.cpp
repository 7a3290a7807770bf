#include "app/DescribeDocument.h"

#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/TextFlow.h"
#include "framework/story/NoteGlyphs.h"
#include "framework/story/PictureGlyph.h"
#include "framework/story/SpecialGlyphs.h"
#include "framework/story/Story.h"
#include "framework/story/StyleSheet.h"
#include "framework/story/TableGlyph.h"

namespace App
{

namespace
{

Json ToJson(Kernel::RectT<double> const & rect)
{
    return {{"left", rect.left}, {"top", rect.top}, {"right", rect.right}, {"bottom", rect.bottom}};
}

char const * NameOf(PageNumberFormat format)
{
    switch (format) {
    case PageNumberFormat::Decimal:
        return "decimal";
    case PageNumberFormat::RomanLower:
        return "roman-lower";
    case PageNumberFormat::RomanUpper:
        return "roman-upper";
    case PageNumberFormat::None:
        break;
    }
    return "none";
}

Json DescribeSections(DocumentNode const & node)
{
    Json list = Json::array();
    for (auto const & section : node.GetSections()) {
        list.push_back({{"startPageIndex", section->GetStartPageIndex()},
                        {"startNumber", section->GetStartNumberingAt()},
                        {"restart", section->RestartPageNumbering()},
                        {"included", section->GetIncludeOnExport()},
                        {"format", NameOf(section->GetFormat())},
                        {"prefix", section->GetPrefix().ToStd()}});
    }
    return list;
}

Json DescribeSpreads(DocumentNode const & node)
{
    Json list = Json::array();
    int pageIndex = 0;
    for (int index = 0; index < node.GetSpreadCount(); ++index) {
        auto const spread = node.GetSpreadAtIndex(index);
        Json pages = Json::array();
        for (SpreadPage const & page : spread->GetPages()) {
            pages.push_back({{"index", pageIndex},
                             {"label", node.GetFormattedPageNumber(static_cast<unsigned>(pageIndex)).ToStd()},
                             {"rect", ToJson(page.m_Rect)},
                             {"master", page.m_Master.ToStd()},
                             {"blank", page.m_Blank}});
            ++pageIndex;
        }
        list.push_back({{"index", index}, {"pages", pages}});
    }
    return list;
}

/// Text and style of each paragraph; the special elements of a paragraph beside it, in text order.
Json DescribeParagraphs(Story::Story const & story, Json & notes)
{
    Json list = Json::array();
    auto const paragraphs = story.GetParagraphs();
    for (std::size_t at = 0; at < paragraphs.size(); ++at) {
        std::size_t const begin = story.GetParagraphBegin(at);
        std::size_t const end = paragraphs[at].m_End;
        auto const & atts = paragraphs[at].m_Atts;
        std::string text = story.GetString(begin, end).ToStd();
        while (text.ends_with('\n')) {
            text.pop_back();
        }
        Json paragraph{{"style", atts ? atts->Get(Story::ParagraphAtt::Style).ToStd() : std::string()}, {"text", text}};
        if (atts && atts->GetListAtt()) {
            auto const item = atts->GetListAtt();
            paragraph["list"] = {{"level", item->GetLevel()},
                                 {"numbered", Story::ListAtt::Numbered == item->GetKind()}};
        }
        Json anchors = Json::array();
        Json pictures = Json::array();
        for (std::size_t index = story.GetObjectIndex(begin);
             index < story.GetObjects().size() && story.GetObjects()[index].m_Offset < end; ++index) {
            Story::Glyph const * const glyph = story.GetObjects()[index].m_Glyph.Get();
            if (auto const * anchor = dynamic_cast<Story::AnchorGlyph const *>(glyph)) {
                anchors.push_back({{"name", anchor->GetAnchorData()->GetName().ToStd()},
                                   {"uid", anchor->GetAnchorData()->GetUid().ToStd()}});
            } else if (auto const * picture = dynamic_cast<Story::PictureGlyph const *>(glyph)) {
                pictures.push_back(
                    {{"path", picture->GetFields().m_Path.ToStd()}, {"missing", picture->GetFields().m_IsMissing}});
            } else if (auto const * note = dynamic_cast<Story::NoteReferenceGlyph const *>(glyph)) {
                Json inner = Json::array();
                notes.push_back({{"paragraphs", DescribeParagraphs(*note->GetNote(), inner)}});
            } else if (auto const * table = dynamic_cast<Story::TableGlyph const *>(glyph)) {
                Json rows = Json::array();
                for (std::uint32_t row = 0; row < table->GetRowCount(); ++row) {
                    Json cells = Json::array();
                    for (std::uint32_t column = 0; column < table->GetColumnCount(); ++column) {
                        auto const & cell = table->GetCell(row, column);
                        cells.push_back(cell ? cell->GetString(0, cell->GetLength()).ToStd() : std::string());
                    }
                    rows.push_back(std::move(cells));
                }
                paragraph["table"] = {{"headerRows", table->GetHeaderRowCount()}, {"rows", rows}};
            }
        }
        if (!anchors.empty()) {
            paragraph["anchors"] = anchors;
        }
        if (!pictures.empty()) {
            paragraph["pictures"] = pictures;
        }
        list.push_back(std::move(paragraph));
    }
    return list;
}

Json DescribeStories(DocumentNode const & node)
{
    Json list = Json::array();
    for (auto const & flow : node.GetTextFlows()) {
        Json notes = Json::array();
        Json paragraphs = DescribeParagraphs(*flow->GetStory(), notes);
        list.push_back({{"main", flow->IsGrowing()},
                        {"frameCount", flow->GetFrames().size()},
                        {"paragraphs", paragraphs},
                        {"notes", notes}});
    }
    return list;
}

Json DescribeStyles(DocumentNode const & node)
{
    Json paragraph = Json::array();
    Json character = Json::array();
    if (auto const & sheet = node.GetStyleSheet()) {
        for (Story::TextStyle const & style : sheet->GetParagraphStyles()) {
            Story::ResolvedStyle const & resolved = sheet->ResolveParagraphStyle(style.m_Name);
            paragraph.push_back(
                {{"name", style.m_Name.ToStd()},
                 {"basedOn", style.m_BasedOn.ToStd()},
                 {"font",
                  resolved.m_Glyph.m_Families.empty() ? std::string() : resolved.m_Glyph.m_Families.front().ToStd()},
                 {"size", resolved.m_Glyph.m_Size},
                 {"leading", resolved.m_Paragraph.m_Leading}});
        }
        for (Story::TextStyle const & style : sheet->GetCharacterStyles()) {
            character.push_back({{"name", style.m_Name.ToStd()}, {"basedOn", style.m_BasedOn.ToStd()}});
        }
    }
    return {{"paragraph", paragraph}, {"character", character}};
}

Json DescribeMasters(DocumentNode const & node)
{
    Json list = Json::array();
    for (int index = 0; index < node.GetMasterCount(); ++index) {
        auto const master = node.GetMasterAtIndex(index);
        Json rects = Json::array();
        for (auto const & rect : master->GetTextRects()) {
            rects.push_back(ToJson(rect));
        }
        list.push_back({{"name", master->GetName().ToStd()}, {"textRects", rects}});
    }
    return list;
}

}

Json DescribeDocument(DocumentController const & document)
{
    DocumentNode const & node = *document.GetDocument();
    auto const metadata = document.GetMetadata();
    DocumentMetadata::Values const values = metadata ? metadata->GetValues() : DocumentMetadata::Values();
    return {{"kind", "document"},
            {"path", ""},
            {"guid", document.GetGUID().ToStd()},
            {"metadata",
             {{"title", values.m_Title.ToStd()},
              {"author", values.m_Author.ToStd()},
              {"subject", values.m_Subject.ToStd()},
              {"language", values.m_Language.ToStd()},
              {"created", values.m_Created.ToStd()},
              {"modified", values.m_Modified.ToStd()}}},
            {"publication", node.GetPublicationTitle().ToStd()},
            {"pageCount", node.GetPageCount()},
            {"facingPages", node.IsFacingPages()},
            {"sections", DescribeSections(node)},
            {"spreads", DescribeSpreads(node)},
            {"masters", DescribeMasters(node)},
            {"stories", DescribeStories(node)},
            {"styles", DescribeStyles(node)}};
}

}
