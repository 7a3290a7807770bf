#include "commands/AddChapterCommand.h"
#include "commands/DeleteChaptersCommand.h"
#include "commands/MoveChaptersCommand.h"
#include "commands/ReplaceChapterCommand.h"
#include "commands/SetExportFormatFileExportOptionsCommand.h"
#include "commands/SetKeyChapterCommand.h"
#include "commands/SetStrayHandlingCommand.h"
#include "commands/SetSynchroniseSettingsCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/VantraController.h"
#include "framework/render/FileExportOptions.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

/// A book of four real chapters, with nothing else going on: page numbers do not follow changes by themselves.
class StructureCommandsTest : public testing::Test
{
protected:
    StructureCommandsTest()
    {
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
        for (char const * const name : {"a.kvdoc", "b.kvdoc", "c.kvdoc", "d.kvdoc"}) {
            m_Paths.push_back(m_Builder.WriteChapter(name));
        }
        m_Book = m_Builder.NewBook(m_Paths);
        m_Recorder.Clear();
    }
    ~StructureCommandsTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    void Run(Counted<BookCommand> command) { BookBuilder::Run(m_Book, std::move(command)); }
    [[nodiscard]] Counted<BookChapter const> At(int index) const
    {
        return Counted<BookController const>(m_Book)->GetChapterAtIndex(index);
    }
    [[nodiscard]] std::string Names() const { return BookBuilder::Names(*m_Book); }
    /// The chapter from which the book says that its structure changed; fails the test if it did not say so once.
    [[nodiscard]] Counted<BookChapter const> ChangedFrom()
    {
        auto const changes = m_Recorder.All<BookStructureChangedNotification>();
        EXPECT_EQ(changes.size(), 1u);
        return changes.size() == 1 ? changes[0]->GetChapter() : nullptr;
    }

    BookBuilder m_Builder;
    std::vector<String> m_Paths;
    Counted<BookController> m_Book;
    NotificationRecorder m_Recorder;
};

}

TEST_F(StructureCommandsTest, AddingTellsThatTheBookChangedAndFromWhere)
{
    Run(MakeCounted<AddChapterCommand>(
        std::vector<String>{m_Builder.WriteChapter("x.kvdoc"), m_Builder.WriteChapter("y.kvdoc")}, At(1)));
    EXPECT_EQ(Names(), "a x y b c d");
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification"));
    EXPECT_EQ(ChangedFrom(), At(1));
}

TEST_F(StructureCommandsTest, AddingNothingSaysNothing)
{
    Run(MakeCounted<AddChapterCommand>(std::vector<String>(), nullptr));
    EXPECT_THAT(m_Recorder.BookNames(), IsEmpty());
}

TEST_F(StructureCommandsTest, AddingAFileThatIsThereMovesThePlaceOnAndLeavesNull)
{
    Run(MakeCounted<AddChapterCommand>(std::vector<String>{m_Paths[3], m_Builder.WriteChapter("x.kvdoc")}, At(0)));
    EXPECT_EQ(Names(), "a x b c d") << "one place further down than the count of new chapters says";
    EXPECT_EQ(ChangedFrom(), nullptr);
}

TEST_F(StructureCommandsTest, DeletingTellsWhereTheFirstGapIs)
{
    struct Row
    {
        char const * m_Why;
        std::vector<int> m_Deleted;
        char const * m_ChangedFrom;
    };
    for (Row const & row :
         {Row{"what follows the first run", {0, 1}, "c"}, Row{"only the first run counts", {0, 2}, "b"},
          Row{"the order given leads the walk", {2, 0}, "d"}, Row{"backwards the run ends at once", {1, 0}, "c"},
          Row{"at the end no number changes", {3}, ""}, Row{"nothing is left", {0, 1, 2, 3}, ""}}) {
        Counted<BookController> const book = m_Builder.NewBook(m_Paths);
        m_Recorder.Clear();
        BookController::ConstChapterList deleted;
        for (int const index : row.m_Deleted) {
            deleted.push_back(book->GetChapterAtIndex(index));
        }
        BookBuilder::Run(book, MakeCounted<DeleteChaptersCommand>(deleted));
        if (*row.m_ChangedFrom == '\0') {
            EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification")) << row.m_Why;
        } else {
            EXPECT_THAT(m_Recorder.BookNames(),
                        ElementsAre("BookChangedNotification", "BookStructureChangedNotification"))
                << row.m_Why;
            auto const from = ChangedFrom();
            EXPECT_TRUE(from && from->GetName() == row.m_ChangedFrom) << row.m_Why;
        }
        m_Builder.CloseBook(book);
        m_Recorder.Clear();
    }
}

