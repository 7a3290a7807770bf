#include "commands/DeleteChaptersCommand.h"
#include "commands/SaveBookAsCommand.h"
#include "core/BookCollection.h"
#include "core/ChapterFileNotifications.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/FileSystem.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/OrdinaryUser.h"

#include <filesystem>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

namespace fs = std::filesystem;

/// A book of a, b and c in the folder "old/book" that has been saved and closed, so that its files can be moved.
class MissingChaptersTest : public testing::Test
{
protected:
    using Prompt = PromptMissingChapterFileNotification const;
    using Dialogue = LocateMissingChapterFileNotification const;
    using Permission = PromptFixBookPermissionsNotification const;

    MissingChaptersTest()
    {
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
        fs::create_directories(Path("old/book").ToStd());
        auto const book = m_Builder.NewBook({m_Builder.WriteChapter("old/book/a.kvdoc"),
                                             m_Builder.WriteChapter("old/book/b.kvdoc"),
                                             m_Builder.WriteChapter("old/book/c.kvdoc")});
        BookBuilder::Run(book, MakeCounted<SaveBookAsCommand>(Path("book.kvbook"), false));
        m_Builder.CloseBook(book);
        BookBuilder::Rest();
    }
    ~MissingChaptersTest() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    [[nodiscard]] String Path(std::string_view name) const { return m_Builder.GetFolder() / name; }
    void Move(std::string_view from, std::string_view to) const
    {
        fs::create_directories(fs::path(Path(to).ToStd()).parent_path());
        fs::rename(Path(from).ToStd(), Path(to).ToStd());
    }
    void Open()
    {
        m_Recorder.Clear();
        m_Book = m_Builder.LoadBook(Path("book.kvbook"));
        ASSERT_TRUE(m_Book);
    }
    template <typename T>
    Counted<T> Last()
    {
        auto const all = m_Recorder.All<T>();
        return all.empty() ? nullptr : all.back();
    }
    /// Says yes to the last question and names a file in the dialogue that follows.
    void Locate(std::string_view asked, String const & answer)
    {
        auto const prompt = Last<Prompt>();
        ASSERT_TRUE(prompt);
        ASSERT_TRUE(prompt->Answer(PromptYes)) << "the question was answered before";
        auto const dialogue = Last<Dialogue>();
        ASSERT_TRUE(dialogue);
        EXPECT_EQ(dialogue->GetCurrentPath(), Path(asked));
        dialogue->ProcessResponse(answer);
        BookBuilder::Rest();
    }
    /// The chapters' paths within the test's folder.
    [[nodiscard]] std::vector<std::string> Paths() const
    {
        std::vector<std::string> paths;
        BookController::ConstChapterList chapters;
        m_Book->GetChapters(chapters);
        for (auto const & chapter : chapters) {
            paths.push_back(fs::relative(chapter->GetPath().ToStd(), m_Builder.GetFolder().GetPath().ToStd()).string());
        }
        return paths;
    }
    [[nodiscard]] std::size_t Asked() { return m_Recorder.All<Prompt>().size(); }

    BookBuilder m_Builder;
    Counted<BookController> m_Book;
    NotificationRecorder m_Recorder;
};

using ForbiddenChaptersTest = MissingChaptersTest;

}

