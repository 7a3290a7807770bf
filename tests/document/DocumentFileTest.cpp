#include "framework/document/DocumentNode.h"
#include "framework/document/MasterSpreadNode.h"
#include "framework/document/RunningTextNode.h"
#include "framework/kernel/FileSystem.h"
#include "framework/story/FlowComposer.h"
#include "framework/story/PictureGlyph.h"
#include "support/DocumentBuilder.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <thread>

namespace
{

using Failure = OpenDocumentFailedNotification;

String TextOf(DocumentController const & document)
{
    Story::Story const & story = *document.GetDocument()->GetMainFlow()->GetStory();
    return story.GetString(0, story.GetLength());
}

std::string Numbers(DocumentNode const & node)
{
    std::string text;
    for (int i = 0; i < node.GetPageCount(); ++i) {
        text += node.GetFormattedPageNumber(static_cast<unsigned int>(i)).ToStd() + " ";
    }
    return text;
}

/// Everything that a file keeps, told in one text.
std::string Describe(DocumentController const & document)
{
    DocumentNode const & node = *document.GetDocument();
    std::string text = document.GetGUID().ToStd() + "|" + document.GetMetadata()->GetTitle().ToStd() + "|" +
                       document.GetMetadata()->GetAuthor().ToStd() + "|" + node.GetPublicationTitle().ToStd() + "|" +
                       Numbers(node) + "|";
    for (int i = 0; i < node.GetSpreadCount(); ++i) {
        for (SpreadPage const & page : node.GetSpreadAtIndex(i)->GetPages()) {
            text += page.m_Master.ToStd() + std::to_string(page.m_Rect.left) + " ";
        }
        text += std::to_string(node.GetSpreadAtIndex(i)->GetChildCount(NodeChildListItems)) + ";";
    }
    for (int i = 0; i < node.GetMasterCount(); ++i) {
        text += node.GetMasterAtIndex(i)->GetName().ToStd() +
                std::to_string(node.GetMasterAtIndex(i)->GetChildCount(NodeChildListItems)) +
                std::to_string(node.GetMasterAtIndex(i)->GetTextRect(PageSide::Left).left) + ";";
    }
    for (Kernel::JailCounted<Story::IndexTopic> const & topic : *node.GetIndex()) {
        text += topic->GetName().ToStd() + topic->GetGUID().ToStd() + ",";
    }
    for (Swatch const & swatch : node.GetSwatches()->GetAll()) {
        text += swatch.m_Name.ToStd() + ",";
    }
    return text + std::to_string(std::hash<std::string>()(TextOf(document).ToStd()));
}

DocumentBuilder MakeRichBuilder()
{
    DocumentBuilder builder;
    builder.Settings().m_Metadata.m_Author = "A. Uthor";
    builder.Settings().m_Swatches = {{"Ink", Raster::Colour::Cmyk(1, 0.5F, 0, 0.2F)}};
    builder.Settings().m_Sections = {{0, 5, true, true, PageNumberFormat::RomanLower, "p. "}};
    builder.Settings().m_PageSetup.m_ChapterStart = ChapterStart::RightPage;
    builder.Title("On Foxes").Heading("On Foxes", 1, "uid-1").Paragraphs(25).Note("A claim", "With its proof.", 0);
    builder.IndexMark("Animals").Anchor("the lair", "uid-2");
    return builder;
}

}

