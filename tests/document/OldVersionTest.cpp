#include "framework/document/DocumentNode.h"
#include "framework/document/SpreadNode.h"
#include "framework/document/VantraController.h"
#include "framework/commands/UpgradeDocumentCommand.h"
#include "support/DocumentBuilder.h"
#include "support/OldDocument.h"

#include <gtest/gtest.h>

using Kernel::Counted;

namespace
{

constexpr double ThreeMillimetres = 3 * 72 / 25.4;

/// Everything that the upgrade has to bring over, in one text.
std::string Describe(DocumentController const & document)
{
    DocumentNode const & node = *document.GetDocument();
    Story::Story const & story = *node.GetMainFlow()->GetStory();
    std::string text = document.GetMetadata()->GetTitle().ToStd() + "|" + document.GetGUID().ToStd() + "|" +
                       story.GetString(0, story.GetLength()).ToStd() + "|";
    for (int index = 0; index < node.GetSpreadCount(); ++index) {
        for (SpreadPage const & page : node.GetSpreadAtIndex(index)->GetPages()) {
            text += page.m_Master.ToStd() + " " + std::to_string(page.m_Bleed.left) + " " +
                    std::to_string(page.m_Bleed.bottom) + ";";
        }
    }
    return text;
}

}

TEST(OldVersionTest, ADocumentOfTheFirstFormatIsBroughtUpToDateInMemory)
{
    TemporaryFolder const folder;
    String const path = WriteOldDocument(folder, "old.kvdoc");
    std::string const bytes = folder.ReadFile("old.kvdoc");
    unsigned int version = 0;
    EXPECT_TRUE(DocumentController::CheckForOldArchiveVersion(path, &version));
    EXPECT_EQ(version, 1u);

    auto const document = LoadTestDocument(path, nullptr);
    ASSERT_TRUE(document);
    EXPECT_TRUE(document->IsFromOlderVersion());
    EXPECT_FALSE(document->IsDirty()) << "looking at a file must not take it from those with the older program";
    DocumentNode const & node = *document->GetDocument();
    EXPECT_EQ(document->GetMetadata()->GetTitle(), "The old chapter");
    EXPECT_EQ(node.GetPageCount(), 4);
    Kernel::RectT<double> const bleed = node.GetPageSetup().m_Bleed;
    for (double const side : {bleed.left, bleed.top, bleed.right, bleed.bottom}) {
        EXPECT_NEAR(side, ThreeMillimetres, 1e-6);
    }
    for (int index = 0; index < node.GetSpreadCount(); ++index) {
        for (SpreadPage const & page : node.GetSpreadAtIndex(index)->GetPages()) {
            EXPECT_EQ(page.m_Bleed, bleed) << "spread " << index;
        }
    }
    EXPECT_TRUE(node.HasBleed());
    EXPECT_EQ(folder.ReadFile("old.kvdoc"), bytes);
}

TEST(OldVersionTest, TheLastProgramsOfTheFirstFormatWroteABleedForEachSide)
{
    TemporaryFolder const folder;
    auto const document = LoadTestDocument(WriteOldDocument(folder, "old.kvdoc", "version-1-four-bleeds.kvdoc"), nullptr);
    ASSERT_TRUE(document);
    EXPECT_TRUE(document->IsFromOlderVersion());
    EXPECT_EQ(document->GetDocument()->GetPageCount(), 2);
    Kernel::RectT<double> const bleed = document->GetDocument()->GetPageSetup().m_Bleed;
    EXPECT_NEAR(bleed.top, ThreeMillimetres, 1e-3);
    EXPECT_EQ(document->GetDocument()->GetSpreadAtIndex(0)->GetPages().front().m_Bleed.top, bleed.top);
}

TEST(OldVersionTest, TheUpgradeWritesThePresentFormatAndLosesNothing)
{
    TemporaryFolder const folder;
    String const path = WriteOldDocument(folder, "old.kvdoc");
    auto document = LoadTestDocument(path, nullptr);
    ASSERT_TRUE(document);
    std::string const before = Describe(*document);
    VantraController::GetInstance().EnqueueCommandAndWait(Kernel::MakeCounted<UpgradeDocumentCommand>(), document,
                                                          false);
    EXPECT_TRUE(document->IsDirty());
    SaveTestDocument(*document, path);
    EXPECT_FALSE(document->IsFromOlderVersion());
    EXPECT_FALSE(DocumentController::CheckForOldArchiveVersion(path, nullptr));
    document->ShutDownArchive();

    document = LoadTestDocument(path, nullptr);
    ASSERT_TRUE(document);
    EXPECT_EQ(Describe(*document), before);
    VantraController::GetInstance().EnqueueCommandAndWait(Kernel::MakeCounted<UpgradeDocumentCommand>(), document,
                                                          false);
    EXPECT_FALSE(document->IsDirty()) << "there is nothing left to upgrade";
}