TEST_F(StructureCommandsTest, MovingTellsFromWhereNumbersMayHaveChanged)
{
    struct Row
    {
        char const * m_Why;
        std::vector<int> m_Moved;
        int m_Before;
        char const * m_Names;
        char const * m_ChangedFrom;
    };
    for (Row const & row : {Row{"towards the front: from the block on", {2, 3}, 1, "a c d b", "c"},
                            Row{"towards the back: from the start", {0}, 3, "b c a d", "b"},
                            Row{"in the order given, not that of the book", {3, 2}, 0, "d c a b", "d"},
                            Row{"in front of one of themselves: to the end", {0, 1}, 1, "c d a b", "c"},
                            Row{"nowhere, and it is told all the same", {1}, 2, "a b c d", "a"},
                            Row{"to the end: from the start", {1}, -1, "a c d b", "a"}}) {
        Counted<BookController> const book = m_Builder.NewBook(m_Paths);
        m_Recorder.Clear();
        BookController::ConstChapterList moved;
        for (int const index : row.m_Moved) {
            moved.push_back(book->GetChapterAtIndex(index));
        }
        BookBuilder::Run(book, MakeCounted<MoveChaptersCommand>(book->GetChapterAtIndex(row.m_Before), moved));
        EXPECT_EQ(BookBuilder::Names(*book), row.m_Names) << row.m_Why;
        EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification"));
        auto const from = ChangedFrom();
        EXPECT_TRUE(from && from->GetName() == row.m_ChangedFrom) << row.m_Why;
        m_Builder.CloseBook(book);
        m_Recorder.Clear();
    }
}

TEST_F(StructureCommandsTest, ReplacingNamesTheNewChapterOrNull)
{
    Counted<BookChapter const> const old = At(1);
    Run(MakeCounted<ReplaceChapterCommand>(old, m_Builder.WriteChapter("x.kvdoc")));
    EXPECT_EQ(Names(), "a x c d");
    EXPECT_EQ(ChangedFrom(), At(1));
    m_Recorder.Clear();
    Run(MakeCounted<ReplaceChapterCommand>(old, m_Builder.WriteChapter("y.kvdoc")));
    EXPECT_EQ(Names(), "a x c d");
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification"));
    EXPECT_EQ(ChangedFrom(), nullptr);
}

TEST_F(StructureCommandsTest, SettingTheKeyTellsOfTheNewAndTheOldOne)
{
    Run(MakeCounted<SetKeyChapterCommand>(At(2)));
    auto changes = m_Recorder.All<ChapterChangedNotification>();
    ASSERT_EQ(changes.size(), 2u);
    EXPECT_THAT(changes[0]->GetChapters(), ElementsAre(At(2)));
    EXPECT_THAT(changes[1]->GetChapters(), ElementsAre(At(0)));
    EXPECT_TRUE(At(2)->IsKey());
    EXPECT_FALSE(At(0)->IsKey());
    m_Recorder.Clear();
    Run(MakeCounted<SetKeyChapterCommand>(At(2)));
    changes = m_Recorder.All<ChapterChangedNotification>();
    ASSERT_EQ(changes.size(), 2u) << "the same chapter is both";
    EXPECT_THAT(changes[1]->GetChapters(), ElementsAre(At(2)));
    EXPECT_TRUE(At(2)->IsKey());
}

TEST_F(StructureCommandsTest, SettingsReachTheBookAndOnlySomeAreTold)
{
    m_Book->SetPath("/books/a.kvbook");
    m_Book->SetIsDirty(false);
    Run(MakeCounted<SetStrayHandlingCommand>(true, false));
    Run(MakeCounted<SetSynchroniseSettingsCommand>(BookController::SynchroniseSettings{false, true, false, true}));
    EXPECT_TRUE(m_Book->IsPadStrays());
    EXPECT_FALSE(m_Book->IsMergeStrays());
    EXPECT_FALSE(m_Book->GetSynchroniseSettings().m_Swatches);
    EXPECT_THAT(m_Recorder.BookNames(), IsEmpty());
    Run(MakeCounted<UpdateChapterSettingsCommand>(At(1), false, 7));
    EXPECT_EQ(At(1)->GetStartFromPage(), 7);
    Run(MakeCounted<UpdateChapterSettingsCommand>(At(1), true, 7));
    EXPECT_EQ(At(1)->GetStartFromPage(), 0);
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("ChapterChangedNotification", "ChapterChangedNotification"));
    EXPECT_FALSE(m_Book->IsDirty());
    m_Recorder.Clear();
    Run(MakeCounted<SetExportFormatFileExportOptionsCommand>(nullptr));
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification"));
    EXPECT_TRUE(m_Book->IsDirty());
}

