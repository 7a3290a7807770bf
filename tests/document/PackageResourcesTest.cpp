#include "framework/commands/PackageResourcesCommand.h"

#include "framework/commands/SaveDocumentAsPackageCommand.h"
#include "framework/document/EmbeddedDocumentNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/TextFlow.h"
#include "framework/kernel/FileSystem.h"
#include "framework/render/SvgReader.h"
#include "framework/typeset/FontLibrary.h"
#include "support/DocumentBuilder.h"
#include "support/DrawingBuilder.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <sys/stat.h>

using Kernel::Counted;
using Kernel::FileSystem;
using Kernel::MakeCounted;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace
{

constexpr std::string_view InstalledFamily = "DejaVu Sans";

std::vector<String> NamesIn(String const & folder)
{
    std::vector<String> names;
    FileSystem::ListFolder(folder, names);
    return names;
}

String TextOf(Raster::Picture::Bytes const & bytes)
{
    return bytes ? String(std::string_view(reinterpret_cast<char const *>(bytes->data()), bytes->size())) : String();
}

/// A font of its own name and embedding flags, of an installed one. The name is as long as that one's.
String MakeFont(TemporaryFolder const & folder, std::string const & family, unsigned flags)
{
    EXPECT_EQ(family.size(), InstalledFamily.size());
    Typeset::FontMatch const match = Typeset::FontLibrary::GetInstance().Find(String(InstalledFamily), 400, false);
    EXPECT_TRUE(match.m_FamilyFound);
    Raster::PictureProblem problem;
    std::string font = TextOf(Raster::ReadPictureFile(match.m_Face->GetPath(), problem)).ToStd();
    auto const wide = [](std::string_view text) {
        std::string result;
        for (char const c : text) {
            result += '\0';
            result += c;
        }
        return result;
    };
    auto const replace = [&font](std::string const & from, std::string const & to) {
        for (std::size_t at = font.find(from); at != std::string::npos; at = font.find(from, at)) {
            font.replace(at, from.size(), to);
        }
    };
    replace(std::string(InstalledFamily), family);
    replace(wide(InstalledFamily), wide(family));
    // The table's record: tag, checksum, offset, length. fsType is the fifth number of it.
    std::size_t const record = font.find("OS/2");
    std::size_t offset = 0;
    for (std::size_t i = 8; i < 12; ++i) {
        offset = offset << 8 | static_cast<unsigned char>(font[record + i]);
    }
    font[offset + 8] = static_cast<char>(flags >> 8);
    font[offset + 9] = static_cast<char>(flags);
    return folder.WriteFile("fonts/" + family + ".ttf", font);
}

void SetFamily(DocumentBuilder & builder, std::string const & style, std::string const & family)
{
    auto const sheet = MakeCounted<Story::StyleSheet>();
    for (Story::TextStyle paragraph : builder.Settings().m_Styles->GetParagraphStyles()) {
        if (paragraph.m_Name == style.c_str()) {
            paragraph.m_GlyphAtts.SetString(Story::GlyphAtt::Families, family);
        }
        sheet->SetParagraphStyle(paragraph);
    }
    builder.Settings().m_Styles = sheet;
}

class PackageResourcesTest : public testing::Test
{
protected:
    /// Takes a picture in, as an importer does; gives its id.
    String TakeIn(DocumentBuilder & builder, std::string const & name, Raster::Picture::Bytes const & bytes)
    {
        PictureSettings picture;
        picture.m_Bytes = bytes;
        picture.m_Entry.m_SourcePath = m_Sources.WriteFile(name, TextOf(bytes).View());
        picture.m_Entry.m_DrawingKind = Renderer::RenderTree::PlacedDrawing::KindOf(*bytes);
        builder.Settings().m_Pictures.push_back(picture);
        return DocumentPictures::IdOf(*bytes);
    }
    /// Packages; then the sources are gone, and the copy is read.
    Counted<DocumentController> Package(Counted<DocumentController> const & document)
    {
        auto const command = MakeCounted<SaveDocumentAsPackageCommand>(m_Package / "copy.kvdoc", true, true, false);
        command->PostDequeueWithMutableController(document);
        command->Do();
        EXPECT_TRUE(command->GetResult().IsSuccess()) << command->GetResult().GetText();
        m_Problems = command->GetProblems();
        std::filesystem::remove_all(m_Sources.GetPath().ToStd());
        return LoadTestDocument(m_Package / "copy.kvdoc", nullptr);
    }
    static void Place(DocumentController & document, Kernel::JailCounted<Node> node)
    {
        document.GetDocument()->GetSpreadAtIndex(0)->AppendChild(NodeChildListItems, std::move(node));
    }

    TemporaryFolder const m_Sources;
    TemporaryFolder const m_Package;
    std::vector<String> m_Problems;
};

}

