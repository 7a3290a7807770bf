#include "framework/commands/PreflightCheckDocumentCommand.h"
#include "framework/document/AnchorInfo.h"
#include "framework/document/BookSink.h"
#include "framework/document/BookSinkCollection.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/OpenDocumentFailedNotification.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "support/DocumentBuilder.h"
#include "support/DrawingBuilder.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>

using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

/// Knows the anchor "elsewhere", and says what it is told to of generated parts.
class Publication : public BookSink
{
public:
    Publication() { BookSinkCollection::RegisterBookSink(this); }
    ~Publication() override { BookSinkCollection::UnregisterBookSink(this); }

    using Document = Kernel::Counted<DocumentController const>;
    bool IsAnyTocOutOfDate(Document document) override { return Asked(*document) && m_IsStale; }
    bool IsIndexOutOfDate(Document document) override { return Asked(*document) && m_IsStale; }
    bool IsInBook(Document) override { return true; }
    Kernel::Counted<DomainCommand> MakeUpdateIndexCommand(Document) override { return nullptr; }
    Kernel::Counted<DomainCommand> MakeUpdateAllTocsCommand(Document) override { return nullptr; }
    bool HandleCommand(Document, Kernel::Counted<DomainCommand>) override { return false; }
    bool GetAnchors(AnchorVisitor &, Document) override { return false; }
    bool IsAnchorPointValid(Kernel::Counted<AnchorInstance const>, Document) override { return false; }
    AnchorInfo const * GetAnchorInfo(String const & uid, Document document) override
    {
        return Asked(*document) && uid == "elsewhere" ? &m_Info : nullptr;
    }
    bool IsAnchorAbove(String const &, Document) override { return false; }
    String GetPasswordForGuid(String, Document document) override
    {
        return Asked(*document) ? m_Password : String();
    }
    void SetPasswordForGuid(String, String, Document) override {}

    bool m_IsStale = false;
    bool m_HeldLock = false;
    String m_Password;

private:
    bool Asked(DocumentController const & document)
    {
        m_HeldLock = m_HeldLock || document.IsWriterLockHeld();
        return true;
    }

    AnchorInfo m_Info;
};

class PreflightTest : public testing::Test
{
protected:
    void Open(DocumentBuilder & builder)
    {
        m_Path = m_Folder / "chapter.kvdoc";
        builder.BuildFile(m_Path);
        m_Document = LoadTestDocument(m_Path, nullptr);
        ASSERT_TRUE(m_Document);
    }

    /// Checks, and gives a line a finding: severity, kind, page, object. Folders are left out of the objects.
    std::vector<std::string> Check(enum Raster::Format expected = Raster::Format::Rgba8,
                                   PreflightForOperation operation = PreflightForOperation::Check)
    {
        auto const command = Kernel::MakeCounted<PreflightCheckDocumentCommand>(operation);
        command->ExpectFormat(expected);
        VantraController::GetInstance().EnqueueCommandAndWait(command, m_Document, false);
        std::vector<std::string> lines;
        for (PreflightResult const & result : m_Document->GetPreflightResults()->GetResults()) {
            std::string const subject = result.m_Subject.ToStd();
            lines.push_back(std::string(PreflightResult::NameOf(result.m_Status)) + " " +
                            PreflightResult::NameOf(result.m_Problem) + " " +
                            (result.m_Folio.Empty() ? "-" : result.m_Folio.ToStd()) + " " +
                            subject.substr(subject.rfind('/') + 1));
            std::string const message = result.m_Message.ToString().ToStd();
            EXPECT_TRUE(message.ends_with('.')) << message;
            EXPECT_NE(message.find(subject), std::string::npos) << message;
        }
        return lines;
    }

    /// A file that the document takes in, with its id.
    String TakeIn(DocumentBuilder & builder, char const * name, Raster::Picture::Bytes const & bytes)
    {
        DocumentPictures::Entry entry;
        entry.m_SourcePath = m_Folder.WriteFile(name, {reinterpret_cast<char const *>(bytes->data()), bytes->size()});
        EXPECT_TRUE(Kernel::FileSystem::GetModifiedTime(entry.m_SourcePath, entry.m_SourceTime));
        entry.m_DrawingKind = Renderer::RenderTree::PlacedDrawing::KindOf(*bytes);
        builder.Settings().m_Pictures.push_back({bytes, entry});
        return DocumentPictures::IdOf(*bytes);
    }

