#include "framework/commands/ExportItemCommandBase.h"
#include "framework/document/AnchorVisitor.h"
#include "framework/document/BookEndnoteVisitor.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/Exportables.h"
#include "framework/document/HyperlinkVisitor.h"
#include "framework/document/IndexVisitor.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/PagePainter.h"
#include "framework/document/Selection.h"
#include "framework/document/UpdateCrossReferencesCommandHelper.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/Utf.h"
#include "framework/render/RasterSink.h"
#include "framework/story/NoteAtt.h"
#include "support/DocumentBuilder.h"
#include "support/PdfProbe.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

namespace
{

using Params = ExportableInterface::ExportParams;

std::vector<Params> PagesOf(DocumentController const & document)
{
    std::vector<Params> params;
    for (int i = 0; i < document.GetDocument()->GetSpreadCount(); ++i) {
        ExportableNodes nodes;
        nodes.SetFromNode(document.GetDocument()->GetSpreadAtIndex(i));
        nodes.GetMultiPageExportParams(document, params, true);
    }
    return params;
}

/// The text of a painted page in drawing order, a bar between runs.
std::string TextOf(Renderer::RenderTree::DisplayList const & list)
{
    std::u16string text;
    for (auto const & operation : list.GetOperations()) {
        if (Renderer::RenderTree::DisplayList::Kind::Glyphs == operation.m_Kind) {
            text += list.TextOf(list.GetRun(operation.m_Index));
            text += u'|';
        }
    }
    return Kernel::Utf16ToUtf8(text).ToStd();
}

std::string Paint(Params const & page)
{
    Renderer::RenderTree::DisplayList list;
    PagePainter().Paint(page, {}, list, nullptr);
    EXPECT_EQ(list.GetDepth(), 0U);
    return TextOf(list);
}

}

TEST(DocumentExportTest, RunningHeadsAndFoliosShowWhatTheirPageSays)
{
    Kernel::Counted<DocumentController> const document = DocumentBuilder().Title("On Foxes").Paragraphs(30).Build();
    std::vector<Params> const pages = PagesOf(*document);
    ASSERT_LT(3U, pages.size());
    // None but the folio on the first page; the book on the left, the chapter on the right. The text comes first.
    std::string const first = Paint(pages[0]);
    EXPECT_THAT(first, HasSubstr("Number 1:"));
    EXPECT_THAT(first, Not(HasSubstr("On Foxes")));
    EXPECT_TRUE(first.ends_with("|1|")) << first.substr(first.size() - 20);
    std::string const second = Paint(pages[1]);
    EXPECT_THAT(second, HasSubstr("The Whole Book"));
    EXPECT_THAT(second, Not(HasSubstr("On Foxes")));
    EXPECT_THAT(second, HasSubstr("|2|"));
    EXPECT_THAT(Paint(pages[2]), HasSubstr("On Foxes"));
    EXPECT_EQ(pages[2].m_Label, "3");
    // Nothing of the facing page is drawn.
    EXPECT_THAT(second, Not(HasSubstr("|3|")));

    // Without glyphs drawn twice or lost, the pages hold the text in order.
    std::string all;
    for (Params const & page : pages) {
        all += Paint(page);
    }
    std::size_t place = 0;
    for (int i = 1; i <= 30; ++i) {
        place = all.find("Number", place);
        ASSERT_NE(place, std::string::npos) << i;
        ++place;
    }
    EXPECT_EQ(all.find("Number", place), std::string::npos);
}

TEST(DocumentExportTest, RunningHeadsThatAreTooLongEndInAnEllipsis)
{
    std::string title = "A title";
    for (int i = 0; i < 40; ++i) {
        title += " that goes on";
    }
    Kernel::Counted<DocumentController> const document = DocumentBuilder().Title(title).Paragraphs(30).Build();
    std::string const text = Paint(PagesOf(*document)[2]);
    EXPECT_THAT(text, HasSubstr("A title that goes"));
    EXPECT_THAT(text, HasSubstr("\xE2\x80\xA6"));
    EXPECT_THAT(text, Not(HasSubstr(title)));
}

