#include "QueueFixtures.h"

#include "framework/kernel/DomainWriterUnlockSession.h"
#include "framework/kernel/Semaphore.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace
{

using Kernel::Counted;
using Kernel::MakeCounted;
using Kernel::Semaphore;

/// Yields until something that another thread is on its way to has come true.
template <typename TCondition>
void Await(TCondition condition)
{
    while (!condition()) {
        std::this_thread::yield();
    }
}

TEST(ReaderWriterLockTest, WritersExcludeEverybodyAndReadersOnlyWriters)
{
    auto const domain = MakeCounted<TestDomain>();
    std::atomic<int> readers{0};
    std::atomic<int> mostReaders{0};
    int value = 0;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 3; ++thread) {
        threads.emplace_back([&] {
            for (int round = 0; round < 2000; ++round) {
                domain->AcquireReaderLock();
                int const now = ++readers;
                int most = mostReaders;
                while (now > most && !mostReaders.compare_exchange_weak(most, now)) {
                }
                EXPECT_EQ(value % 2, 0);
                --readers;
                domain->ReleaseReaderLock();
            }
        });
        threads.emplace_back([&] {
            for (int round = 0; round < 1000; ++round) {
                domain->AcquireWriterLock();
                EXPECT_EQ(readers, 0);
                ++value;
                ++value;
                domain->ReleaseWriterLock();
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    EXPECT_EQ(value, 6000);
}

TEST(ReaderWriterLockTest, AWriterIsNotStarvedByReadersThatKeepComing)
{
    auto const domain = MakeCounted<TestDomain>();
    std::atomic<bool> stop{false};
    std::vector<std::thread> readers;
    // Two that overlap for ever, were it not for the writer's right to go before who comes later.
    for (int thread = 0; thread < 2; ++thread) {
        readers.emplace_back([&] {
            while (!stop) {
                domain->AcquireReaderLock();
                std::this_thread::yield();
                domain->ReleaseReaderLock();
            }
        });
    }
    for (int round = 0; round < 50; ++round) {
        domain->EnqueueCommandAndWait(Say("x"));
    }
    stop = true;
    for (std::thread & thread : readers) {
        thread.join();
    }
    EXPECT_EQ(domain->m_Words.size(), 50U);
}

TEST(ReaderWriterLockTest, AReaderIsNotStarvedByAQueueThatIsNeverEmpty)
{
    auto const domain = MakeCounted<TestDomain>();
    std::atomic<bool> stop{false};
    std::function<void(TestDomain &)> again = [&](TestDomain & owner) {
        if (!stop) {
            owner.EnqueueCommand(Work(again));
        }
    };
    domain->EnqueueCommand(Work(again));
    for (int round = 0; round < 50; ++round) {
        domain->AcquireReaderLock();
        domain->ReleaseReaderLock();
    }
    stop = true;
    domain->WaitUntilCommandQueueEmpty();
}

TEST(ReaderWriterLockTest, WhoHoldsItInAnyFormReadsAtOnceAlsoWithAWriterWaiting)
{
    auto const domain = MakeCounted<TestDomain>();
    domain->AcquireReaderLock();
    std::thread writer([&] {
        domain->AcquireWriterLock();
        domain->AcquireReaderLock();
        domain->ReleaseReaderLock();
        domain->ReleaseWriterLock();
    });
    Await([&] { return domain->IsWriterWaiting(); });
    domain->AcquireReaderLock();
    domain->ReleaseReaderLock();
    domain->ReleaseReaderLock();
    writer.join();
}

TEST(ReaderWriterLockTest, AWriterThatGoesOnReadingKeepsOtherWritersOut)
{
    struct Counting : TestDomain
    {
        void OnAcquireReaderLock() const override { ++m_Reading; }
        void OnReleaseReaderLock() const override { --m_Reading; }
        mutable int m_Reading = 0;
    };
    auto const domain = MakeCounted<Counting>();
    domain->AcquireWriterLock();
    domain->AcquireReaderLock();
    EXPECT_EQ(domain->m_Reading, 0) << "covered by the writing";
    domain->ReleaseWriterLock();
    EXPECT_EQ(domain->m_Reading, 1);
    std::atomic<bool> written{false};
    std::thread writer([&] {
        domain->AcquireWriterLock();
        written = true;
        domain->ReleaseWriterLock();
    });
    Await([&] { return written || domain->IsWriterWaiting(); });
    EXPECT_FALSE(written);
    domain->ReleaseReaderLock();
    writer.join();
    EXPECT_TRUE(written);
    EXPECT_EQ(domain->m_Reading, 0);
}

TEST(ReaderWriterLockTest, TheHooksAreCalledForTheOutermostReadOnly)
{
    struct Counting : TestDomain
    {
        void OnAcquireReaderLock() const override { ++m_Acquired; }
        void OnReleaseReaderLock() const override { ++m_Released; }
        mutable int m_Acquired = 0;
        mutable int m_Released = 0;
    };
    auto const domain = MakeCounted<Counting>();
    domain->AcquireReaderLock();
    domain->AcquireReaderLock();
    domain->ReleaseReaderLock();
    EXPECT_EQ(domain->m_Released, 0);
    domain->ReleaseReaderLock();
    EXPECT_EQ(domain->m_Acquired, 1);
    EXPECT_EQ(domain->m_Released, 1);
}

TEST(ReaderWriterLockTest, AReaderWhoseTurnIsWaitedForGetsTheLockOfTheWaitingTurn)
{
    auto const book = MakeCounted<TestDomain>();
    auto const document = MakeCounted<TestDomain>();
    Semaphore busy(0);
    Semaphore waited(0);
    // The document's queue is at work already, so that the book's turn sleeps while its command runs elsewhere.
    document->EnqueueCommand(Work([&](TestDomain &) {
        busy.Signal();
        waited.Wait(0);
    }));
    busy.Wait(0);
    book->EnqueueCommandAndWait(Work([&](TestDomain & owner) {
        waited.Signal();
        document->EnqueueCommandAndWait(Work([&](TestDomain &) {
            book->AcquireReaderLock();
            owner.m_Words.push_back("read");
            book->ReleaseReaderLock();
        }));
    }));
    EXPECT_EQ(book->m_Words.size(), 1U);
}

TEST(ReaderWriterLockTest, AnUnlockSessionGivesTheWholeHoldUpAndTakesItBack)
{
    auto const domain = MakeCounted<TestDomain>();
    domain->AcquireWriterLock();
    domain->AcquireWriterLock();
    {
        DomainWriterUnlockSession const session{Counted<DomainController>(domain)};
        std::thread([&] {
            domain->AcquireWriterLock();
            domain->ReleaseWriterLock();
        }).join();
    }
    domain->ReleaseWriterLock();
    EXPECT_TRUE(domain->IsWriterLockHeld());
    domain->ReleaseWriterLock();
    EXPECT_FALSE(domain->IsWriterLockHeld());
    // Without the lock there is nothing to give up.
    DomainWriterUnlockSession const session{Counted<DomainController>(domain)};
}

TEST(ReaderWriterLockTest, ALongReaderCanLetOthersInAheadOfAWaitingCommand)
{
    struct Yielding : TestDomain
    {
        void PeriodicWhileAwaitingReaderUnlock(bool & letReadersIn, bool & quiet) override
        {
            letReadersIn = true;
            quiet = false;
        }
    };
    auto const domain = MakeCounted<Yielding>();
    domain->AcquireReaderLock();
    domain->EnqueueCommand(Say("x"));
    Await([&] { return domain->IsWriterWaiting(); });
    std::thread([&] {
        domain->AcquireReaderLock();
        domain->ReleaseReaderLock();
    }).join();
    domain->ReleaseReaderLock();
    domain->WaitUntilCommandQueueEmpty();
}

}