TEST(DocumentFileTest, ALoadedDocumentIsTheOneThatWasSaved)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    DocumentBuilder builder = MakeRichBuilder();
    Kernel::Counted<DocumentController> const made = builder.Build();
    EXPECT_TRUE(made->IsDirty());
    SaveTestDocument(*made, path);
    EXPECT_FALSE(made->IsDirty());
    std::string const before = Describe(*made);
    made->ShutDownArchive();

    Kernel::Counted<DocumentController> const loaded = LoadTestDocument(path, nullptr);
    ASSERT_TRUE(loaded);
    EXPECT_EQ(Describe(*loaded), before);
    EXPECT_FALSE(loaded->IsDirty());
    EXPECT_FALSE(loaded->IsTextDirty());
    EXPECT_EQ(loaded->GetPath(), path);
    // The layout came from the file: facts at once, glyphs when they are asked for.
    Kernel::Counted<TextFlow> const flow = loaded->GetDocument()->GetMainFlow();
    EXPECT_FALSE(flow->GetLayout()->HasGlyphData());
    EXPECT_EQ(flow->GetLayoutHash(), made->GetDocument()->GetMainFlow()->GetLayoutHash());
    EXPECT_TRUE(flow->EnsureGlyphData());
}

TEST(DocumentFileTest, AnUnchangedSaveLeavesTheFileAlone)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    MakeRichBuilder().BuildFile(path);
    Kernel::TimeStamp before;
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(path, before));
    Kernel::Counted<DocumentController> const document = LoadTestDocument(path, nullptr);
    document->MarkChanged();
    ASSERT_TRUE(document->IsDirty());
    SaveTestDocument(*document, String());
    EXPECT_FALSE(document->IsDirty());
    Kernel::TimeStamp after;
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(path, after));
    EXPECT_EQ(before, after);
}

TEST(DocumentFileTest, WhatIsSavedAfterALazyLoadStillHasItsGlyphs)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    MakeRichBuilder().BuildFile(path);
    {
        Kernel::Counted<DocumentController> const document = LoadTestDocument(path, nullptr);
        document->GetDocument()->SetPublicationTitle("Another Book");
        document->MarkChanged();
        SaveTestDocument(*document, String());
        EXPECT_FALSE(document->GetDocument()->GetMainFlow()->GetLayout()->HasGlyphData());
    }
    Kernel::Counted<DocumentController> const again = LoadTestDocument(path, nullptr);
    EXPECT_EQ(again->GetDocument()->GetPublicationTitle(), "Another Book");
    EXPECT_TRUE(again->GetDocument()->GetMainFlow()->EnsureGlyphData());
}

TEST(DocumentFileTest, PicturesTravelWithTheDocument)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    auto const bytes = std::make_shared<std::vector<unsigned char> const>(std::vector<unsigned char>{1, 2, 3, 4});
    DocumentBuilder builder;
    builder.Settings().m_Pictures.push_back({bytes, {"/somewhere/fox.png", Kernel::TimeStamp(7), 0}});
    builder.Picture(DocumentPictures::IdOf(*bytes), 100, 50).BuildFile(path);

    Kernel::Counted<DocumentController> const document = LoadTestDocument(path, nullptr);
    auto const entries = document->GetPictures().GetEntries();
    ASSERT_EQ(entries.size(), 1U);
    EXPECT_EQ(entries.begin()->second.m_SourcePath, "/somewhere/fox.png");
    EXPECT_EQ(*document->GetPictures().GetBytes(entries.begin()->first), *bytes);
    Raster::PictureProblem problem;
    EXPECT_FALSE(document->GetPictures().Get(entries.begin()->first, problem));
    EXPECT_NE(problem.m_Code, Raster::PictureProblem::Code::None);

    // A picture that the new text does not name goes.
    DocumentBuilder other;
    document->ReplaceContent(other.Settings(), other.Paragraph("No pictures here.").Text());
    EXPECT_TRUE(document->GetPictures().GetEntries().empty());
}