TEST_F(PackageResourcesTest, AFontGoesAlongIfItsFlagLetsOthersWorkWithIt)
{
    struct Row
    {
        char const * m_Why;
        unsigned m_Flags;
        bool m_Goes;
    };
    int number = 10;
    for (Row const & row : {Row{"installable", 0x0000, true}, Row{"restricted", 0x0002, false},
                            Row{"preview and print", 0x0004, false}, Row{"editable", 0x0008, true},
                            Row{"of several the most generous", 0x000C, true},
                            Row{"no subsets, which is none of a copy's business", 0x0100, true},
                            Row{"bitmaps only", 0x0208, false}}) {
        std::string const family = "Licence N" + std::to_string(++number);
        MakeFont(m_Sources, family, row.m_Flags);
        // A folder is looked into once.
        std::filesystem::rename((m_Sources / "fonts").ToStd(), (m_Sources / family).ToStd());
        Typeset::FontLibrary::GetInstance().AddFolder(m_Sources / family);
        DocumentBuilder builder;
        SetFamily(builder, "Text", family);
        SetFamily(builder, "Heading 2", InstalledFamily.data());
        testing::internal::CaptureStderr();
        auto const document = builder.Paragraph("Words.").Build();
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "a folder's fonts are found in silence";

        TemporaryFolder const target;
        PackageResourcesCommand command(target.GetPath(), true, true, false);
        command.PostDequeueWithMutableController(document);
        command.Do();
        auto const names = NamesIn(target / "Fonts");
        EXPECT_EQ(std::ranges::count(names, String(family + ".ttf")), row.m_Goes ? 1 : 0) << row.m_Why;
        EXPECT_EQ(std::ranges::count(names, String("DejaVuSans.ttf")), 0) << "only a style names it";
        if (row.m_Goes) {
            EXPECT_THAT(command.GetProblems(), IsEmpty()) << row.m_Why;
        } else {
            ASSERT_EQ(command.GetProblems().size(), 1U) << row.m_Why;
            EXPECT_THAT(command.GetProblems()[0].ToStd(), HasSubstr(family)) << "the user can install it there";
        }

        TemporaryFolder const withUnused;
        PackageResourcesCommand all(withUnused.GetPath(), true, true, true);
        all.PostDequeueWithMutableController(document);
        all.Do();
        EXPECT_EQ(std::ranges::count(NamesIn(withUnused / "Fonts"), String("DejaVuSans.ttf")), 1);
    }
}

TEST_F(PackageResourcesTest, AMissingFontIsToldOfAndItsSubstituteGoesAlong)
{
    DocumentBuilder builder;
    SetFamily(builder, "Text", "No Such Face");
    auto const document = builder.Paragraph("Words.").Build();
    ASSERT_TRUE(Package(document));
    ASSERT_EQ(m_Problems.size(), 1U);
    EXPECT_THAT(m_Problems[0].ToStd(), HasSubstr("No Such Face"));
    auto const substitute = Typeset::FontLibrary::GetInstance().Find("No Such Face", 400, false, 10.5).m_Face;
    ASSERT_TRUE(substitute);
    EXPECT_TRUE(std::filesystem::exists(
        std::filesystem::path((m_Package / "Fonts").ToStd()) /
        std::filesystem::path(substitute->GetPath().ToStd()).filename()));
}

