#include "commands/UpdateChapterSettingsCommand.h"
#include "core/BookCollection.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/AnchorVisitor.h"
#include "framework/document/Anchors.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/TurnSession.h"
#include "framework/story/AnchorData.h"
#include "support/BookBuilder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;
using testing::ElementsAre;

namespace
{

/// What the document framework is told about a chapter, and about a document that is none.
class BookSinkTest : public testing::Test
{
protected:
    BookSinkTest()
    {
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(false);
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc", {.m_Anchors = {"one", "two"}}),
                                    m_Builder.WriteChapter("b.kvdoc", {.m_Anchors = {"three"}})});
        m_Chapter = Open(m_Book->GetChapterAtIndex(1)->GetPath());
        m_Stranger = Open(m_Builder.WriteChapter("stranger.kvdoc", {.m_Anchors = {"four"}}));
        // Anchors get their identity when the book first opens the chapter for good.
        Counted<BookChapter const> const first = m_Book->GetChapterAtIndex(0);
        static_cast<void>(m_Book->LoadChapterDocument(first, true, false));
        m_Book->ReleaseChapterDocument(first, true);
        BookBuilder::Rest();
    }
    ~BookSinkTest() override
    {
        for (auto const & document : {m_Chapter, m_Stranger}) {
            VantraController::GetInstance().EnqueueCommandAndWait(
                MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        }
        BookCollection::GetInstance().SetUpdatePageNumbersAutomatically(true);
    }
    static Counted<DocumentController const> Open(String const & path)
    {
        OpenDocumentFailedNotification failure(path, true);
        Counted<DocumentController const> const document = VantraController::GetInstance().OpenDocument(path, failure);
        EXPECT_TRUE(document) << failure.GetReason();
        BookBuilder::Rest();
        return document;
    }
    [[nodiscard]] String Uid(int chapter, std::size_t anchor) const
    {
        auto const anchors = m_Book->GetChapterAtIndex(chapter)->GetAnchors();
        EXPECT_GT(anchors.size(), anchor);
        return anchors.size() > anchor ? anchors[anchor].m_Uid : String();
    }

    BookSink & m_Sink = BookCollection::GetInstance();
    BookBuilder m_Builder;
    Counted<BookController> m_Book;
    Counted<DocumentController const> m_Chapter;
    Counted<DocumentController const> m_Stranger;
};

std::vector<std::string> NamesOf(Anchors const & anchors)
{
    std::vector<std::string> names;
    for (Counted<AnchorInstance const> const & anchor : anchors) {
        names.push_back(anchor->GetName().ToStd() + (anchor->IsBlind() ? " (elsewhere)" : ""));
    }
    return names;
}

}

TEST_F(BookSinkTest, ADocumentInNoBookGetsTheAnswersForNone)
{
    String const uid = Uid(0, 0);
    EXPECT_TRUE(m_Sink.IsInBook(m_Chapter));
    EXPECT_FALSE(m_Sink.IsInBook(m_Stranger));
    EXPECT_FALSE(m_Sink.IsInBook(nullptr));
    EXPECT_EQ(m_Sink.GetAnchorInfo(uid, m_Stranger), nullptr);
    EXPECT_FALSE(m_Sink.IsAnchorAbove(uid, m_Stranger));
    EXPECT_FALSE(m_Sink.IsAnchorPointValid(
        MakeCounted<AnchorInstance>(MakeCounted<Story::AnchorData>("one", false, false, uid), 0), m_Stranger));
    m_Sink.SetPasswordForGuid("guid", "secret", m_Stranger);
    EXPECT_EQ(m_Sink.GetPasswordForGuid("guid", m_Stranger), "");
    for (auto const & document : {m_Chapter, m_Stranger}) {
        // No chapter holds contents or an index of the book.
        EXPECT_FALSE(m_Sink.IsAnyTocOutOfDate(document));
        EXPECT_FALSE(m_Sink.IsIndexOutOfDate(document));
        EXPECT_EQ(m_Sink.MakeUpdateAllTocsCommand(document), nullptr);
        EXPECT_EQ(m_Sink.MakeUpdateIndexCommand(document), nullptr);
    }
}