TEST(DocumentFileTest, EachUselessFileHasItsOwnFailure)
{
    TemporaryFolder const folder;
    String const good = folder / "good.kvdoc";
    MakeRichBuilder().BuildFile(good);
    std::string const bytes = folder.ReadFile("good.kvdoc");
    std::string damaged = bytes;
    for (std::size_t i = 300; i < 364; ++i) {
        damaged[i] = static_cast<char>(~damaged[i]);
    }
    std::filesystem::create_directory(std::string(folder.GetPath().View()) + "/folder.kvdoc");
    struct
    {
        char const * m_Name;
        std::string m_Content;
        int m_Least;
        int m_Most;
    } const rows[] = {
        {"empty.kvdoc", "", Failure::CannotReadFile, Failure::Corrupt},
        {"text.kvdoc", "This is no document.", Failure::NotADocument, Failure::NotADocument},
        {"short.kvdoc", bytes.substr(0, bytes.size() / 2), Failure::NotADocument, Failure::Corrupt},
        {"tail.kvdoc", bytes.substr(0, bytes.size() - 10), Failure::NotADocument, Failure::Corrupt},
        {"damaged.kvdoc", damaged, Failure::NotADocument, Failure::Corrupt},
    };
    for (auto const & row : rows) {
        int result = 0;
        EXPECT_FALSE(LoadTestDocument(folder.WriteFile(row.m_Name, row.m_Content), &result)) << row.m_Name;
        EXPECT_GE(result, row.m_Least) << row.m_Name;
        EXPECT_LE(result, row.m_Most) << row.m_Name;
    }
    int result = 0;
    EXPECT_FALSE(LoadTestDocument(folder / "missing.kvdoc", &result));
    EXPECT_EQ(result, Failure::FileNotFound);
    EXPECT_FALSE(LoadTestDocument(folder / "folder.kvdoc", &result));
    EXPECT_GE(result, static_cast<int>(Failure::CannotReadFile));
    EXPECT_FALSE(DocumentController::CheckForOldArchiveVersion(good, nullptr));
    EXPECT_FALSE(DocumentController::CheckForOldArchiveVersion(folder / "text.kvdoc", nullptr));
}

TEST(DocumentFileTest, EveryChangedByteIsEitherHarmlessOrRefused)
{
    TemporaryFolder const folder;
    DocumentBuilder builder;
    builder.Heading("Short", 1, "u").Paragraph("Few words.").BuildFile(folder / "good.kvdoc");
    std::string const bytes = folder.ReadFile("good.kvdoc");
    for (std::size_t i = 0; i < bytes.size(); i += 23) {
        std::string changed = bytes;
        changed[i] = static_cast<char>(changed[i] ^ 0x55);
        int result = 0;
        if (Kernel::Counted<DocumentController> const document =
                LoadTestDocument(folder.WriteFile("changed.kvdoc", changed), &result)) {
            EXPECT_LT(0, document->GetDocument()->GetPageCount()) << "byte " << i;
        } else {
            EXPECT_NE(result, Failure::Success) << "byte " << i;
        }
    }
}

TEST(DocumentFileTest, DamagedGlyphsAreSetAnew)
{
    TemporaryFolder const folder;
    DocumentBuilder builder = MakeRichBuilder();
    builder.BuildFile(folder / "good.kvdoc");
    std::string bytes = folder.ReadFile("good.kvdoc");
    // The glyphs are by far the greatest part of the file.
    for (std::size_t i = bytes.size() / 2; i < bytes.size() / 2 + 64; ++i) {
        bytes[i] = static_cast<char>(~bytes[i]);
    }
    Kernel::Counted<DocumentController> const document =
        LoadTestDocument(folder.WriteFile("damaged.kvdoc", bytes), nullptr);
    ASSERT_TRUE(document);
    int const pages = document->GetDocument()->GetPageCount();
    EXPECT_FALSE(document->GetDocument()->GetMainFlow()->EnsureGlyphData());
    document->EnsureGlyphs();
    EXPECT_TRUE(document->GetDocument()->GetMainFlow()->EnsureGlyphData());
    EXPECT_EQ(document->GetDocument()->GetPageCount(), pages);
}

