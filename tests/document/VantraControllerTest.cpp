#include "framework/document/VantraController.h"

#include "framework/document/BookSinkCollection.h"
#include "framework/document/CloseDocumentCommand.h"
#include "framework/document/CloseDocumentNotification.h"
#include "framework/document/DocumentNotifications.h"
#include "framework/document/DocumentPromptNotification.h"
#include "framework/document/DocumentRegistry.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/Semaphore.h"
#include "support/DocumentBuilder.h"
#include "support/NotificationRecorder.h"
#include "support/TemporaryFolder.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <stdexcept>
#include <thread>

namespace
{

using Kernel::Counted;
using Kernel::MakeCounted;
using Kernel::Semaphore;
using testing::ElementsAre;
using testing::IsEmpty;

VantraController & Application()
{
    return VantraController::GetInstance();
}

/// A document file, opened and closed as books and users do.
class Documents : public testing::Test
{
protected:
    Documents()
    {
        DocumentBuilder builder;
        builder.Paragraph("Call me Ishmael.").BuildFile(m_Path);
    }
    ~Documents() override { Application().WaitUntilIdle(); }

    /// As a book loads a chapter: claims, loads if it has to, and counts itself in.
    Counted<DocumentController> Use()
    {
        Counted<DocumentController> document = MakeCounted<DocumentController>();
        if (Application().RegisterLoadingController(m_Path, document)) {
            ++m_Loads;
            OpenDocumentFailedNotification failure(m_Path, false);
            document->SetWantNotifications(false);
            if (!document->LoadDocument(m_Path, false, false, LoadWhole, nullptr, failure, false)) {
                Application().UnregisterLoadingController(m_Path, nullptr);
                return nullptr;
            }
            Application().UnregisterLoadingController(m_Path, document);
        }
        Application().RegisterBackgroundController(document);
        return document;
    }

    /// As a book lets a chapter go; true if that closed it.
    bool LetGo(Counted<DocumentController> const & document)
    {
        bool keepUnsaved = false;
        if (!Application().UnregisterBackgroundController(document, keepUnsaved)) {
            return false;
        }
        Application().EnqueueCommand(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
        return true;
    }

    Counted<DocumentController> Open()
    {
        OpenDocumentFailedNotification failure(m_Path, true);
        return Application().OpenDocument(m_Path, failure);
    }

    void Close(Counted<DocumentController> const & document)
    {
        Application().EnqueueCommandAndWait(
            Counted<VantraCommand>(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false)));
    }

