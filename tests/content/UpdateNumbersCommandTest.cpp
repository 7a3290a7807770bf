#include "content/UpdateNumbersCommand.h"

#include "commands/MoveChaptersCommand.h"
#include "commands/SetStrayHandlingCommand.h"
#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "core/BookNotification.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentControllerSession.h"
#include "framework/document/DocumentNode.h"
#include "framework/kernel/FileSystem.h"
#include "support/BookBuilder.h"
#include "support/NotificationRecorder.h"

#include <gtest/gtest.h>

#include <cstdio>

namespace Book
{
namespace
{

using Chapters = std::vector<Kernel::Counted<BookChapter const>>;

/// The pages texts of all chapters, as the chapter list shows them.
std::vector<std::string> Pages(BookController const & book)
{
    std::vector<std::string> pages;
    Chapters chapters;
    book.GetChapters(chapters);
    for (Kernel::Counted<BookChapter const> const & chapter : chapters) {
        pages.push_back(chapter->DescribePages().ToStd());
    }
    return pages;
}

class UpdateNumbersCommandTest : public testing::Test
{
protected:
    void SetUp() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    void TearDown() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }

    String Chapter(std::string const & name, int pages) { return m_Builder.WriteChapter(name, {.m_Pages = pages}); }

    static void Update(Kernel::Counted<BookController> const & book, Chapters const & chapters)
    {
        BookBuilder::Run(book, Kernel::MakeCounted<UpdateNumbersCommand>(chapters, true, false, false));
    }
    static void UpdateAll(Kernel::Counted<BookController> const & book)
    {
        Chapters chapters;
        book->GetChapters(chapters);
        Update(book, chapters);
    }

    BookBuilder m_Builder;
};

TEST_F(UpdateNumbersCommandTest, NumbersRunOnFromChapterToChapterAndLandInTheFiles)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 4), Chapter("b.kvdoc", 2), Chapter("c.kvdoc", 3)});
    UpdateAll(book);
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"1 - 4", "5 - 6", "7 - 9"}));
    EXPECT_EQ(book->GetChapterAtIndex(2)->GetCachedStartPage(), 7);
    EXPECT_FALSE(book->IsInNumberUpdate());

    // A book that looks at the files afresh reads the same.
    auto const other = m_Builder.NewBook({book->GetChapterAtIndex(1)->GetPath()});
    EXPECT_EQ(Pages(*other), (std::vector<std::string>{"5 - 6"}));
}

TEST_F(UpdateNumbersCommandTest, AChapterThatIsInStepIsNotWritten)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 4), Chapter("b.kvdoc", 2)});
    UpdateAll(book);
    Kernel::TimeStamp before;
    Kernel::TimeStamp after;
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(book->GetChapterAtIndex(1)->GetPath(), before));
    UpdateAll(book);
    ASSERT_TRUE(Kernel::FileSystem::GetModifiedTime(book->GetChapterAtIndex(1)->GetPath(), after));
    EXPECT_EQ(before, after);
}

TEST_F(UpdateNumbersCommandTest, OnlyTheChapterBeforeAChangedRunIsRead)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 4), Chapter("b.kvdoc", 2), Chapter("c.kvdoc", 3)});
    UpdateAll(book);
    // With chapter a gone, chapter b's own sections still say where c starts.
    std::remove(book->GetChapterAtIndex(0)->GetPath().c_str());
    Update(book, {book->GetChapterAtIndex(2)});
    EXPECT_EQ(Pages(*book)[2], "7 - 9");
    EXPECT_EQ(book->GetChapterAtIndex(0)->GetStatus(), BookChapter::Status::Ok) << "nobody opened it";
}