TEST(DocumentFileTest, LocksKeepOthersOut)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    MakeRichBuilder().BuildFile(path);
    Kernel::Counted<DocumentController> const front = Kernel::MakeCounted<DocumentController>();
    Kernel::Counted<Failure> const failure = Kernel::MakeCounted<Failure>(path, true);
    ASSERT_TRUE(front->LoadDocument(path, true, false, LoadWhole, nullptr, *failure, false));
    int result = 0;
    EXPECT_FALSE(LoadTestDocument(path, &result));
    EXPECT_EQ(result, Failure::LockedByOther);
    // A save keeps the lock on what is the file now.
    front->MarkChanged();
    front->GetDocument()->SetPublicationTitle("Changed");
    SaveTestDocument(*front, String());
    EXPECT_FALSE(LoadTestDocument(path, &result));
    front->ShutDownArchive();

    // Background documents share.
    Kernel::Counted<DocumentController> const one = LoadTestDocument(path, nullptr);
    Kernel::Counted<DocumentController> const two = LoadTestDocument(path, nullptr);
    EXPECT_TRUE(one && two);
    EXPECT_FALSE(front->LoadDocument(path, true, false, LoadWhole, nullptr, *failure, false));
}

TEST(DocumentFileTest, AFailedSaveLeavesTheFileAndTheDirtyMark)
{
    TemporaryFolder const folder;
    Kernel::Counted<DocumentController> const document = MakeRichBuilder().Build();
    DocumentSaveResult result;
    document->SaveDocument(result, String());
    EXPECT_FALSE(result.IsSuccess());
    document->SaveDocument(result, folder / "no/such/folder/x.kvdoc");
    EXPECT_FALSE(result.IsSuccess());
    EXPECT_EQ(result.GetResult(), DocumentSaveResult::FolderMissing) << result.GetText();
    EXPECT_TRUE(document->IsDirty());
    EXPECT_TRUE(document->GetPath().Empty());
}

TEST(DocumentFileTest, MakingADocumentAnewKeepsWhatOthersKnowItBy)
{
    TemporaryFolder const folder;
    String const path = folder / "chapter.kvdoc";
    MakeRichBuilder().BuildFile(path);
    Kernel::Counted<DocumentController> const document = LoadTestDocument(path, nullptr);
    String const guid = document->GetGUID();
    document->GetDocument()->SetSections({{0, 41, true, true, PageNumberFormat::Decimal, ""}});

    DocumentBuilder again;
    again.Heading("On Foxes", 1, "").Anchor("the den", "").Anchor("the lair", "");
    document->ReplaceContent(again.Settings(), again.Text());

    EXPECT_EQ(document->GetGUID(), guid);
    EXPECT_EQ(document->GetDocument()->GetFormattedPageNumber(0), "41");
    auto const anchors = Story::CollectAnchors(*document->GetDocument()->GetMainFlow()->GetStory());
    ASSERT_EQ(anchors.size(), 3U);
    EXPECT_EQ(anchors[0].m_Data->GetUid(), "uid-1");
    EXPECT_EQ(anchors[1].m_Data->GetUid(), "");
    EXPECT_EQ(anchors[2].m_Data->GetUid(), "uid-2");
    EXPECT_TRUE(document->IsDirty());
    // What was composed is laid out: the short text takes one page.
    EXPECT_EQ(document->GetDocument()->GetPageCount(), 1);
}

TEST(DocumentFileTest, TwoThreadsMakeDocumentsAtOnce)
{
    TemporaryFolder const folder;
    auto const work = [&folder](int thread) {
        for (int i = 0; i < 4; ++i) {
            DocumentBuilder builder;
            builder.Heading("Chapter", 1, "u").Paragraphs(10 + i);
            builder.BuildFile(folder / std::to_string(thread * 10 + i));
        }
    };
    std::thread other(work, 1);
    work(2);
    other.join();
    // The same text gives the same pages on any thread.
    for (int i = 0; i < 4; ++i) {
        EXPECT_EQ(
            LoadTestDocument(folder / std::to_string(10 + i), nullptr)->GetDocument()->GetMainFlow()->GetLayoutHash(),
            LoadTestDocument(folder / std::to_string(20 + i), nullptr)->GetDocument()->GetMainFlow()->GetLayoutHash());
    }
}
