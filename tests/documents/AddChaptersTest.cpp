#include "commands/AddChapterCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Archive.h"
#include "framework/kernel/ArchiveSession.h"
#include "framework/kernel/FileStoreCompressionHint.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

/// Writes a document file again as an earlier program would have: with a lower version of its content.
void MakeOlder(String const & path)
{
    std::vector<std::pair<String, Counted<Kernel::RawData const>>> items;
    {
        auto opened = Kernel::Archive::OpenResult::Success;
        auto const archive =
            Kernel::Archive::Open(path, Kernel::Archive::OpenMode::ReadUnlocked, DocumentController::FileType, opened);
        ASSERT_TRUE(archive);
        for (String const & name : archive->GetItemNames()) {
            items.emplace_back(name, archive->ReadItem(name));
        }
    }
    Kernel::Archive::CreateResult created;
    auto const archive = Kernel::Archive::CreateWithTemporary(path, DocumentController::FileType, created);
    ASSERT_TRUE(archive) << created.m_Text;
    Kernel::ArchiveSessionHandle session;
    ASSERT_EQ(archive->CreateSessionAdv(session, Kernel::Archive::SessionType::Whole, nullptr, false),
              Kernel::Archive::SessionResult::Success);
    Kernel::FileStoreCompressionHintGeneral const hint(
        Kernel::FileStoreCompressionHintGeneral::CompressionLevel::Stored, Kernel::CompressionPredictorType::None, 0);
    for (auto const & [name, data] : items) {
        auto const copy =
            MakeCounted<Kernel::RawData>(Kernel::RawData::Bytes(data->GetSpan().begin(), data->GetSpan().end()));
        if (name == "doc.dat") {
            copy->GetMutableData()[6] = DocumentController::FormatVersion - 1;
            copy->GetMutableData()[7] = 0;
        }
        session->SaveBytes(name, hint, copy);
    }
    archive->CloseSession(session, false);
    ASSERT_TRUE(DocumentController::CheckForOldArchiveVersion(path, nullptr));
}

class AddChaptersTest : public testing::Test
{
protected:
    AddChaptersTest()
    {
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc")});
        m_Recorder.Clear();
    }
    ~AddChaptersTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    /// Adds x, an old file, and y, in front of b, and gives the question that this leads to.
    Counted<DocumentPromptNotification const> AddOldBetween()
    {
        String const old = m_Builder.WriteChapter("old.kvdoc");
        MakeOlder(old);
        BookBuilder::Run(m_Book,
                         MakeCounted<AddChapterCommand>(std::vector<String>{m_Builder.WriteChapter("x.kvdoc"), old,
                                                                            m_Builder.WriteChapter("y.kvdoc")},
                                                        Counted<BookChapter const>(m_Book->GetChapterAtIndex(1))));
        auto const prompts = m_Recorder.All<DocumentPromptNotification const>();
        EXPECT_EQ(prompts.size(), 1u);
        EXPECT_EQ(Names(), "a x b") << "the add waits at the question";
        EXPECT_TRUE(m_Recorder.BookNames().empty());
        return prompts.size() == 1 ? prompts[0] : nullptr;
    }
    [[nodiscard]] std::string Names() const { return BookBuilder::Names(*m_Book); }

    BookBuilder m_Builder;
    Counted<BookController> m_Book;
    NotificationRecorder m_Recorder;
};

}

TEST_F(AddChaptersTest, TheQuestionNamesTheFile)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    EXPECT_EQ(prompt->GetTitle(), "Old document version");
    EXPECT_EQ(prompt->GetMessage(),
              "The document old.kvdoc is from an older version of Korvane. Adding it to a book will result in the file "
              "being modified and no longer usable in the previous version.\nAre you sure you wish to add it?");
    EXPECT_EQ(prompt->GetChoices(), PromptCancel | PromptYes | PromptNo);
    EXPECT_EQ(prompt->GetDomainController(), Counted<DomainController const>(m_Book));
    prompt->Answer(PromptNo);
    BookBuilder::Rest();
}

TEST_F(AddChaptersTest, YesTakesTheOldFileToTheEndAndGoesOn)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    EXPECT_TRUE(prompt->Answer(PromptYes));
    EXPECT_FALSE(prompt->Answer(PromptCancel)) << "the first answer counts";
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a x y b old");
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification"));
    EXPECT_EQ(m_Recorder.All<BookStructureChangedNotification>()[0]->GetChapter()->GetName(), "x");
}

TEST_F(AddChaptersTest, NoPassesTheOldFileOver)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    prompt->Answer(PromptNo);
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a x y b");
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification"));
}

TEST_F(AddChaptersTest, CancelTakesOutWhatWentInWithoutAWord)
{
    m_Book->SetIsDirty(false);
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    prompt->Answer(PromptCancel);
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a b");
    EXPECT_TRUE(m_Recorder.BookNames().empty());
    EXPECT_TRUE(m_Book->IsDirty());
}

TEST_F(AddChaptersTest, AFileThatCannotBeOpenedIsAddedAllTheSame)
{
    BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(m_Builder.GetFolder().WriteFile("x.kvdoc", "damaged")));
    EXPECT_EQ(Names(), "a b x");
    EXPECT_EQ(m_Book->GetChapterAtIndex(2)->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(m_Book->GetChapterAtIndex(2)->DescribePages(), "");
}