TEST(DocumentExportTest, OutputPagesStandAtTheOriginWhateverTheirPlaceOnTheSpread)
{
    DocumentBuilder builder;
    builder.Settings().m_PageSetup.m_Bleed = {9, 9, 9, 9};
    Kernel::Counted<DocumentController> const document = builder.Paragraphs(30).Build();
    double const width = builder.Settings().m_PageSetup.m_PageSize.width;
    double const height = builder.Settings().m_PageSetup.m_PageSize.height;
    Kernel::JailCounted<SpreadNode> const spread = document->GetDocument()->GetSpreadAtIndex(1);
    ASSERT_EQ(spread->GetPageCount(), 2);

    std::vector<Params> params;
    ExportablePages right;
    right.AddPage(spread, 1, {});
    right.GetMultiPageExportParams(*document, params, false);
    ExportableNodes whole;
    whole.SetFromNode(spread);
    whole.GetMultiPageExportParams(*document, params, false);
    ExportablePages padded;
    padded.AddPaddingRect(spread->GetPageExtents(0, false), spread->GetPageExtents(0, true), {});
    padded.AddPage(spread, 1, Raster::AffineTransform::Params::Translation(width, 0));
    padded.GetMultiPageExportParams(*document, params, false);

    ASSERT_EQ(params.size(), 3U);
    EXPECT_EQ(params[0].m_Rect, (Kernel::Rect{0, 0, width, height}));
    EXPECT_EQ(params[0].m_BleedRect, (Kernel::Rect{-9, -9, width + 9, height + 9}));
    EXPECT_EQ(params[0].m_Label, "3");
    EXPECT_EQ(params[1].m_Rect, (Kernel::Rect{0, 0, 2 * width, height}));
    EXPECT_EQ(params[1].m_Label, "2");
    EXPECT_EQ(params[2].m_Rect, (Kernel::Rect{0, 0, 2 * width, height}));
    EXPECT_EQ(params[2].m_Nodes.size(), 1U);
    EXPECT_EQ(params[2].m_Label, "3");
}

TEST(DocumentExportTest, AnchorsStandWhereTheirTextIsShown)
{
    Kernel::Counted<DocumentController> const document =
        DocumentBuilder().Heading("First", 1, "a").Paragraphs(20).Heading("Second", 2, "b").Anchor("lair", "c").Build();
    AnchorVisitor visitor(false);
    visitor.Visit(document->GetDocument());
    Kernel::Counted<Anchors> const anchors = visitor.GetAnchors();
    ASSERT_EQ(anchors->size(), 3);
    std::vector<Kernel::Counted<AnchorInstance const>> const list(anchors->begin(), anchors->end());
    Kernel::Point first;
    Kernel::JailCounted<SpreadNode> const spread = list[0]->GetSpreadAndTargetPoint(first);
    ASSERT_TRUE(spread);
    EXPECT_EQ(spread->GetNodeIndex(), 0);
    EXPECT_EQ(first.x, 48);
    EXPECT_GE(first.y, 56);
    EXPECT_LT(first.y, 90);
    Kernel::Point second;
    Kernel::JailCounted<SpreadNode> const later = list[1]->GetSpreadAndTargetPoint(second);
    ASSERT_TRUE(later);
    EXPECT_LT(0, later->GetNodeIndex());
    // What a selection of it says agrees.
    Kernel::Counted<Selection> const selection = list[1]->CreateSelection();
    EXPECT_EQ(selection->GetSingleSpreadNode(), later);
    Kernel::Rect const box = selection->GetTextSelectionBaseBox();
    Kernel::JailCounted<TextFrameNode> const frame = Kernel::CountedCast<TextFrameNode>(*selection->begin());
    EXPECT_EQ(frame->GetStoryToDomainTransform().Map({box.left, box.top}), second);

    EXPECT_EQ(visitor.GetParentInstance(document, list[1]), list[0]);
    EXPECT_EQ(visitor.GetParentInstance(document, list[2]), list[1]);
    EXPECT_FALSE(visitor.GetParentInstance(document, list[0]));

    AnchorInfo info;
    UpdateCrossReferencesCommandHelper::FillAnchorInfo(info, list[2], document);
    EXPECT_EQ(info.m_ReferenceText1, "Here is lair.");
    EXPECT_EQ(info.m_ReferenceText5, "Second");
    EXPECT_EQ(info.m_ReferenceText3, document->GetDocument()->GetFormattedPageNumber(
                                         static_cast<unsigned int>(document->GetDocument()->GetPageCount() - 1)));

    AnchorInstance const blind(Kernel::MakeCounted<Story::AnchorData>("far", false, false, "x"), 4);
    Kernel::Point untouched{1, 2};
    EXPECT_FALSE(blind.GetSpreadAndTargetPoint(untouched));
    EXPECT_EQ(untouched, (Kernel::Point{1, 2}));
    EXPECT_FALSE(blind.CreateSelection());
}