TEST_F(PackageResourcesTest, WhatIsPlacedOnPagesGoesAlongAndIsFoundThere)
{
    DocumentBuilder builder;
    auto const document = builder.Paragraph("Words.").Build();
    String const pdf = m_Sources.WriteFile("ä b\nc.pdf", TextOf(PdfSketch().Make()).View());
    String const svg = m_Sources.WriteFile("drawing.svg", TextOf(SvgWith("<rect width='9' height='9'/>")).View());
    String const pipe = m_Sources / "pipe";
    ::mkfifo(pipe.c_str(), 0666);
    Place(*document, MakeCounted<EmbeddedDocumentNode>(Kernel::Rect{10, 10, 60, 60}, pdf, "pdf", false));
    Place(*document, MakeCounted<PictureNode>(Kernel::Rect{10, 10, 60, 60}, svg, "svg"));
    Place(*document, MakeCounted<PictureNode>(Kernel::Rect{10, 10, 60, 60}, m_Sources / "gone.png", "gone"));
    Place(*document, MakeCounted<PictureNode>(Kernel::Rect{10, 10, 60, 60}, pipe, "pipe"));
    auto const copy = Package(document);
    ASSERT_TRUE(copy);
    EXPECT_THAT(NamesIn(m_Package / "Pictures"), ElementsAre("drawing.svg", "ä b\nc.pdf"));
    ASSERT_EQ(m_Problems.size(), 2U) << "the user hears what is missing, and nobody waits at a pipe";

    PackageManagerInfo info;
    PackageResourcesCommand::GetDocumentInfo(copy, info);
    std::vector<String> paths;
    for (PackageManagerInfo::Picture const & picture : info.GetPictures()) {
        paths.push_back(picture.m_Path);
        EXPECT_EQ(picture.m_IsPresent, picture.m_Path.View().starts_with(m_Package.GetPath().View())) << picture.m_Path;
    }
    EXPECT_THAT(paths, ElementsAre(m_Package / "Pictures/ä b\nc.pdf", m_Package / "Pictures/drawing.svg",
                                   m_Sources / "gone.png", pipe));
}

TEST_F(PackageResourcesTest, AnSvgGoesWithTheFilesThatItShows)
{
    // Three that are beside it, one of which shows another; three that may not be read; and two that are no files.
    m_Sources.WriteFile("inner & co.png", "first");
    m_Sources.WriteFile("below/deeper.svg", TextOf(SvgWith("<image href='deepest.png'/>")).View());
    m_Sources.WriteFile("below/deepest.png", "second");
    m_Sources.WriteFile("pattern.svg", TextOf(SvgWith("<g id='p'/>")).View());
    m_Sources.WriteFile("beside.png", "third");
    m_Sources.WriteFile("pages/draw.png", "an unlinked neighbour");
    DocumentBuilder builder;
    auto const drawing = SvgWith("<image href=\"inner%20&amp;%20co.png\"/><image xlink:href = 'below/deeper.svg'/>"
                                 "<rect style='fill: url( \"pattern.svg#p\" )'/><use href='#own'/>"
                                 "<image href='../beside.png'/><image href='https://example.org/a.png'/>"
                                 "<image href='data:image/png;base64,AAAA'/><image href='nowhere.png'/><image href='");
    String const id = TakeIn(builder, "draw.svg", drawing);
    auto const document = builder.Picture(id, 75, 37).Build();
    Place(*document, MakeCounted<PictureNode>(Kernel::Rect{10, 10, 60, 60}, m_Sources / "draw.svg", "placed"));
    // The name of the folder that it would get is another's.
    m_Package.WriteFile("Pictures/DRAW/draw.svg", "older");
    auto const copy = Package(document);
    ASSERT_TRUE(copy);
    EXPECT_THAT(m_Problems, IsEmpty()) << m_Problems[0];
    String const folder = m_Package / "Pictures/draw-2";
    EXPECT_THAT(NamesIn(m_Package / "Pictures"), ElementsAre("DRAW", "draw-2")) << "the page's is the text's";
    EXPECT_THAT(NamesIn(folder), ElementsAre("below", "draw.svg", "inner & co.png", "pattern.svg"));
    EXPECT_THAT(NamesIn(folder + "/below"), ElementsAre("deeper.svg", "deepest.png"));
    EXPECT_EQ(copy->GetPictures().FindEntry(id)->m_SourcePath, folder + "/draw.svg");
}

