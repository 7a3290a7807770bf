#include "commands/EngageBookLockCommand.h"
#include "core/BookCollection.h"
#include "framework/commands/ModifySectionCommand.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/DocumentNode.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentSection.h"
#include "framework/document/VantraController.h"
#include "framework/kernel/Semaphore.h"
#include "support/BookBuilder.h"
#include "support/HeldQueue.h"
#include "support/NotificationRecorder.h"

#include <gtest/gtest.h>

#include <thread>

using namespace Book;
using Kernel::Counted;
using Kernel::MakeCounted;

namespace
{

class BookLockTest : public testing::Test
{
protected:
    BookLockTest()
    {
        m_Collection.SetUpdatePageNumbersAutomatically(false);
        m_Book = m_Builder.NewBook({m_Builder.WriteChapter("a.kvdoc"), m_Builder.WriteChapter("b.kvdoc"),
                                    m_Builder.WriteChapter("c.kvdoc")});
    }
    ~BookLockTest() override
    {
        for (auto const & document : m_Open) {
            m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        }
        m_Collection.SetUpdatePageNumbersAutomatically(true);
        SetSwitches(true, true, true, true, true);
    }

    Counted<DocumentController> OpenInFront(int chapter)
    {
        String const path = m_Book->GetChapterAtIndex(chapter)->GetPath();
        OpenDocumentFailedNotification failure(path, true);
        auto const document = m_Application.OpenDocument(path, failure);
        EXPECT_TRUE(document) << failure.GetReason();
        BookBuilder::Rest();
        m_Open.push_back(document);
        return document;
    }
    void Engage(bool engage) { BookBuilder::Run(m_Book, MakeCounted<EngageBookLockCommand>(engage)); }
    bool Edit(Counted<DocumentController> const & document, bool byUser)
    {
        auto const command = MakeCounted<ModifySectionCommand>(0u);
        command->SetStartNumberingAt(7);
        return m_Application.EnqueueCommandAndWait(command, document, byUser);
    }
    void SetSwitches(bool numbers, bool references, bool endnotes, bool tocs, bool index)
    {
        m_Collection.SetUpdateNumbersBeforeOutput(numbers);
        m_Collection.SetUpdateCrossReferencesBeforeOutput(references);
        m_Collection.SetUpdateEndnotesBeforeOutput(endnotes);
        m_Collection.SetUpdateTocsBeforeOutput(tocs);
        m_Collection.SetUpdateIndexBeforeOutput(index);
    }

    VantraController & m_Application = VantraController::GetInstance();
    BookCollection & m_Collection = BookCollection::GetInstance();
    BookBuilder m_Builder;
    Counted<BookController> m_Book;
    std::vector<Counted<DocumentController const>> m_Open;
};

/// Holds a document's queue until it is let go.
class BlockingCommand final : public DocumentCommand
{
public:
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {"Block", "Test command"}; }
    void Do() override
    {
        m_Begun.Signal();
        m_Release.Wait(0);
    }
    void Undo() override {}
    void Notify(std::vector<Counted<Kernel::Notification>> &) override {}
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }

    Kernel::Semaphore m_Begun{0};
    Kernel::Semaphore m_Release{0};
};

}

TEST_F(BookLockTest, AnEngagedDocumentRefusesTheUserAndSaysWhy)
{
    auto const document = OpenInFront(1);
    Engage(true);
    NotificationRecorder recorder;
    EXPECT_FALSE(Edit(document, true));
    EXPECT_NE(document->GetDocument()->GetSection(0)->GetStartNumberingAt(), 7u);
    auto const refusals = recorder.All<CommandRefusedNotification const>();
    ASSERT_EQ(refusals.size(), 1u);
    EXPECT_EQ(refusals[0]->GetDocumentController(), Counted<DocumentController const>(document));
    EXPECT_NE(std::string(refusals[0]->GetReason().ToStd()).find("book"), std::string::npos) << refusals[0]->GetReason();
    EXPECT_TRUE(Edit(document, false)) << "what the book itself does goes on";
    // A switch, no count.
    Engage(true);
    Engage(false);
    EXPECT_TRUE(Edit(document, true));
}

TEST_F(BookLockTest, DocumentsTakeItOneAfterTheOtherAndOnlyThoseInFront)
{
    auto const first = OpenInFront(0);
    auto const last = OpenInFront(2);
    Counted<BookChapter const> const middle = m_Book->GetChapterAtIndex(1);
    auto const background = m_Book->LoadChapterDocument(middle, true, false);
    auto const block = MakeCounted<BlockingCommand>();
    ASSERT_TRUE(m_Application.EnqueueCommand(block, Counted<DocumentController const>(last), false));
    block->m_Begun.Wait(0);

    Kernel::Semaphore engaged(0);
    auto const engage = MakeCounted<EngageBookLockCommand>(true);
    engage->SetCompletionCallback([&] { engaged.Signal(); });
    m_Collection.EnqueueCommand(engage, m_Book);
    // The first document's queue runs empty only behind its part of the walk, which then stands at the last one.
    while (!first->IsBookLockEngaged()) {
        std::this_thread::yield();
    }
    EXPECT_FALSE(last->IsBookLockEngaged()) << "its queue has not come to that yet";
    block->m_Release.Signal();
    engaged.Wait(0);
    EXPECT_TRUE(last->IsBookLockEngaged());
    EXPECT_FALSE(background->IsBookLockEngaged());
    Engage(false);
    EXPECT_FALSE(first->IsBookLockEngaged() || last->IsBookLockEngaged());
    m_Book->ReleaseChapterDocument(middle, false);
}

TEST_F(BookLockTest, ADocumentThatClosesUnderTheLockOpensWithoutIt)
{
    auto const document = OpenInFront(0);
    Engage(true);
    m_Application.EnqueueCommandAndWait(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
    m_Open.clear();
    BookBuilder::Rest();
    EXPECT_FALSE(OpenInFront(0)->IsBookLockEngaged());
    Engage(false);
}

TEST_F(BookLockTest, OutputIsPreparedUnderTheLock)
{
    struct Row
    {
        char const * m_Why;
        bool m_Numbers, m_References, m_Endnotes, m_Tocs, m_Index;
        std::vector<std::string> m_Commands;
    };
    for (Row const & row :
         {Row{"everything", true, true, true, true, true,
              {"EngageBookLockCommand", "UpdateNumbersCommand", "EngageBookLockCommand"}},
          Row{"numbers alone", true, false, false, false, false,
              {"EngageBookLockCommand", "UpdateNumbersCommand", "EngageBookLockCommand"}},
          Row{"any of the others holds the documents still all the same", false, false, false, false, true,
              {"EngageBookLockCommand", "EngageBookLockCommand"}},
          Row{"nothing, and no lock either", false, false, false, false, false, {}}}) {
        SetSwitches(row.m_Numbers, row.m_References, row.m_Endnotes, row.m_Tocs, row.m_Index);
        HeldQueue held(m_Book);
        m_Collection.PreOutput(m_Book, {});
        EXPECT_EQ(held.Take(), row.m_Commands) << row.m_Why;
    }
    SetSwitches(true, true, true, true, true);
    auto const document = OpenInFront(0);
    m_Collection.PreOutput(m_Book, {m_Book->GetChapterAtIndex(0)});
    m_Book->WaitUntilCommandQueueEmpty();
    EXPECT_FALSE(document->IsBookLockEngaged()) << "it comes off again";
}