TEST(DocumentExportTest, LinksCoverTheirWordsAndLeadToTheirTargets)
{
    Kernel::Counted<DocumentController> const document =
        DocumentBuilder()
            .Link("the web", Story::HyperlinkData::ToWeb("example.org"))
            .Link("the lair", Story::HyperlinkData::ToAnchor("uid-7", "#lair"))
            .Link("nothing", Story::HyperlinkData::ToAnchor("", "#gone"))
            .Note("A claim", "Its proof.", 0)
            .Paragraphs(20)
            .Build();
    std::vector<Kernel::Counted<HyperlinkData>> links;
    HyperlinkVisitor::CollateForExport(document, document->GetDocument()->GetSpreadAtIndex(0).Get(), links);
    ASSERT_EQ(links.size(), 3U);
    EXPECT_EQ(links[0]->m_Type, Story::HyperlinkData::Type::Web);
    EXPECT_EQ(links[0]->GetPath(), "example.org");
    ASSERT_EQ(links[0]->m_Rects.size(), 1U);
    Kernel::Rect const rect = links[0]->m_Rects[0];
    // Behind "See ", in the first line of the frame.
    EXPECT_LT(48 + 10, rect.left);
    EXPECT_LT(rect.right, 48 + 100);
    EXPECT_LT(56 - 3, rect.top);
    EXPECT_LT(rect.bottom, 56 + 20);
    EXPECT_EQ(links[1]->m_Anchor->GetUid(), "uid-7");
    // The note stands behind the text, on the last page, and leads back from there.
    EXPECT_EQ(links[2]->m_Type, Story::HyperlinkData::Type::Page);
    EXPECT_EQ(links[2]->m_PageIndex, document->GetDocument()->GetPageCount() - 1);
    links.clear();
    HyperlinkVisitor::CollateForExport(
        document, document->GetDocument()->GetSpreadAtIndex(document->GetDocument()->GetSpreadCount() - 1).Get(),
        links);
    ASSERT_EQ(links.size(), 1U);
    EXPECT_EQ(links[0]->m_PageIndex, 0);
}

TEST(DocumentExportTest, OnlyNotesThatRunThroughTheBookAreCollated)
{
    Kernel::Counted<DocumentController> const plain = DocumentBuilder().Title("T").Note("A", "local", 0).Build();
    EXPECT_TRUE(BookEndnoteVisitor::CollateBookEndnotesForChapter(plain, 0, true)->Empty());
    EXPECT_FALSE(BookEndnoteVisitor::FindCollatedBookEndnotes(plain));
    EXPECT_FALSE(IndexVisitor::ContainsIndex(plain));

    Kernel::Counted<DocumentController> const document = DocumentBuilder()
                                                             .Title("T")
                                                             .Note("A", "first", Story::NoteAtt::ThroughBook)
                                                             .Note("B", "local", Story::NoteAtt::InDocument)
                                                             .Note("C", "second", Story::NoteAtt::ThroughBook)
                                                             .Build();
    Kernel::Counted<Story::Story> const story = BookEndnoteVisitor::CollateBookEndnotesForChapter(document, 3, true);
    EXPECT_EQ(story->GetString(0, story->GetLength()), "T\n1. first\n3. second\n");
    Kernel::Counted<Story::Story> const later = BookEndnoteVisitor::CollateBookEndnotesForChapter(document, 3, false);
    EXPECT_EQ(later->GetString(0, 3), "\nT\n");
}

TEST(DocumentExportTest, APictureThatIsLostShowsAsAMarkedBoxAndAWarning)
{
    Kernel::Counted<DocumentController> const document = DocumentBuilder().Picture("no-such-id", 100, 100).Build();
    Renderer::RenderTree::DisplayList list;
    std::vector<Renderer::RenderTree::Warning> warnings;
    PagePainter().Paint(PagesOf(*document)[0], {}, list, &warnings);
    ASSERT_EQ(warnings.size(), 1U);
    EXPECT_EQ(warnings[0].m_Code, Renderer::RenderTree::Warning::Code::PictureMissing);
    bool stroked = false;
    for (auto const & operation : list.GetOperations()) {
        stroked |= Renderer::RenderTree::DisplayList::Kind::Stroke == operation.m_Kind;
    }
    EXPECT_TRUE(stroked);
}

