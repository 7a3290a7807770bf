#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentController.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/DiskFault.h"
#include "support/Child.h"
#include "support/DocumentBuilder.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class MoveDocumentTest : public testing::Test
{
protected:
    void SetUp() override
    {
        for (String const & path : {m_Old, m_Other}) {
            DocumentBuilder().Paragraph("Text.").BuildFile(path);
        }
    }
    Counted<DocumentController> Open(String const & path)
    {
        m_Failure = MakeCounted<OpenDocumentFailedNotification>(path, true);
        auto const document = m_Application.OpenDocument(path, *m_Failure);
        if (document) {
            m_Open.push_back(document);
        }
        return document;
    }
    DocumentSaveResult SaveAs(Counted<DocumentController> const & document, String const & path)
    {
        DocumentSaveResult result;
        document->AcquireWriterLock();
        document->SaveDocument(result, path);
        document->ReleaseWriterLock();
        return result;
    }
    void TearDown() override
    {
        for (auto const & document : m_Open) {
            m_Application.EnqueueCommandAndWait(Counted<VantraCommand>(
                MakeCounted<CloseDocumentCommand>(document, nullptr, false, false)));
        }
    }

    VantraController & m_Application = VantraController::GetInstance();
    TemporaryFolder const m_Folder;
    String const m_Old = m_Folder / "old.kvdoc";
    String const m_Other = m_Folder / "other.kvdoc";
    String const m_New = m_Folder / "new.kvdoc";
    std::vector<Counted<DocumentController>> m_Open;
    Counted<OpenDocumentFailedNotification> m_Failure;
};

}

TEST_F(MoveDocumentTest, ADocumentThatIsSavedElsewhereIsKnownThere)
{
    auto const document = Open(m_Old);
    ASSERT_TRUE(document);
    ASSERT_TRUE(SaveAs(document, m_New).IsSuccess());
    EXPECT_EQ(document->GetPath(), m_New);
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(m_New), document);
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(m_Old), nullptr);
    EXPECT_TRUE(Open(m_Old)) << "its old file is free for another document";
}

TEST_F(MoveDocumentTest, ThePathOfAnotherOpenDocumentIsRefused)
{
    auto const document = Open(m_Old);
    auto const other = Open(m_Other);
    ASSERT_TRUE(document && other);
    DocumentSaveResult const result = SaveAs(document, m_Other);
    EXPECT_EQ(result.GetResult(), DocumentSaveResult::LockedByOther);
    EXPECT_NE(result.GetText().View().find("other.kvdoc"), std::string_view::npos);
    EXPECT_EQ(document->GetPath(), m_Old);
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(m_Other), other);
}

TEST_F(MoveDocumentTest, AfterASaveElsewhereThatFailsAllIsAsBefore)
{
    auto const document = Open(m_Old);
    ASSERT_TRUE(document);
    {
        Kernel::DiskFaultFromNth const fault(Kernel::DiskOperation::Rename, 1, EACCES);
        EXPECT_EQ(SaveAs(document, m_New).GetResult(), DocumentSaveResult::PermissionDenied);
    }
    EXPECT_EQ(document->GetPath(), m_Old);
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(m_Old), document);
    EXPECT_EQ(m_Application.GetRegisteredDocumentControllerFromPath(m_New), nullptr);
}

TEST_F(MoveDocumentTest, TakingADocumentInFrontThatAnotherProgramReadsWarns)
{
    // The background has it already, sharing its file with another process; now the user takes it.
    Counted<DocumentController> document = MakeCounted<DocumentController>();
    ASSERT_TRUE(m_Application.RegisterLoadingController(m_Old, document));
    auto const failure = MakeCounted<OpenDocumentFailedNotification>(m_Old, false);
    ASSERT_TRUE(document->LoadDocument(m_Old, false, false, LoadWhole, nullptr, *failure, false));
    m_Application.UnregisterLoadingController(m_Old, document);
    m_Application.RegisterBackgroundController(document);
    {
        HoldingChild const other([&] {
            Kernel::Archive::OpenResult result{};
            auto const archive =
                Kernel::Archive::Open(m_Old, Kernel::Archive::OpenMode::Read, DocumentController::FileType, result);
            return [archive] {};
        });
        ASSERT_EQ(Open(m_Old), document);
        ASSERT_EQ(m_Failure->GetWarnings().size(), 1u);
        EXPECT_NE(m_Failure->GetWarnings()[0].View().find("old.kvdoc"), std::string_view::npos);
        document->MarkChanged();
        document->SetMetadata({});
        EXPECT_EQ(SaveAs(document, String()).GetResult(), DocumentSaveResult::LockedByOther);
        EXPECT_TRUE(document->IsDirty());
    }
    EXPECT_TRUE(SaveAs(document, String()).IsSuccess()) << "the other has let go";
    Kernel::Archive::OpenResult result{};
    EXPECT_FALSE(Kernel::Archive::Open(m_Old, Kernel::Archive::OpenMode::Read, DocumentController::FileType, result))
        << "from then on it is the user's alone";
    bool keep = false;
    m_Application.UnregisterBackgroundController(document, keep);
}