TEST_F(BookSinkTest, ItTakesBookCommandsOfChaptersAndNothingElse)
{
    Counted<BookChapter const> const chapter = m_Book->GetChapterAtIndex(1);
    struct Row
    {
        char const * m_Why;
        Counted<DocumentController const> m_Document;
        Counted<DomainCommand> m_Command;
        bool m_IsTaken;
    };
    for (Row const & row :
         {Row{"a book's command", m_Chapter, MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 21), true},
          Row{"in no book", m_Stranger, MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 22), false},
          Row{"a document's command", m_Chapter, MakeCounted<ModifySectionCommand>(0u), false},
          Row{"none", m_Chapter, nullptr, false}}) {
        EXPECT_EQ(m_Sink.HandleCommand(row.m_Document, row.m_Command), row.m_IsTaken) << row.m_Why;
    }
    // The framework's own road for a command that no document can run leads here.
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStartFromPage(), 21);
    Counted<DomainCommand> const command = MakeCounted<UpdateChapterSettingsCommand>(chapter, false, 23);
    EXPECT_TRUE(VantraController::GetInstance().EnqueueCommand(command, m_Chapter, true));
    BookBuilder::Rest();
    EXPECT_EQ(chapter->GetStartFromPage(), 23);
}

TEST_F(BookSinkTest, OwnAnchorsComeFirstAndThoseOfOtherChaptersAsPlacesElsewhere)
{
    AnchorVisitor visitor(false);
    EXPECT_TRUE(m_Sink.GetAnchors(visitor, m_Chapter));
    EXPECT_THAT(NamesOf(*visitor.GetAnchors()), ElementsAre("three", "one (elsewhere)", "two (elsewhere)"));
    AnchorVisitor alone(false);
    EXPECT_FALSE(m_Sink.GetAnchors(alone, m_Stranger));
    EXPECT_THAT(NamesOf(*alone.GetAnchors()), ElementsAre("four"));
}

TEST_F(BookSinkTest, WhatItSaysOfAnAnchorStaysToTheEndOfTheTurn)
{
    Kernel::TurnSession const turn;
    AnchorInfo const * const first = m_Sink.GetAnchorInfo(Uid(0, 1), m_Chapter);
    ASSERT_NE(first, nullptr);
    // The next answer, and a chapter that is looked at anew, take nothing away from it.
    AnchorInfo const * const second = m_Sink.GetAnchorInfo(Uid(1, 0), m_Chapter);
    ASSERT_NE(second, nullptr);
    m_Book->GetChapterAtIndex(0)->SetAnchors({});
    m_Book->GetChapterAtIndex(1)->SetAnchors({});
    EXPECT_EQ(first->m_Name, "two");
    EXPECT_EQ(first->m_ChapterIndex, 0);
    EXPECT_EQ(second->m_Name, "three");
    EXPECT_EQ(m_Sink.GetAnchorInfo(first->m_Uid, m_Chapter), nullptr);
}

TEST_F(BookSinkTest, AnAnchorIsAboveInAnEarlierChapterAndWhereNobodyHasIt)
{
    EXPECT_TRUE(m_Sink.IsAnchorAbove(Uid(0, 0), m_Chapter));
    EXPECT_FALSE(m_Sink.IsAnchorAbove(Uid(1, 0), m_Chapter)) << "the asking chapter itself";
    EXPECT_TRUE(m_Sink.IsAnchorAbove("nobody's", m_Chapter));
    Counted<DocumentController const> const first = Open(m_Book->GetChapterAtIndex(0)->GetPath());
    EXPECT_FALSE(m_Sink.IsAnchorAbove(Uid(1, 0), first)) << "a later chapter";
    VantraController::GetInstance().EnqueueCommandAndWait(
        MakeCounted<CloseDocumentCommand>(first, nullptr, false, false));
}