namespace
{

/// Writes all pages of its document, with the links to the web.
class ExportAllCommand : public ExportItemCommandBase
{
public:
    explicit ExportAllCommand(Renderer::RenderTree::PdfExport & pdf)
        : ExportItemCommandBase(false, true, nullptr, true),
          m_Pdf(pdf)
    {
    }
    Kernel::LocalisedString GetDescription() const override { return {"Export", "Test"}; }
    void Do() override
    {
        DomainWriterUnlockSession const unlocked(Kernel::Counted<DomainController>(GetDocument().Get()));
        std::vector<Params> const pages = PagesOf(*GetDocument());
        for (std::size_t i = 0; i < pages.size(); ++i) {
            EXPECT_EQ(ExportResultOk,
                      ExportPDFPage(m_Pdf, pages, i, 0, Kernel::MakeCounted<Renderer::FileExportOptionsPDF>(), {},
                                    nullptr, nullptr));
        }
    }
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}

protected:
    void CollatePageHyperlinks(Params const & page, std::vector<Renderer::PdfHyperlink> & links) override
    {
        std::vector<Kernel::Counted<HyperlinkData>> found;
        HyperlinkVisitor::CollateForExport(Self(), page.m_Nodes[0]->GetSpreadNode().Get(), found);
        for (Kernel::Counted<HyperlinkData> const & link : found) {
            Renderer::PdfHyperlink out;
            out.m_Kind = Renderer::PdfHyperlink::Resource;
            out.m_Target = link->GetPath();
            out.m_Rect = page.TransformOf(0).MapBounds(link->m_Rects[0]);
            if (!out.m_Rect.Intersected(page.m_Rect).IsEmpty()) {
                links.push_back(out);
            }
        }
    }

private:
    Renderer::RenderTree::PdfExport & m_Pdf;
};

}

TEST(DocumentExportTest, AChapterComesOutAsPdf)
{
    TemporaryFolder const folder;
    DocumentBuilder builder;
    builder.Settings().m_Sections = {{0, 8, true, true, PageNumberFormat::RomanLower, ""}};
    builder.Title("On Foxes").Link("the web", Story::HyperlinkData::ToWeb("https://example.org")).Paragraphs(20);
    builder.BuildFile(folder / "chapter.kvdoc");
    // From the file, so that the glyphs are those that were saved.
    Kernel::Counted<DocumentController> const document = LoadTestDocument(folder / "chapter.kvdoc", nullptr);

    Kernel::Counted<Renderer::RenderTree::PdfSchema> const schema =
        Kernel::MakeCounted<Renderer::RenderTree::PdfSchema>(Kernel::MakeCounted<Renderer::FileExportOptionsPDF>(),
                                                             nullptr);
    Renderer::RenderTree::PdfExport pdf(schema, document->GetUnitConverter());
    Kernel::Counted<Kernel::MemoryOutStream> const stream = Kernel::MakeCounted<Kernel::MemoryOutStream>();
    ASSERT_TRUE(pdf.Create("chapter.pdf", stream, "", "On Foxes", "", ""));
    Kernel::Counted<ExportAllCommand> const command = Kernel::MakeCounted<ExportAllCommand>(pdf);
    VantraController::GetInstance().EnqueueCommandAndWait(command, document, false);
    ASSERT_TRUE(pdf.Close()) << pdf.GetError();
    auto const & bytes = stream->GetBytes();
    PdfProbe const probe(folder.WriteFile("chapter.pdf", {reinterpret_cast<char const *>(bytes.data()), bytes.size()}));

    EXPECT_EQ(probe.Check(), "");
    EXPECT_EQ(probe.PageCount(), document->GetDocument()->GetPageCount());
    EXPECT_THAT(probe.Labels(), testing::Contains("viii"));
    EXPECT_THAT(probe.Text(1), HasSubstr("See the web there."));
    EXPECT_THAT(probe.Text(1), HasSubstr("the quick brown fox jumps over lazy"));
    EXPECT_THAT(probe.Text(2), HasSubstr("On Foxes"));
    EXPECT_THAT(probe.Links(1), HasSubstr("https://example.org"));
    EXPECT_EQ(probe.Links(2), "");
    EXPECT_TRUE(command->GetPreviewBitmap());
    EXPECT_FALSE(document->IsDirty());
}

TEST(DocumentExportTest, APageCanBeSeen)
{
    Kernel::Counted<DocumentController> const document = DocumentBuilder().Paragraphs(20).Build();
    Params const page = PagesOf(*document)[0];
    Renderer::RenderTree::DisplayList list;
    PagePainter().Paint(page, {}, list, nullptr);
    Kernel::Counted<Raster::DynamicBitmap> const bitmap =
        Renderer::RenderTree::RasterSink(Kernel::MakeCounted<Renderer::RenderTree::Schema>())
            .Draw(list, 420, 595, {}, nullptr);
    ASSERT_TRUE(bitmap);
    // Ink within the text area, none in the outer margin above the folio.
    auto const ink = [&bitmap](int left, int top, int right, int bottom) {
        int count = 0;
        for (int y = top; y < bottom; ++y) {
            for (int x = left; x < right; ++x) {
                count += 128 < bitmap->GetRow(y)[4 * x + 3] ? 1 : 0;
            }
        }
        return count;
    };
    EXPECT_LT(3000, ink(48, 56, 366, 531));
    EXPECT_EQ(0, ink(370, 0, 420, 595));
    EXPECT_EQ(0, ink(0, 0, 420, 50));
}