    static Raster::Picture::Bytes Pixels()
    {
        std::ifstream stream(std::string(KORVANE_SOURCE_FOLDER) + "/tests/raster/images/rgb16.png", std::ios::binary);
        return ToBytes(std::string(std::istreambuf_iterator<char>(stream), {}));
    }

    TemporaryFolder m_Folder;
    String m_Path;
    Kernel::Counted<DocumentController> m_Document;
};

TEST_F(PreflightTest, ASoundDocumentHasNoFindings)
{
    DocumentBuilder builder;
    builder.Heading("First", 1, "own").Link("there", Story::HyperlinkData::ToAnchor("own", "#first"));
    builder.Picture(TakeIn(builder, "sharp.png", Pixels()), 2, 3);
    builder.Picture(TakeIn(builder, "figure.pdf", PdfSketch().Make()), 100, 50);
    builder.Picture(TakeIn(builder, "drawing.svg", SvgWith("<rect width='9' height='9'/>")), 75, 37);
    Open(builder);
    EXPECT_THAT(Check(), IsEmpty());
    EXPECT_EQ(m_Document->GetPreflightResults()->GetSummary().m_Text.ToString(), "No problems found");
}

TEST_F(PreflightTest, PicturesAreFoundMissingChangedCoarseAndBroken)
{
    DocumentBuilder builder;
    builder.Paragraph("Words.").PageBreak();
    builder.Picture(TakeIn(builder, "coarse.png", Pixels()), 200, 300);
    builder.PageBreak().Picture(TakeIn(builder, "changed.svg", SvgWith("<rect width='9' height='9'/>")), 20, 20);
    String const pdf = TakeIn(builder, "short.pdf", PdfSketch().Make());
    builder.Picture(PictureReference{pdf, 7}.ToString(), 20, 20);
    Open(builder);
    String const changed = m_Folder.WriteFile("changed.svg", "<svg/>");
    for (String const & touched : {changed, m_Folder / "short.pdf"}) {
        Kernel::FileSystem::SetModifiedTime(touched, Kernel::TimeStamp(1'000'000'000));
    }
    auto const spread = m_Document->GetDocument()->GetSpreadAtIndex(0);
    spread->AppendChild(NodeChildListItems,
                        Kernel::MakeCounted<PictureNode>(Kernel::Rect{10, 10, 60, 60}, m_Folder / "gone.png", "g"));
    EXPECT_THAT(Check(), ElementsAre("error missing-picture 1 gone.png", "warning picture-resolution 2 coarse.png",
                                     "error missing-picture 3 short.pdf", "warning changed-picture 3 changed.svg"));
    EXPECT_EQ(m_Document->GetPreflightResults()->GetSummary().m_Text.ToString(), "Errors: 2, warnings: 2");
    EXPECT_THAT(Check(Raster::Format::Rgba8, PreflightForOperation::Export),
                ElementsAre("error missing-picture 1 gone.png", "error missing-picture 3 short.pdf"));
}

TEST_F(PreflightTest, AProtectedPdfIsLockedUntilItsPasswordIsGiven)
{
    PdfSketch sketch;
    sketch.m_Password = "secret";
    DocumentBuilder builder;
    String const id = TakeIn(builder, "locked.pdf", sketch.Make());
    builder.Settings().m_Pictures.back().m_Entry.m_IsProtected = true;
    builder.Picture(id, 100, 50);
    Open(builder);
    m_Document->GetDocument()->GetSpreadAtIndex(0)->AppendChild(
        NodeChildListItems, Kernel::MakeCounted<EmbeddedDocumentNode>(Kernel::Rect{10, 10, 60, 60},
                                                                      m_Folder / "locked.pdf", "placed", true));
    EXPECT_THAT(Check(), ElementsAre("error locked-picture 1 locked.pdf", "error locked-picture 1 locked.pdf"));
    auto const images = m_Document->GetProtectedImages();
    ASSERT_EQ(images.size(), 2U) << "the text's too, by the id of its picture";
    EXPECT_THAT((std::vector<String>{images[0]->GetGUID(), images[1]->GetGUID()}),
                testing::UnorderedElementsAre(id, "placed"));
    images[0]->SetPassword("wrong");
    images[1]->SetPassword("secret");
    EXPECT_EQ(Check().size(), 1U);
    images[0]->SetPassword("secret");
    EXPECT_THAT(Check(), IsEmpty());
    SaveTestDocument(*m_Document, m_Path);
    std::ifstream stream(m_Path.ToStd(), std::ios::binary);
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(stream), {}).find("secret"), std::string::npos);
}