TEST_F(MissingChaptersTest, OneAnswerFindsAllThatTheSameMoveExplains)
{
    Move("old/book", "new/place/book");
    Open();
    Locate("old/book/a.kvdoc", Path("new/place/book/a.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("new/place/book/a.kvdoc", "new/place/book/b.kvdoc", "new/place/book/c.kvdoc"));
    EXPECT_EQ(Asked(), 1u) << "nothing is left to ask";
    EXPECT_EQ(m_Recorder.All<ChapterChangedNotification const>().size(), 3u);
    EXPECT_EQ(m_Book->GetChapterAtIndex(2)->GetPageCount(), 1) << "what was found has been looked at";
}

TEST_F(MissingChaptersTest, AChapterThatTheMoveDoesNotExplainIsAskedForNext)
{
    Move("old/book", "new/book");
    Move("new/book/b.kvdoc", "elsewhere/kept/b.kvdoc");
    Open();
    Locate("old/book/a.kvdoc", Path("new/book/a.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("new/book/a.kvdoc", "old/book/b.kvdoc", "new/book/c.kvdoc"));
    EXPECT_EQ(Asked(), 2u);
    Locate("old/book/b.kvdoc", Path("elsewhere/kept/b.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("new/book/a.kvdoc", "elsewhere/kept/b.kvdoc", "new/book/c.kvdoc"));
    EXPECT_EQ(Asked(), 2u);
}

TEST_F(MissingChaptersTest, TheFileOfTheOldNameCountsInTheFolderThatWasChosen)
{
    Move("old/book/a.kvdoc", "new/a.kvdoc");
    m_Builder.WriteChapter("new/a-copy.kvdoc");
    Open();
    Locate("old/book/a.kvdoc", Path("new/a-copy.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("new/a.kvdoc", "old/book/b.kvdoc", "old/book/c.kvdoc"));
}

TEST_F(MissingChaptersTest, ARenamedFileIsTakenAsItIs)
{
    Move("old/book/a.kvdoc", "old/book/renamed.kvdoc");
    Open();
    Locate("old/book/a.kvdoc", Path("old/book/renamed.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("old/book/renamed.kvdoc", "old/book/b.kvdoc", "old/book/c.kvdoc"));
}

TEST_F(MissingChaptersTest, ADialogueWithoutAnAnswerBringsTheQuestionBackUntilNo)
{
    Move("old/book/b.kvdoc", "new/b.kvdoc");
    Open();
    Locate("old/book/b.kvdoc", String());
    EXPECT_EQ(Asked(), 2u);
    auto const prompt = Last<Prompt>();
    EXPECT_TRUE(prompt->Answer(PromptNo));
    EXPECT_FALSE(prompt->Answer(PromptYes)) << "answered already";
    BookBuilder::Rest();
    EXPECT_EQ(Asked(), 2u);
    EXPECT_EQ(m_Recorder.All<Dialogue>().size(), 1u);
    EXPECT_THAT(Paths(), ElementsAre("old/book/a.kvdoc", "old/book/b.kvdoc", "old/book/c.kvdoc"));
}

TEST_F(MissingChaptersTest, AnAnswerTwiceOrAfterTheBookHasClosedChangesNothing)
{
    Move("old/book", "new/book");
    Open();
    ASSERT_TRUE(Last<Prompt>()->Answer(PromptYes));
    auto const dialogue = Last<Dialogue>();
    ASSERT_TRUE(dialogue);
    m_Builder.CloseBook(m_Book);
    BookBuilder::Rest();
    dialogue->ProcessResponse(Path("new/book/a.kvdoc"));
    BookBuilder::Rest();
    EXPECT_EQ(Paths().front(), "old/book/a.kvdoc");

    Open();
    ASSERT_TRUE(Last<Prompt>()->Answer(PromptYes));
    auto const again = Last<Dialogue>();
    ASSERT_TRUE(again);
    again->ProcessResponse(Path("new/book/a.kvdoc"));
    again->ProcessResponse(Path("new/book/b.kvdoc"));
    BookBuilder::Rest();
    EXPECT_THAT(Paths(), ElementsAre("new/book/a.kvdoc", "new/book/b.kvdoc", "new/book/c.kvdoc"));
}

TEST_F(MissingChaptersTest, AChoiceIsAnAnswerLikeAnyOther)
{
    Move("old/book/b.kvdoc", "new/b.kvdoc");
    Open();
    auto const prompt = Last<Prompt>();
    ASSERT_TRUE(prompt);
    prompt->ProcessChoice(PromptYes);
    BookBuilder::Rest();
    EXPECT_EQ(m_Recorder.All<Dialogue>().size(), 1u);
    EXPECT_FALSE(prompt->Answer(PromptNo)) << "it was the answer";
    prompt->ProcessChoice(PromptYes);
    BookBuilder::Rest();
    EXPECT_EQ(m_Recorder.All<Dialogue>().size(), 1u) << "nothing is asked twice";
}

TEST_F(MissingChaptersTest, NoQuestionIsAboutAChapterThatHasLeft)
{
    Move("old/book/a.kvdoc", "new/a.kvdoc");
    Move("old/book/b.kvdoc", "new/b.kvdoc");
    Open();
    ASSERT_TRUE(Last<Prompt>()->Answer(PromptYes));
    auto const dialogue = Last<Dialogue>();
    ASSERT_TRUE(dialogue);
    BookBuilder::Run(m_Book, MakeCounted<DeleteChaptersCommand>(BookController::ConstChapterList{
                                 m_Book->GetChapterAtIndex(0), m_Book->GetChapterAtIndex(1)}));
    dialogue->ProcessResponse(String());
    BookBuilder::Rest();
    EXPECT_EQ(Asked(), 1u) << "both missing chapters have gone";
}

TEST_F(MissingChaptersTest, AFileThatIsThereAndDoesNotOpenLeadsToNoDialogue)
{
    fs::remove(Path("old/book/b.kvdoc").ToStd());
    fs::create_directory(Path("old/book/b.kvdoc").ToStd());
    Open();
    ASSERT_EQ(Asked(), 1u);
    Last<Prompt>()->Answer(PromptYes);
    BookBuilder::Rest();
    EXPECT_TRUE(m_Recorder.All<Dialogue>().empty());
}

TEST_F(ForbiddenChaptersTest, TheQuestionOfPermissionNamesTheLastAndAfterARetryTheFirst)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    for (char const * const name : {"old/book/a.kvdoc", "old/book/b.kvdoc", "old/book/c.kvdoc"}) {
        fs::permissions(Path(name).ToStd(), fs::perms::none);
    }
    Open();
    auto question = Last<Permission>();
    ASSERT_TRUE(question);
    EXPECT_EQ(Asked(), 0u) << "asking where it is would lead nowhere";
    EXPECT_EQ(question->GetChapterPath(), Path("old/book/c.kvdoc"));
    question->Retry(false);
    EXPECT_EQ(Last<Permission>()->GetChapterPath(), Path("old/book/a.kvdoc"));

    // The user has changed the mode of one file; the others are still shut.
    fs::permissions(Path("old/book/a.kvdoc").ToStd(), fs::perms::owner_read);
    Last<Permission>()->Retry(false);
    EXPECT_EQ(Last<Permission>()->GetChapterPath(), Path("old/book/b.kvdoc"));
    EXPECT_EQ(m_Book->GetChapterAtIndex(0)->GetPageCount(), 1) << "it has been looked at";
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetPageCount(), 0);

    Last<Permission>()->Ignore();
    EXPECT_EQ(Last<Permission>()->GetChapterPath(), Path("old/book/c.kvdoc"));
    std::size_t const permissions = m_Recorder.All<Permission>().size();
    Last<Permission>()->IgnoreAll();
    BookBuilder::Rest();
    EXPECT_EQ(m_Recorder.All<Permission>().size(), permissions);
    EXPECT_EQ(Asked(), 1u) << "what is left is asked for like any other missing file";
    Last<Prompt>()->Answer(PromptNo);
    BookBuilder::Rest();
}

TEST_F(ForbiddenChaptersTest, WithoutAnybodyToGrantItTheyAreMissingLikeOthers)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    fs::permissions(Path("old/book/b.kvdoc").ToStd(), fs::perms::none);
    VantraController::GetInstance().SetCanAskForFilePermission(false);
    Open();
    EXPECT_EQ(Asked(), 1u);
    EXPECT_TRUE(m_Recorder.All<Permission>().empty());
    VantraController::GetInstance().SetCanAskForFilePermission(true);
    Last<Prompt>()->Answer(PromptNo);
    BookBuilder::Rest();
}

TEST_F(ForbiddenChaptersTest, AForbiddenChapterThatHasLeftIsNotAskedAbout)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    fs::permissions(Path("old/book/a.kvdoc").ToStd(), fs::perms::none);
    Move("old/book/b.kvdoc", "new/b.kvdoc");
    Open();
    auto const question = Last<Permission>();
    ASSERT_TRUE(question);
    BookBuilder::Run(m_Book,
                     MakeCounted<DeleteChaptersCommand>(BookController::ConstChapterList{m_Book->GetChapterAtIndex(0)}));
    question->Ignore();
    BookBuilder::Rest();
    EXPECT_EQ(m_Recorder.All<Permission>().size(), 1u);
    EXPECT_EQ(Asked(), 1u) << "b is missing still";
    Last<Prompt>()->Answer(PromptNo);
    BookBuilder::Rest();
}

TEST_F(ForbiddenChaptersTest, AChapterThatMovedToAShutPlaceIsAskedAboutThere)
{
    if (RanAsOrdinaryUser()) {
        return;
    }
    Move("old/book", "new/book");
    fs::permissions(Path("new/book/b.kvdoc").ToStd(), fs::perms::none);
    Open();
    Locate("old/book/a.kvdoc", Path("new/book/a.kvdoc"));
    ASSERT_TRUE(Last<Permission>());
    EXPECT_EQ(Last<Permission>()->GetChapterPath(), Path("new/book/b.kvdoc"));
    EXPECT_THAT(Paths(), ElementsAre("new/book/a.kvdoc", "new/book/b.kvdoc", "new/book/c.kvdoc"));
    fs::permissions(Path("new/book/b.kvdoc").ToStd(), fs::perms::owner_read);
    Last<Permission>()->Retry(false);
    BookBuilder::Rest();
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::Ok);
    EXPECT_EQ(m_Book->GetChapterAtIndex(1)->GetPageCount(), 1);
}
