#include "QueueFixtures.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/Semaphore.h"

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

/// Holds a queue's turn from the moment it is made until `Open`.
class Gate
{
public:
    explicit Gate(Counted<TestDomain> const & domain)
    {
        domain->EnqueueCommand(Work([this](TestDomain &) {
            m_Reached.Signal();
            m_Open.Wait(0);
        }));
        m_Reached.Wait(0);
    }
    void Open() { m_Open.Signal(); }

private:
    Semaphore m_Reached{0};
    Semaphore m_Open{0};
};

TEST(DomainControllerTest, CommandsOfManyThreadsRunOneAtATimeAndEachThreadsInItsOrder)
{
    auto const domain = MakeCounted<TestDomain>();
    constexpr int Threads = 4;
    constexpr int Commands = 500;
    int inside = 0;
    std::vector<std::pair<int, int>> ran;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < Threads; ++thread) {
        threads.emplace_back([&, thread] {
            for (int number = 0; number < Commands; ++number) {
                auto const command = Work([&, thread, number](TestDomain & owner) {
                    EXPECT_TRUE(owner.IsWriterLockHeld());
                    EXPECT_EQ(++inside, 1);
                    ran.emplace_back(thread, number);
                    --inside;
                });
                number % 10 == 9 ? domain->EnqueueCommandAndWait(command) : domain->EnqueueCommand(command);
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    domain->WaitUntilCommandQueueEmpty();
    ASSERT_EQ(ran.size(), static_cast<std::size_t>(Threads * Commands));
    std::vector<int> next(Threads, 0);
    for (auto const & [thread, number] : ran) {
        EXPECT_EQ(number, next[static_cast<std::size_t>(thread)]++);
    }
}

TEST(DomainControllerTest, ACommandEndsWithItsNotificationsPostedTheLockFreeTheCallbackRunAndThenTheWaiterWoken)
{
    auto const domain = MakeCounted<TestDomain>();
    std::uint64_t const before = BroadcastNotification::LastPostingNumber();
    bool called = false;
    auto const command = Say("a");
    command->m_Says.push_back(MakeCounted<TestNotification>("changed"));
    command->SetCompletionCallback([&] {
        EXPECT_GT(BroadcastNotification::LastPostingNumber(), before);
        EXPECT_FALSE(domain->IsWriterLockHeld());
        std::thread([&] {
            domain->AcquireWriterLock();
            domain->ReleaseWriterLock();
        }).join();
        called = true;
    });
    EXPECT_TRUE(domain->EnqueueCommandAndWait(command));
    EXPECT_TRUE(called);
    EXPECT_THAT(domain->m_Words, ElementsAre("a"));
}

TEST(DomainControllerTest, WaitersAndPlainCommandsOfATwoQueueRingAllEnd)
{
    // Each queue's commands wait for commands of the other: all the rings that two queues can form.
    auto const a = MakeCounted<TestDomain>();
    auto const b = MakeCounted<TestDomain>();
    std::atomic<int> ran{0};
    auto const ask = [&](Counted<TestDomain> const & other, Counted<TestDomain> const & back) {
        return Work([&ran, other, back](TestDomain &) {
            other->EnqueueCommandAndWait(Work([&ran, back](TestDomain &) {
                back->EnqueueCommandAndWait(Work([&ran](TestDomain & owner) {
                    EXPECT_TRUE(owner.IsWriterLockHeld());
                    ++ran;
                }));
                ++ran;
            }));
            ++ran;
        });
    };
    constexpr int Rounds = 300;
    std::thread first([&] {
        for (int round = 0; round < Rounds; ++round) {
            a->EnqueueCommand(ask(b, a));
        }
    });
    std::thread second([&] {
        for (int round = 0; round < Rounds; ++round) {
            b->EnqueueCommandAndWait(ask(a, b));
        }
    });
    first.join();
    second.join();
    Kernel::Activity::WaitForRest();
    EXPECT_EQ(ran, 6 * Rounds);
}

TEST(DomainControllerTest, RingsOfManyQueuesWithLocksTakenByHandAndGivenUpEnd)
{
    constexpr std::size_t Queues = 5;
    constexpr int Rounds = 150;
    std::vector<Counted<TestDomain>> domains;
    for (std::size_t index = 0; index < Queues; ++index) {
        domains.push_back(MakeCounted<TestDomain>());
    }
    std::vector<int> inside(Queues, 0);
    std::atomic<int> ran{0};
    // Walks on round the ring, so that sooner or later every queue waits for every other.
    std::function<void(std::size_t, int)> walk = [&](std::size_t index, int steps) {
        domains[index]->EnqueueCommandAndWait(Work([&, index, steps](TestDomain & owner) {
            ++ran;
            // Guarded by the writer lock: a race here is a lock that two have.
            inside[index] += 1;
            if (steps > 0) {
                if (steps % 2 == 0) {
                    DomainWriterUnlockSession const session{Counted<DomainController>(&owner)};
                    walk((index + 1) % Queues, steps - 1);
                } else {
                    walk((index + 1) % Queues, steps - 1);
                }
            }
            inside[index] += 1;
        }));
    };
    std::vector<std::thread> threads;
    for (std::size_t index = 0; index < Queues; ++index) {
        threads.emplace_back([&, index] {
            for (int round = 0; round < Rounds; ++round) {
                if (round % 5 == 4) {
                    // As a delivery line does: by hand, and then waiting for somebody's queue.
                    domains[index]->AcquireWriterLock();
                    inside[index] += 1;
                    walk((index + 2) % Queues, 2);
                    inside[index] += 1;
                    domains[index]->ReleaseWriterLock();
                } else {
                    walk(index, static_cast<int>(Queues));
                }
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    int const perQueue = Rounds / 5 * 3 + (Rounds - Rounds / 5) * (static_cast<int>(Queues) + 1);
    EXPECT_EQ(ran, perQueue * static_cast<int>(Queues));
}

TEST(DomainControllerTest, ACommandForAQueueHeldByAnAskingTurnRunsInPlaceAheadOfWhatWaits)
{
    auto const book = MakeCounted<TestDomain>();
    auto const document = MakeCounted<TestDomain>();
    book->EnqueueCommandAndWait(Work([&](TestDomain & owner) {
        owner.EnqueueCommand(Say("behind"));
        document->EnqueueCommandAndWait(Work([&](TestDomain &) { book->EnqueueCommandAndWait(Say("in place")); }));
        owner.m_Words.push_back("after");
    }));
    book->WaitUntilCommandQueueEmpty();
    EXPECT_THAT(book->m_Words, ElementsAre("in place", "after", "behind"));
}

TEST(DomainControllerTest, TheFenceLetsEarlierCommandsAndTheirCallbacksEnd)
{
    auto const domain = MakeCounted<TestDomain>();
    for (int round = 0; round < 200; ++round) {
        std::atomic<bool> called{false};
        auto const command = Say("x");
        command->SetCompletionCallback([&] { called = true; });
        domain->EnqueueCommand(command);
        domain->WaitUntilCommandQueueEmpty();
        ASSERT_TRUE(called);
    }
}

class RepeatableCommand : public TestCommand
{
public:
    using TestCommand::TestCommand;
    bool AvoidMultipleInQueue() const override { return true; }
};

class MergingCommand : public TestCommand
{
public:
    explicit MergingCommand(std::string word)
        : TestCommand([this](TestDomain & domain) { domain.m_Words.push_back(m_Word); }), m_Word(std::move(word))
    {
    }
    bool CanMerge(Counted<Command const> next) const override
    {
        return dynamic_cast<MergingCommand const *>(next.Get()) != nullptr;
    }
    void Merge(Counted<Command const> next) override { m_Word += dynamic_cast<MergingCommand const &>(*next).m_Word; }

private:
    std::string m_Word;
};

TEST(DomainControllerTest, EveryAcceptedCommandsCallbackRunsOnceWhateverBecameOfIt)
{
    auto const domain = MakeCounted<TestDomain>();
    std::vector<std::string> ended;
    auto const tracked = [&](Counted<TestCommand> command, std::string name) {
        command->SetCompletionCallback([&ended, name] { ended.push_back(name); });
        return command;
    };
    Gate gate(domain);
    auto const repeat = [](std::string word) {
        return MakeCounted<RepeatableCommand>([word](TestDomain & owner) { owner.m_Words.push_back(word); });
    };
    domain->EnqueueCommand(tracked(repeat("first"), "dropped"));
    domain->EnqueueCommand(tracked(Say("between"), "between"));
    domain->EnqueueCommand(tracked(repeat("second"), "survivor"));
    domain->EnqueueCommand(tracked(MakeCounted<MergingCommand>("m"), "merging"));
    domain->EnqueueCommand(tracked(MakeCounted<MergingCommand>("n"), "merged"));
    domain->EnqueueCommand(tracked(Work([](TestDomain &) { throw std::runtime_error("no"); }), "thrown"));
    domain->DisableCommandEnqueueAndEmpty();
    EXPECT_FALSE(domain->EnqueueCommand(tracked(Say("late"), "refused")));
    EXPECT_FALSE(domain->EnqueueCommandAndWait(tracked(Say("late"), "refused")));
    gate.Open();
    domain->WaitUntilCommandQueueEmpty();
    EXPECT_THAT(domain->m_Words, ElementsAre("between", "second", "mn"));
    EXPECT_THAT(ended, ElementsAre("between", "dropped", "survivor", "merging", "merged", "thrown"));
}

TEST(DomainControllerTest, AThrowingCommandSaysWhyAndLeavesTheQueueAndLockInOrder)
{
    struct Failures : BroadcastNotificationSink
    {
        void Notify(Counted<Kernel::Notification> notification) override
        {
            if (auto const failed = Kernel::CountedCast<CommandFailedNotification>(notification)) {
                m_Reason = failed->GetReason();
            }
        }
        String m_Reason;
    } failures;
    BroadcastNotification::RegisterBroadcastSink(&failures);
    auto const domain = MakeCounted<TestDomain>();
    domain->EnqueueCommandAndWait(Work([](TestDomain & owner) {
        owner.ReleaseWriterLock();
        throw std::runtime_error("the disk is full");
    }));
    EXPECT_TRUE(domain->EnqueueCommandAndWait(Say("next")));
    Kernel::Activity::WaitForRest();
    BroadcastNotification::UnregisterBroadcastSink(&failures);
    EXPECT_EQ(failures.m_Reason, String("the disk is full"));
    EXPECT_THAT(domain->m_Words, ElementsAre("next"));
}

TEST(DomainControllerTest, TheLastCommandRunsBehindAllOthersAndThereIsOneOnly)
{
    auto const domain = MakeCounted<TestDomain>();
    Gate gate(domain);
    domain->EnqueueCommand(Say("earlier"));
    EXPECT_TRUE(domain->EnqueueLastCommand(Say("last")));
    EXPECT_FALSE(domain->EnqueueLastCommand(Say("another")));
    EXPECT_FALSE(domain->EnqueueCommand(Say("late")));
    gate.Open();
    domain->WaitUntilCommandQueueEmpty();
    EXPECT_THAT(domain->m_Words, ElementsAre("earlier", "last"));
}

TEST(DomainControllerTest, QueuesDisabledWhileManyEnqueueAndWaitLoseNoAcceptedCommand)
{
    for (int round = 0; round < 40; ++round) {
        auto const domain = MakeCounted<TestDomain>();
        std::atomic<int> accepted{0};
        std::atomic<int> ended{0};
        std::vector<std::thread> threads;
        for (int thread = 0; thread < 4; ++thread) {
            threads.emplace_back([&, thread] {
                for (int number = 0; number < 30; ++number) {
                    auto const command = Say("x");
                    command->SetCompletionCallback([&] { ++ended; });
                    accepted += thread % 2 == 0 ? domain->EnqueueCommand(command)
                                                : domain->EnqueueCommandAndWait(command);
                }
            });
        }
        std::thread closer([&] { domain->EnqueueLastCommand(Say("last")); });
        for (std::thread & thread : threads) {
            thread.join();
        }
        closer.join();
        domain->WaitUntilCommandQueueEmpty();
        ASSERT_EQ(accepted, ended);
        ASSERT_EQ(domain->m_Words.size(), static_cast<std::size_t>(accepted) + 1);
        ASSERT_EQ(domain->m_Words.back(), "last");
    }
}

TEST(DomainControllerTest, ReadersOverlapACommandThatHasGivenTheLockUp)
{
    auto const domain = MakeCounted<TestDomain>();
    domain->EnqueueCommandAndWait(Work([&](TestDomain & owner) {
        owner.m_Words.push_back("before");
        {
            DomainWriterUnlockSession const session{Counted<DomainController>(&owner)};
            EXPECT_FALSE(owner.IsWriterLockHeld());
            std::thread([&] {
                domain->AcquireReaderLock();
                EXPECT_THAT(domain->m_Words, ElementsAre("before"));
                domain->ReleaseReaderLock();
            }).join();
        }
        EXPECT_TRUE(owner.IsWriterLockHeld());
    }));
}

TEST(DomainControllerTest, NotificationsOfABatchAreFoldedByIdAndClass)
{
    struct Joining : TestNotification
    {
        using TestNotification::TestNotification;
        Counted<Kernel::Notification> Merge(Counted<Kernel::Notification> later) override
        {
            return MakeCounted<Joining>(m_Name + dynamic_cast<Joining const &>(*later).m_Name);
        }
    };
    RecordingSink sink;
    auto const domain = MakeCounted<TestDomain>();
    auto const command = Say("x");
    command->m_Says = {MakeCounted<TestNotification>("same", 7), MakeCounted<Joining>("j"),
                       MakeCounted<TestNotification>("plain"),   MakeCounted<TestNotification>("same", 7),
                       MakeCounted<Joining>("k"),                MakeCounted<TestNotification>("plain")};
    domain->EnqueueCommandAndWait(command);
    domain->SetSuppressNotifications(true);
    auto const quiet = Say("x");
    quiet->m_Says = {MakeCounted<TestNotification>("suppressed")};
    domain->EnqueueCommandAndWait(quiet);
    Kernel::Activity::WaitForRest();
    EXPECT_THAT(sink.Names(), ElementsAre("same", "jk", "plain", "plain"));
}

TEST(DomainControllerTest, ADroppedControllerRunsWhatItHasAccepted)
{
    auto domain = MakeCounted<TestDomain>();
    std::atomic<int> ran{0};
    for (int number = 0; number < 1000; ++number) {
        domain->EnqueueCommand(Work([&](TestDomain &) { ++ran; }));
    }
    domain.Reset();
    Kernel::Activity::WaitForRest();
    EXPECT_EQ(ran, 1000);
}

}