TEST_F(UpdateNumbersCommandTest, AFixedStartIsTakenAsItStandsAndAMissingChapterDoesNotCount)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 4), Chapter("b.kvdoc", 2), Chapter("c.kvdoc", 3)});
    BookBuilder::Run(book, Kernel::MakeCounted<UpdateChapterSettingsCommand>(book->GetChapterAtIndex(1), false, 21));
    UpdateAll(book);
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"1 - 4", "21 - 22", "23 - 25"}));

    std::remove(book->GetChapterAtIndex(1)->GetPath().c_str());
    UpdateAll(book);
    EXPECT_EQ(Pages(*book)[2], "21 - 23") << "the chapter behind goes on from the number that the lost one was to have";
    EXPECT_EQ(book->GetChapterAtIndex(1)->GetStatus(), BookChapter::Status::NotFound);
    UpdateAll(book);
    EXPECT_EQ(Pages(*book)[2], "5 - 7") << "a chapter known to be lost is passed by";
}

TEST_F(UpdateNumbersCommandTest, FormsAndPrefixesStayWhileTheNumbersRunOn)
{
    DocumentSection::Values roman;
    roman.m_Format = PageNumberFormat::RomanLower;
    DocumentSection::Values prefixed;
    prefixed.m_Prefix = "A-";
    DocumentSection::Values capital;
    capital.m_Format = PageNumberFormat::RomanUpper;
    capital.m_Prefix = "(";
    DocumentSection::Values hidden;
    hidden.m_IncludeOnExport = false;
    auto const book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", {.m_Pages = 8, .m_Section = roman}),
                                         m_Builder.WriteChapter("b.kvdoc", {.m_Pages = 2, .m_Section = prefixed}),
                                         m_Builder.WriteChapter("c.kvdoc", {.m_Pages = 30, .m_Section = capital}),
                                         m_Builder.WriteChapter("d.kvdoc", {.m_Pages = 3, .m_Section = hidden}),
                                         m_Builder.WriteChapter("e.kvdoc", {.m_Pages = 1})});
    // A section with settings of its own fixes its chapter's start when the chapter is added.
    EXPECT_EQ(BookBuilder::Starts(*book), "1 1 1 1 0");
    for (int const index : {1, 2, 3}) {
        BookBuilder::Run(book, Kernel::MakeCounted<UpdateChapterSettingsCommand>(book->GetChapterAtIndex(index), true, 0));
    }
    UpdateAll(book);
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"i - viii", "A-9 - A-10", "(XI - (XL", "1 - 3", "42 - 42"}))
        << "a chapter of which nothing goes out keeps its own numbers, and costs one";
}

TEST_F(UpdateNumbersCommandTest, StraysThatAreNotMergedCostTheirBlanks)
{
    // Two pages end on a left-hand page; the next chapter begins on a right-hand one.
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 2), Chapter("b.kvdoc", 1)});
    UpdateAll(book);
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"1 - 2", "3 - 3"}));
    BookBuilder::Run(book, Kernel::MakeCounted<SetStrayHandlingCommand>(true, false));
    UpdateAll(book);
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"1 - 2", "5 - 5"}));
}

TEST_F(UpdateNumbersCommandTest, TellsOfEveryGivenChapterAndThenOfTheBook)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 1), Chapter("b.kvdoc", 1)});
    BookBuilder::Rest();
    NotificationRecorder recorder;
    Update(book, {book->GetChapterAtIndex(1), book->GetChapterAtIndex(0)});
    auto const told = recorder.All<ChapterChangedNotification>();
    ASSERT_EQ(told.size(), 2u);
    EXPECT_EQ(told[0]->GetChapters().front(), book->GetChapterAtIndex(1)) << "in the order given";
    EXPECT_EQ(recorder.BookNames().back(), "BookChangedNotification");
}

TEST_F(UpdateNumbersCommandTest, AutomaticUpdatesFollowAMoveAndStopWithTheSwitch)
{
    auto const book = m_Builder.NewBook({Chapter("a.kvdoc", 4), Chapter("b.kvdoc", 2)});
    UpdateAll(book);
    auto const swap = [&] {
        BookBuilder::Run(book, Kernel::MakeCounted<MoveChaptersCommand>(book->GetChapterAtIndex(0),
                                                                        Chapters{book->GetChapterAtIndex(1)}));
        BookBuilder::Rest();
    };
    swap();
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"5 - 6", "1 - 4"})) << "not by itself while the switch is off";
    BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true);
    swap();
    EXPECT_EQ(Pages(*book), (std::vector<std::string>{"1 - 4", "5 - 6"}));
}

}
}