TEST_F(PreflightTest, ADocumentOpenedInFrontRecallsThePasswordsOfItsPublication)
{
    Publication publication;
    publication.m_Password = "secret";
    PdfSketch sketch;
    sketch.m_Password = "secret";
    DocumentBuilder builder;
    builder.Picture(TakeIn(builder, "locked.pdf", sketch.Make()), 100, 50);
    builder.Settings().m_Pictures.back().m_Entry.m_IsProtected = true;
    m_Path = m_Folder / "front.kvdoc";
    builder.BuildFile(m_Path);
    OpenDocumentFailedNotification failure(m_Path, false);
    m_Document = VantraController::GetInstance().OpenDocument(m_Path, failure);
    ASSERT_TRUE(m_Document);
    EXPECT_THAT(Check(), IsEmpty());
    EXPECT_FALSE(publication.m_HeldLock);
    VantraController::GetInstance().EnqueueCommand(
        Kernel::MakeCounted<CloseDocumentCommand>(m_Document, nullptr, false, false));
    VantraController::GetInstance().WaitUntilIdle();
}

TEST_F(PreflightTest, FontsAndTextWithoutAPlaceAreFound)
{
    DocumentBuilder builder;
    Story::AttSet family;
    family.SetString(Story::GlyphAtt::Families, "No Such Family");
    Kernel::Counted<Story::StyleSheet> const styles = builder.Settings().m_Styles->Clone();
    styles->SetDefaults(family, {});
    builder.Settings().m_Styles = styles;
    builder.Paragraphs(12);
    Open(builder);
    ASSERT_LT(1U, m_Document->GetDocument()->GetMainFlow()->GetFrames().size());
    auto const flow = m_Document->GetDocument()->GetMainFlow();
    flow->SetGrowing(false);
    flow->SetFrames({flow->GetFrames().front()});
    m_Document->SetTextDirty();
    std::vector<std::string> const lines = Check();
    ASSERT_EQ(lines.size(), 2U) << testing::PrintToString(lines);
    EXPECT_THAT(lines[0], testing::StartsWith("error overset-text - "));
    EXPECT_EQ(lines[1], "error missing-font 1 No Such Family");
}

TEST_F(PreflightTest, ReferencesAndAnchorsAreLookedUpHereAndInThePublication)
{
    Publication publication;
    DocumentBuilder builder;
    builder.Anchor("", "nameless").PageBreak();
    builder.Link("own", Story::HyperlinkData::ToAnchor("nameless", "#n"));
    builder.Link("other", Story::HyperlinkData::ToAnchor("elsewhere", "other.md#there"));
    builder.Link("web", Story::HyperlinkData::ToWeb("https://example.org"));
    builder.Link("gone", Story::HyperlinkData::ToAnchor("nowhere", "other.md#gone"));
    builder.Link("unset", Story::HyperlinkData::ToAnchor(String(), "other.md#unset"));
    Open(builder);
    EXPECT_THAT(Check(), ElementsAre("warning empty-anchor-name 1 Here is .", "error unresolved-reference 2 other.md#unset",
                                     "error unresolved-reference 2 other.md#gone"));
    EXPECT_FALSE(publication.m_HeldLock) << "whoever answers may read the document";
    publication.m_IsStale = true;
    EXPECT_THAT(Check(), testing::IsSupersetOf({"warning stale-toc - ", "warning stale-index - "}));
}

TEST_F(PreflightTest, AnotherColourFormatThanThePublicationsIsAWarning)
{
    DocumentBuilder builder;
    builder.Paragraph("Words.");
    Open(builder);
    EXPECT_THAT(Check(Raster::Format::Cmyka8), ElementsAre("warning colour-format - "));
    EXPECT_THAT(Check(Raster::Format::Rgba16), IsEmpty()) << "more bits of the same colours";
}

TEST_F(PreflightTest, PreviewsWithoutTheirProgramAreAWarning)
{
    DocumentBuilder builder;
    builder.Picture(TakeIn(builder, "figure.pdf", PdfSketch().Make()), 100, 50);
    Open(builder);
    std::string const path = std::getenv("PATH");
    setenv("PATH", "/nowhere", 1);
    std::vector<std::string> const lines = Check();
    setenv("PATH", path.c_str(), 1);
    EXPECT_THAT(lines, ElementsAre("warning picture-preview - "));
}

}
