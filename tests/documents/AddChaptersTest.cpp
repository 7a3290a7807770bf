#include "commands/AddChapterCommand.h"
#include "commands/DeleteChaptersCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/document/VantraController.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/OldDocument.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <set>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

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
        String const old = WriteOldDocument(m_Builder.GetFolder(), "old.kvdoc");
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
    /// The book's chapters but for those of these names.
    [[nodiscard]] BookController::ConstChapterList OthersThan(std::set<std::string> const & names) const
    {
        BookController::ConstChapterList chapters;
        m_Book->GetChapters(chapters);
        std::erase_if(chapters, [&](auto const & chapter) { return names.contains(chapter->GetName().ToStd()); });
        return chapters;
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

    Counted<BookChapter const> const old = m_Book->GetChapterAtIndex(4);
    EXPECT_FALSE(DocumentController::CheckForOldArchiveVersion(old->GetPath(), nullptr))
        << "what the user agreed to has been done";
    EXPECT_EQ(old->GetStatus(), BookChapter::Status::Ok);
    EXPECT_FALSE(old->WouldUpdateTimeStamp());
    EXPECT_EQ(old->GetPageCount(), 4);
}

TEST_F(AddChaptersTest, NoPassesTheOldFileOver)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    prompt->Answer(PromptNo);
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a x y b");
    EXPECT_TRUE(DocumentController::CheckForOldArchiveVersion(m_Builder.GetFolder() / "old.kvdoc", nullptr));
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

TEST_F(AddChaptersTest, AQuestionThatOutlivesItsBookTakesBackWhatWentIn)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    m_Builder.CloseBook(m_Book);
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a b") << "nobody answered, which is as good as a cancel";
    EXPECT_FALSE(prompt->Answer(PromptYes)) << "too late";
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a b");
}

TEST_F(AddChaptersTest, ASecondAddTakesThePlaceOfWhatStillWaited)
{
    auto const prompt = AddOldBetween();
    ASSERT_TRUE(prompt);
    BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(m_Builder.WriteChapter("z.kvdoc")));
    EXPECT_EQ(Names(), "a x b z");
    prompt->Answer(PromptYes);
    BookBuilder::Rest();
    EXPECT_EQ(Names(), "a x b z old") << "y was still to come when the second add began";
}

TEST_F(AddChaptersTest, FilesThatAreInTheBookAlreadyMoveThePlaceOfTheNextOne)
{
    struct Row
    {
        char const * m_Why;
        std::vector<char const *> m_Files;
        int m_Before;
        char const * m_Names;
        char const * m_FirstTold;
    };
    for (Row const & row : {Row{"in their order, in front of the second", {"n1", "n2", "n3"}, 1, "a n1 n2 n3 b", "n1"},
                            Row{"a is passed over, and n goes one place on", {"a", "n"}, 0, "a n b", nullptr},
                            Row{"the place has run past the end", {"a", "b", "n"}, 1, "a b n", nullptr},
                            Row{"nothing new is told of all the same", {"a"}, -1, "a b", nullptr}}) {
        std::vector<String> paths;
        for (char const * const file : row.m_Files) {
            std::string const name = std::string(file) + ".kvdoc";
            paths.push_back(m_Book->ContainsChapter(m_Builder.GetFolder() / name) ? m_Builder.GetFolder() / name
                                                                                  : m_Builder.WriteChapter(name));
        }
        m_Recorder.Clear();
        BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(
                                     paths, row.m_Before < 0
                                                ? nullptr
                                                : Counted<BookChapter const>(m_Book->GetChapterAtIndex(row.m_Before))));
        EXPECT_EQ(Names(), row.m_Names) << row.m_Why;
        auto const told = m_Recorder.All<BookStructureChangedNotification>();
        ASSERT_EQ(told.size(), 1u) << row.m_Why;
        EXPECT_EQ(told[0]->GetChapter() ? told[0]->GetChapter()->GetName() : String("none"),
                  row.m_FirstTold ? row.m_FirstTold : "none")
            << row.m_Why;
        BookBuilder::Run(m_Book, MakeCounted<DeleteChaptersCommand>(OthersThan({"a", "b"})));
    }
    m_Recorder.Clear();
    BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(std::vector<String>(), nullptr));
    EXPECT_TRUE(m_Recorder.BookNames().empty()) << "an empty list is no add";
}

TEST_F(AddChaptersTest, AFileThatCannotBeOpenedIsAddedAllTheSame)
{
    BookBuilder::Run(m_Book, MakeCounted<AddChapterCommand>(m_Builder.GetFolder().WriteFile("x.kvdoc", "damaged")));
    EXPECT_EQ(Names(), "a b x");
    EXPECT_EQ(m_Book->GetChapterAtIndex(2)->GetStatus(), BookChapter::Status::NotFound);
    EXPECT_EQ(m_Book->GetChapterAtIndex(2)->DescribePages(), "");
}
