#include "commands/AddChapterCommand.h"
#include "content/SetMasterIndexCommand.h"
#include "core/BookCollection.h"
#include "core/BookController.h"
#include "framework/document/DocumentController.h"
#include "framework/document/DocumentNode.h"
#include "framework/story/Index.h"
#include "framework/story/IndexTopic.h"
#include "support/BookBuilder.h"

#include <gtest/gtest.h>

#include <algorithm>

namespace Book
{
namespace
{

std::vector<std::string> Topics(Story::Index const & index)
{
    std::vector<std::string> names;
    for (Kernel::JailCounted<Story::IndexTopic> const & topic : index) {
        std::string name = topic->GetNameWithParents().ToStd();
        std::replace(name.begin(), name.end(), Story::IndexTopic::NameSeparator, '!');
        names.push_back(name);
    }
    return names;
}

std::string Guid(Story::Index const & index, String const & name)
{
    Kernel::Counted<Story::IndexTopic const> const topic = index.FindTopicByName(name, false);
    return topic ? topic->GetGUID().ToStd() : "no such topic";
}

/// A chapter's document, loaded and reconciled by the book, for as long as it lives.
class OpenChapter
{
public:
    OpenChapter(Kernel::Counted<BookController> book, int index)
        : m_Book(std::move(book)), m_Chapter(m_Book->GetChapterAtIndex(index)),
          m_Document(m_Book->LoadChapterDocument(m_Chapter, true, false))
    {
    }
    ~OpenChapter()
    {
        m_Document = nullptr;
        m_Book->ReleaseChapterDocument(m_Chapter, false);
        BookBuilder::Rest();
    }

    Story::Index const & Index() const { return *m_Document->GetDocument()->GetIndex(); }

private:
    Kernel::Counted<BookController> m_Book;
    Kernel::Counted<BookChapter const> m_Chapter;
    Kernel::Counted<DocumentController> m_Document;
};

/// Chapters are opened by the tests alone, not by renumbering behind their backs.
class IndexReconciliationTest : public testing::Test
{
protected:
    void SetUp() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false); }
    void TearDown() override { BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true); }
};

TEST_F(IndexReconciliationTest, TheFirstChapterMakesTheMasterAndOthersJoinByName)
{
    BookBuilder builder;
    auto const book = builder.NewBook({builder.WriteChapter("a.kvdoc", {.m_Topics = {"Birds", "Birds!Pigeons"}}),
                                       builder.WriteChapter("b.kvdoc", {.m_Topics = {"Birds", "Dogs"}})});
    std::string birds;
    {
        OpenChapter const a(book, 0);
        birds = Guid(*book->GetMasterIndex(), "Birds");
        EXPECT_EQ(Topics(*book->GetMasterIndex()), (std::vector<std::string>{"Birds", "Birds!Pigeons"}));
        EXPECT_EQ(Guid(a.Index(), "Birds"), birds);
    }
    {
        OpenChapter const b(book, 1);
        EXPECT_EQ(Guid(b.Index(), "Birds"), birds) << "the same topic in both chapters";
        EXPECT_EQ(Topics(b.Index()), (std::vector<std::string>{"Birds", "Dogs", "Birds!Pigeons"})) << "and learns the others";
        EXPECT_EQ(Topics(*book->GetMasterIndex()), (std::vector<std::string>{"Birds", "Birds!Pigeons", "Dogs"}))
            << "what the master did not know is adopted";
    }
    OpenChapter const a(book, 0);
    EXPECT_EQ(Topics(a.Index()), (std::vector<std::string>{"Birds", "Birds!Pigeons", "Dogs"}));
    EXPECT_FALSE(book->IsInIndexUpdate());
}

TEST_F(IndexReconciliationTest, ReconcilingAgainChangesNothing)
{
    BookBuilder builder;
    auto const book = builder.NewBook({builder.WriteChapter("a.kvdoc", {.m_Topics = {"Birds!Pigeons!Fantails"}}),
                                       builder.WriteChapter("b.kvdoc", {.m_Topics = {"Dogs!Hounds"}})});
    for (int round = 0; round < 3; ++round) {
        OpenChapter const a(book, 0);
        OpenChapter const b(book, 1);
    }
    std::size_t const topics = book->GetMasterIndex()->GetTopicCount();
    OpenChapter const a(book, 0);
    OpenChapter const b(book, 1);
    EXPECT_EQ(book->GetMasterIndex()->GetTopicCount(), topics);
    EXPECT_EQ(Topics(a.Index()).size(), topics);
}

TEST_F(IndexReconciliationTest, AMasterWithoutATopicTakesItFromTheChapters)
{
    BookBuilder builder;
    auto const book = builder.NewBook({builder.WriteChapter("a.kvdoc", {.m_Topics = {"Birds", "Dogs"}})});
    {
        OpenChapter const a(book, 0);
    }
    Kernel::Counted<Story::Index> const fewer = book->GetMasterIndex()->CloneAddingGUIDS();
    fewer->RemoveTopics({fewer->FindTopicByName("Dogs", false)});
    BookBuilder::Run(book, Kernel::MakeCounted<SetMasterIndexCommand>(fewer));
    EXPECT_TRUE(book->IsDirty());
    OpenChapter const a(book, 0);
    EXPECT_EQ(Topics(a.Index()), (std::vector<std::string>{"Birds"}));
}

}
}