TEST_F(StructureCommandsTest, OpenDocumentsHearThatTheyGoInAndOut)
{
    VantraController & application = VantraController::GetInstance();
    String const path = m_Builder.WriteChapter("open.kvdoc");
    OpenDocumentFailedNotification failure(path, true);
    auto const document = application.OpenDocument(path, failure);
    ASSERT_TRUE(document) << failure.GetReason();
    m_Recorder.Clear();

    Run(MakeCounted<AddChapterCommand>(path));
    EXPECT_EQ(m_Recorder.BookNames({"ChapterChangedNotification"}),
              (std::vector<std::string>{"BookChangedNotification", "BookStructureChangedNotification",
                                        "BookChapterInclusionChangedNotification"}));
    m_Recorder.Clear();
    Run(MakeCounted<DeleteChaptersCommand>(BookController::ConstChapterList{At(4)}));
    EXPECT_EQ(m_Recorder.BookNames({"ChapterChangedNotification"}),
              (std::vector<std::string>{"BookChangedNotification", "BookChapterInclusionChangedNotification"}));
    auto const inclusions = m_Recorder.All<BookChapterInclusionChangedNotification>();
    ASSERT_EQ(inclusions.size(), 1u);
    EXPECT_THAT(inclusions[0]->GetDocuments(), ElementsAre(Counted<DocumentController const>(document)));
    application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
}

TEST_F(StructureCommandsTest, ChaptersOfNoBookChangeNothingAndAreToldAllTheSame)
{
    Counted<BookChapter const> const stranger = MakeCounted<BookChapter>(String("/elsewhere/x.kvdoc"));
    struct Row
    {
        char const * m_Why;
        Counted<BookCommand> m_Command;
        std::vector<std::string> m_Told;
    };
    using Chapters = std::vector<Counted<BookChapter const>>;
    std::vector<std::string> const changed{"BookChangedNotification", "BookStructureChangedNotification"};
    for (Row const & row :
         {Row{"moved with one of the book", MakeCounted<MoveChaptersCommand>(nullptr, Chapters{At(0), stranger}), changed},
          Row{"nothing moved", MakeCounted<MoveChaptersCommand>(At(2), Chapters{}), changed},
          Row{"deleted", MakeCounted<DeleteChaptersCommand>(Chapters{stranger, nullptr}), {"BookChangedNotification"}},
          Row{"made key: the old one loses the flag", MakeCounted<SetKeyChapterCommand>(stranger),
              {"ChapterChangedNotification", "ChapterChangedNotification"}},
          Row{"settings", MakeCounted<UpdateChapterSettingsCommand>(stranger, false, 9), {"ChapterChangedNotification"}}}) {
        m_Recorder.Clear();
        Run(row.m_Command);
        EXPECT_EQ(Names(), "a b c d") << row.m_Why;
        EXPECT_EQ(m_Recorder.BookNames(), row.m_Told) << row.m_Why;
    }
    EXPECT_EQ(stranger->GetStartFromPage(), 0);
    EXPECT_FALSE(At(0)->IsKey());
    EXPECT_FALSE(stranger->IsKey());
}

TEST_F(StructureCommandsTest, OpenDocumentsAreToldLastThatTheyCameOrWent)
{
    String const path = m_Builder.WriteChapter("x.kvdoc");
    OpenDocumentFailedNotification failure(path, true);
    Counted<DocumentController const> const document = VantraController::GetInstance().OpenDocument(path, failure);
    ASSERT_TRUE(document) << failure.GetReason();
    auto const told = [&] {
        auto const changes = m_Recorder.All<BookChapterInclusionChangedNotification>();
        return changes.size() == 1 ? changes[0]->GetDocuments() : std::vector<Counted<DocumentController const>>();
    };
    m_Recorder.Clear();
    Run(MakeCounted<AddChapterCommand>(std::vector<String>{path}, At(1)));
    // The add itself broadcasts when its last file is in, which is before the command has its say.
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification",
                                                    "BookChapterInclusionChangedNotification"));
    EXPECT_THAT(told(), ElementsAre(document));
    m_Recorder.Clear();
    Run(MakeCounted<DeleteChaptersCommand>(std::vector<Counted<BookChapter const>>{At(1)}));
    EXPECT_THAT(m_Recorder.BookNames(), ElementsAre("BookChangedNotification", "BookStructureChangedNotification",
                                                    "BookChapterInclusionChangedNotification"));
    EXPECT_THAT(told(), ElementsAre(document));
    VantraController::GetInstance().EnqueueCommandAndWait(
        MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
}