TEST_F(PackageResourcesTest, ADrawingThatIsCutOffOrAllLinksIsLookedAtInOneWalk)
{
    using Renderer::RenderTree::FindSvgLinks;
    std::string const whole = "<image href = \"a&amp;b.png\"/><rect fill='url( \"c%20d.svg#e\" )'/>";
    for (std::size_t length = 0; length < whole.size(); ++length) {
        EXPECT_LE(FindSvgLinks(*ToBytes(whole.substr(0, length))).size(), 2U);
    }
    EXPECT_THAT(FindSvgLinks(*ToBytes(whole)), ElementsAre("a&b.png", "c d.svg"));
    std::string open;
    std::string many;
    for (int i = 0; i < 400'000; ++i) {
        open += "url(href=\"";
        many += "href='" + std::to_string(i) + "'";
    }
    EXPECT_LE(FindSvgLinks(*ToBytes(open)).size(), 1U);
    EXPECT_EQ(FindSvgLinks(*ToBytes(many)).size(), 1000U);
}

TEST_F(PackageResourcesTest, NamesThatAreOneOnOtherSystemsTakeNumbers)
{
    DocumentBuilder builder;
    int shade = 0;
    // The last two are one word, with its accent as one character and as two.
    for (char const * const name :
         {"a/Dot.svg", "b/dot.SVG", "c/\u00C9t\u00E9.svg", "d/\u00E9te\u0301.svg", "e/.svg"}) {
        auto const drawing = SvgWith("<rect width='" + std::to_string(++shade) + "' height='9'/>");
        builder.Picture(TakeIn(builder, name, drawing), 9, 9);
    }
    auto const copy = Package(builder.Build());
    ASSERT_TRUE(copy);
    auto const names = NamesIn(m_Package / "Pictures");
    EXPECT_EQ(names.size(), 5U);
    std::set<String> folded;
    for (String const & name : names) {
        folded.insert(PackageFolder::Fold(name));
    }
    EXPECT_EQ(folded.size(), 5U) << testing::PrintToString(names);
    for (auto const & [id, entry] : copy->GetPictures().GetEntries()) {
        Raster::PictureProblem problem;
        Raster::Picture::Bytes const bytes = Raster::ReadPictureFile(entry.m_SourcePath, problem);
        ASSERT_TRUE(bytes) << problem.m_Text;
        EXPECT_EQ(DocumentPictures::IdOf(*bytes), id) << entry.m_SourcePath;
    }
}

TEST_F(PackageResourcesTest, AProtectedPdfOfTheTextIsTheDocumentsOwnEvenIfItsFileIsGone)
{
    PdfSketch sketch;
    sketch.m_Password = "secret";
    DocumentBuilder builder;
    String const id = TakeIn(builder, "locked.pdf", sketch.Make());
    builder.Settings().m_Pictures.back().m_Entry.m_IsProtected = true;
    builder.Picture(id, 100, 50).BuildFile(m_Sources / "own.kvdoc");
    auto const document = LoadTestDocument(m_Sources / "own.kvdoc", nullptr);
    ASSERT_EQ(document->GetProtectedImages().size(), 1U);
    FileSystem::Delete(m_Sources / "locked.pdf", 0);
    auto const copy = Package(document);
    ASSERT_TRUE(copy);
    EXPECT_THAT(m_Problems, IsEmpty()) << m_Problems[0];
    EXPECT_THAT(NamesIn(m_Package / "Pictures"), ElementsAre("locked.pdf"));
    auto const images = copy->GetProtectedImages();
    ASSERT_EQ(images.size(), 1U);
    EXPECT_EQ(images[0]->GetGUID(), id);
}