    TemporaryFolder const m_Folder;
    String const m_Path = m_Folder / "chapter.kvdoc";
    std::atomic<int> m_Loads{0};
};

class WordCommand : public DocumentCommand
{
public:
    explicit WordCommand(std::function<void(DocumentController &)> work) : m_Work(std::move(work)) {}
    Kernel::LocalisedString GetDescription() const override { return {"Word", "Test command"}; }
    void Do() override { m_Work(*GetDocument()); }
    void Undo() override {}
    void Notify(std::vector<Counted<Kernel::Notification>> &) override {}
    bool ShouldStackForUndo() const override { return false; }

private:
    std::function<void(DocumentController &)> const m_Work;
};

Counted<DocumentCommand> OnDocument(std::function<void(DocumentController &)> work)
{
    return MakeCounted<WordCommand>(std::move(work));
}

TEST_F(Documents, TwoUsersShareOneDocumentAndTheLastOneClosesIt)
{
    Counted<DocumentController> const first = Use();
    Counted<DocumentController> const second = Use();
    EXPECT_EQ(first, second);
    EXPECT_EQ(m_Loads, 1);
    EXPECT_EQ(Application().GetRegisteredDocumentControllerFromPath(m_Path), nullptr) << "not in front";
    EXPECT_FALSE(LetGo(first));
    EXPECT_TRUE(LetGo(second));
    Counted<DocumentController> const third = Use();
    EXPECT_FALSE(third == first) << "a load waits for the close and makes a document of its own";
    EXPECT_TRUE(LetGo(third));
}

TEST_F(Documents, ManyUsersComingAndGoingNeverMeetTwoDocumentsOrAClosedOne)
{
    std::vector<std::thread> threads;
    std::atomic<int> ran{0};
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([&] {
            for (int round = 0; round < 25; ++round) {
                Counted<DocumentController> const document = Use();
                ASSERT_TRUE(document);
                EXPECT_TRUE(Application().EnqueueCommandAndWait(OnDocument([&](DocumentController &) { ++ran; }),
                                                                Counted<DocumentController const>(document), false));
                LetGo(document);
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    EXPECT_EQ(ran, 100);
    Application().WaitUntilIdle();
    EXPECT_THAT(Application().GetDocumentControllers(), IsEmpty());
}

TEST_F(Documents, TheLastReleaseLetsCommandsThatNobodyWaitsForRunFirst)
{
    for (int round = 0; round < 20; ++round) {
        Counted<DocumentController> const document = Use();
        std::atomic<bool> ran{false};
        Application().EnqueueCommand(OnDocument([&](DocumentController &) { ran = true; }),
                                     Counted<DocumentController const>(document), false);
        bool keepUnsaved = false;
        ASSERT_TRUE(Application().UnregisterBackgroundController(document, keepUnsaved));
        EXPECT_TRUE(ran);
        Application().EnqueueCommand(MakeCounted<CloseDocumentCommand>(document, nullptr, false, false));
    }
}

TEST_F(Documents, ACloseCompletesAfterTheDocumentsOwnLastTurn)
{
    Counted<DocumentController> const document = Use();
    Semaphore reached(0);
    Semaphore open(0);
    Application().EnqueueCommand(OnDocument([&](DocumentController &) {
                                     reached.Signal();
                                     open.Wait(0);
                                 }),
                                 Counted<DocumentController const>(document), false);
    reached.Wait(0);
    bool keepUnsaved = false;
    std::thread releaser([&] { EXPECT_TRUE(Application().UnregisterBackgroundController(document, keepUnsaved)); });
    open.Signal();
    releaser.join();
    std::vector<std::string> order;
    Application().EnqueueCommand(OnDocument([&](DocumentController &) { order.push_back("earlier"); }),
                                 Counted<DocumentController const>(document), false);
    auto const close = MakeCounted<CloseDocumentCommand>(document, nullptr, false, false);
    close->SetCompletionCallback([&] { order.push_back("closed"); });
    Application().EnqueueCommandAndWait(Counted<VantraCommand>(close));
    EXPECT_THAT(order, ElementsAre("earlier", "closed"));
    EXPECT_FALSE(document->IsAbleToRunCommands());
    Close(document);
}

TEST_F(Documents, OpeningABackgroundDocumentInFrontKeepsItAndClosingItThereGivesItBack)
{
    NotificationRecorder recorder;
    Counted<DocumentController> const used = Use();
    EXPECT_THAT(recorder.All<NewDocumentNotification>(), IsEmpty());
    Counted<DocumentController> const front = Open();
    EXPECT_EQ(front, used);
    EXPECT_EQ(recorder.All<NewDocumentNotification>().size(), 1U);
    EXPECT_EQ(Application().GetRegisteredDocumentControllerFromPath(m_Path), front);
    EXPECT_TRUE(Application().IsActiveDocumentController(front));
    EXPECT_FALSE(Application().IsPurelyForegroundController(front));
    EXPECT_TRUE(front->GetWantNotifications());
    EXPECT_EQ(Open(), front) << "a second time";
    EXPECT_EQ(recorder.All<NewDocumentNotification>().size(), 1U);

    Close(front);
    EXPECT_FALSE(Application().IsActiveDocumentController(front));
    EXPECT_TRUE(front->IsAbleToRunCommands()) << "the book still has it";
    EXPECT_FALSE(front->GetWantNotifications());
    EXPECT_EQ(recorder.All<CloseDocumentNotification>().size(), 1U);
    EXPECT_TRUE(LetGo(used));
    Application().WaitUntilIdle();
    EXPECT_EQ(recorder.All<CloseDocumentNotification>().size(), 1U) << "a background close is quiet";
}

TEST_F(Documents, AUserWhoLetsGoOfADocumentInFrontLeavesItOpen)
{
    Counted<DocumentController> const front = Open();
    Counted<DocumentController> const used = Use();
    EXPECT_EQ(front, used);
    EXPECT_FALSE(LetGo(used));
    EXPECT_TRUE(Application().IsPurelyForegroundController(front));
    EXPECT_THAT(Application().GetDocumentControllers(), ElementsAre(Counted<DocumentController const>(front)));
    Close(front);
    EXPECT_FALSE(front->IsAbleToRunCommands());
}

TEST_F(Documents, CloseCallbacksRunOnTheirSinksLineOnceTheFileIsClosed)
{
    struct Listener : BroadcastNotificationSink
    {
        void Notify(Counted<Kernel::Notification> notification) override
        {
            if (auto const close = Kernel::CountedCast<CloseDocumentNotification>(notification)) {
                m_Line = BroadcastNotification::CurrentLine();
                close->AddCallback([this](String const & path) {
                    m_Path = path;
                    m_OnOwnLine = BroadcastNotification::CurrentLine() == m_Line;
                    OpenDocumentFailedNotification failure(path, false);
                    m_CouldLoad = MakeCounted<DocumentController>()->LoadDocument(path, true, false, LoadWhole, nullptr,
                                                                                  failure, false);
                });
            }
        }
        std::uint64_t m_Line = 0;
        String m_Path;
        bool m_OnOwnLine = false;
        bool m_CouldLoad = false;
    } listener;
    BroadcastNotification::RegisterBroadcastSink(&listener);
    Close(Open());
    Application().WaitUntilIdle();
    BroadcastNotification::UnregisterBroadcastSink(&listener);
    EXPECT_EQ(listener.m_Path, m_Path);
    EXPECT_TRUE(listener.m_OnOwnLine);
    EXPECT_TRUE(listener.m_CouldLoad) << "the file's lock is free by then";
}

TEST_F(Documents, AFailedLoadFreesThePathForTheNextWhoWaits)
{
    Counted<DocumentController> document = MakeCounted<DocumentController>();
    ASSERT_TRUE(Application().RegisterLoadingController(m_Path, document));
    Counted<DocumentController> loaded;
    std::thread waiting([&] { loaded = Use(); });
    Application().UnregisterLoadingController(m_Path, nullptr);
    waiting.join();
    ASSERT_TRUE(loaded);
    EXPECT_FALSE(loaded == document);
    LetGo(loaded);
}

TEST_F(Documents, AUseCountedInTooLateIsForgottenWithoutASave)
{
    Counted<DocumentController> const document = Use();
    EXPECT_TRUE(LetGo(document));
    Application().WaitUntilIdle();
    Application().RegisterBackgroundController(document);
    bool keepUnsaved = false;
    EXPECT_TRUE(Application().UnregisterBackgroundController(document, keepUnsaved));
    EXPECT_TRUE(keepUnsaved);
    Close(document);
    EXPECT_FALSE(Application().EnqueueCommandAndWait(OnDocument([](DocumentController &) { FAIL(); }),
                                                     Counted<DocumentController const>(document), false));
}

TEST(DocumentRegistryTest, ALateUseSaysNothingOfADocumentThatComesAfterwards)
{
    // The same object stands for two that get the same address one after the other.
    DocumentRegistry registry;
    Counted<DocumentController> const document = MakeCounted<DocumentController>();
    registry.AddUse(*document);
    ASSERT_TRUE(registry.AddInFront(document));
    registry.AddUse(*document);
    bool keepUnsaved = false;
    EXPECT_FALSE(registry.EndUse(*document, keepUnsaved)) << "the user has it";
    EXPECT_FALSE(keepUnsaved);
    EXPECT_TRUE(registry.IsInFrontOnly(*document));
}

TEST_F(Documents, OnlyTheUsersCommandsAreRefusedUnderTheBookLock)
{
    NotificationRecorder recorder;
    Counted<DocumentController const> const document = Open();
    int ran = 0;
    auto const count = [&] { return OnDocument([&](DocumentController &) { ++ran; }); };
    Application().EnqueueCommandAndWait(OnDocument([](DocumentController & owner) { owner.EngageBookLock(true); }), document,
                                        false);
    EXPECT_FALSE(Application().EnqueueCommandAndWait(count(), document, true));
    EXPECT_FALSE(Application().EnqueueCommand(count(), document, true));
    EXPECT_TRUE(Application().EnqueueCommandAndWait(count(), document, false));
    EXPECT_EQ(ran, 1);
    EXPECT_EQ(recorder.All<CommandRefusedNotification>().size(), 2U);
    Close(Application().GetMutableDocumentController(document));
}

class FixedCommand : public VantraCommand
{
public:
    explicit FixedCommand(std::function<void()> work) : m_Work(std::move(work)) {}
    Kernel::LocalisedString GetDescription() const override { return {"Fixed", "Test command"}; }
    void Do() override { m_Work(); }
    void Undo() override {}
    void Notify(std::vector<Counted<Kernel::Notification>> &) override {}

private:
    std::function<void()> const m_Work;
};

TEST(ApplicationQueueTest, CommandsRunInTurnAndAThrowIsToldAndStopsNothing)
{
    NotificationRecorder recorder;
    std::vector<int> ran;
    for (int number = 0; number < 100; ++number) {
        Application().EnqueueCommand(Counted<VantraCommand>(MakeCounted<FixedCommand>([&ran, number] {
            ran.push_back(number);
            if (number == 50) {
                throw std::runtime_error("no");
            }
        })));
    }
    Application().EnqueueCommandAndWait(Counted<VantraCommand>(MakeCounted<FixedCommand>([] {})));
    EXPECT_EQ(ran.size(), 100U);
    EXPECT_TRUE(std::is_sorted(ran.begin(), ran.end()));
    EXPECT_EQ(recorder.All<CommandFailedNotification>().size(), 1U);
}

TEST(DocumentPromptNotificationTest, TheAnswerIsATurnOfTheNamedDomainAndNobodyAnswersTwice)
{
    struct Row
    {
        char const * m_Why;
        unsigned int m_Choices;
        bool m_Answered;
        DocumentPromptChoice m_Expected;
    };
    Row const rows[] = {
        {"answered", PromptYes | PromptNo | PromptCancel, true, PromptYes},
        {"nobody listens", PromptYes | PromptNo | PromptCancel, false, PromptCancel},
        {"nobody listens, and there is no way back", PromptYes | PromptNo, false, PromptNothing},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_Why);
        auto const domain = MakeCounted<DomainController>();
        std::vector<DocumentPromptChoice> answers;
        auto prompt = MakeCounted<DocumentPromptNotification>(
            "Title", "Message", static_cast<DocumentPromptChoice>(row.m_Choices), PromptIconQuestion,
            std::vector<String>(),
            [&](DocumentPromptChoice choice) {
                EXPECT_TRUE(domain->IsWriterLockHeld());
                answers.push_back(choice);
            },
            domain);
        Application().Broadcast(prompt);
        if (row.m_Answered) {
            EXPECT_EQ(Application().WaitUntilIdle(), Kernel::Activity::Rest::WaitingForUser);
            EXPECT_TRUE(prompt->Answer(PromptYes));
            EXPECT_FALSE(prompt->Answer(PromptNo));
        }
        prompt.Reset();
        EXPECT_EQ(Application().WaitUntilIdle(), Kernel::Activity::Rest::Idle);
        EXPECT_THAT(answers, ElementsAre(row.m_Expected));
    }
}

}
