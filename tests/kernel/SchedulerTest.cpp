#include "QueueFixtures.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/BackgroundTask.h"
#include "framework/kernel/Clock.h"
#include "framework/kernel/DomainBackgroundTaskCommand.h"
#include "framework/kernel/Scheduler.h"
#include "framework/kernel/Semaphore.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <future>
#include <latch>
#include <optional>
#include <thread>

namespace
{

using Kernel::Activity;
using Kernel::Counted;
using Kernel::MakeCounted;
using Kernel::Semaphore;
using testing::ElementsAre;

TEST(SchedulerTest, TurnsThatTakeLongDrawInFewThreads)
{
    constexpr int Turns = 400;
    std::size_t const before = Kernel::Scheduler::GetNumberOfThreads();
    std::latch ended(Turns);
    for (int number = 0; number < Turns; ++number) {
        Kernel::Scheduler::Run([&] {
            // Busy, not asleep: no further thread would be of help.
            auto const until = std::chrono::steady_clock::now() + std::chrono::milliseconds(1);
            while (std::chrono::steady_clock::now() < until) {
            }
            ended.count_down();
        });
    }
    ended.wait();
    std::size_t const processors = std::thread::hardware_concurrency();
    EXPECT_LE(Kernel::Scheduler::GetNumberOfThreads(), std::max(before, processors) + 16);
}

TEST(SchedulerTest, ThePoolGrowsWhileAllItsThreadsAreBlocked)
{
    constexpr int Blocked = 40;
    Semaphore release(0);
    Semaphore reached(0);
    Semaphore ended(0);
    for (int number = 0; number < Blocked; ++number) {
        Kernel::Scheduler::Run([&] {
            reached.Signal();
            release.Wait(0);
            ended.Signal();
        });
    }
    for (int number = 0; number < Blocked; ++number) {
        reached.Wait(0);
    }
    EXPECT_GE(Kernel::Scheduler::GetNumberOfThreads(), static_cast<std::size_t>(Blocked));
    Semaphore another(0);
    Kernel::Scheduler::Run([&] { another.Signal(); });
    another.Wait(0);
    for (int number = 0; number < Blocked; ++number) {
        release.Signal();
    }
    for (int number = 0; number < Blocked; ++number) {
        ended.Wait(0);
    }
}

TEST(SchedulerTest, ThePoolGrowsAlsoWhereItCannotSeeThatItsThreadsAreBlocked)
{
    constexpr int Blocked = 8;
    std::promise<void> release;
    std::shared_future<void> const released = release.get_future().share();
    std::latch reached(Blocked);
    std::latch ended(Blocked);
    for (int number = 0; number < Blocked; ++number) {
        Kernel::Scheduler::Run([&] {
            reached.count_down();
            released.wait();
            ended.count_down();
        });
    }
    reached.wait();
    release.set_value();
    ended.wait();
}

TEST(SchedulerTest, AnIdleQueueIsWorkedByWhoWaitsForIt)
{
    auto const domain = MakeCounted<TestDomain>();
    std::thread::id ranOn;
    domain->EnqueueCommandAndWait(Work([&](TestDomain &) { ranOn = std::this_thread::get_id(); }));
    EXPECT_EQ(ranOn, std::this_thread::get_id());
}

/// Puts a clock in that stands until it is moved.
class StandingClock
{
public:
    StandingClock() : m_Clock(Kernel::TimeStamp(0)) { Kernel::Clock::Set(&m_Clock); }
    ~StandingClock() { Kernel::Clock::Set(nullptr); }
    void Advance(int milliseconds)
    {
        m_Clock.Advance(std::chrono::milliseconds(milliseconds));
        Kernel::Scheduler::PollTimers();
    }

private:
    Kernel::ManualClock m_Clock;
};

class TestTask : public BackgroundTask
{
public:
    using Generator = std::function<Counted<DomainCommand>(TestTask &)>;
    TestTask(int interval, bool whileOccupied, bool gathers, Generator generate)
        : BackgroundTask(interval, whileOccupied, gathers), m_Generate(std::move(generate))
    {
    }
    Counted<DomainCommand> GenerateCommand() override { return m_Generate(*this); }

private:
    Generator const m_Generate;
};

Counted<TestDomain> PumpedDomain()
{
    auto const domain = MakeCounted<TestDomain>();
    domain->SetWantBackgroundTasks(true);
    domain->StartBackgroundTaskPump();
    return domain;
}

TEST(BackgroundTaskTest, ADirtyTaskFiresAfterItsIntervalAndABurstCostsOneCommand)
{
    StandingClock clock;
    auto const domain = PumpedDomain();
    Semaphore ran(0);
    auto const task = MakeCounted<TestTask>(100, true, true, [&](TestTask & self) {
        return Work([&, keep = Counted<TestTask>(&self)](TestDomain & owner) {
            owner.m_Words.push_back("pass");
            keep->Clean();
            ran.Signal();
        });
    });
    domain->AddBackgroundTask(task);
    for (int number = 0; number < 5; ++number) {
        task->Dirty();
    }
    clock.Advance(99);
    domain->WaitUntilCommandQueueEmpty();
    EXPECT_TRUE(domain->m_Words.empty());
    EXPECT_TRUE(task->IsDirty());
    clock.Advance(1);
    ran.Wait(0);
    EXPECT_EQ(Activity::WaitForRest(), Activity::Rest::Idle);
    EXPECT_THAT(domain->m_Words, ElementsAre("pass"));
    EXPECT_FALSE(task->IsDirty());
}

TEST(BackgroundTaskTest, WhatGetsDirtyWhileTheCommandRunsStaysDirtyAfterItsClean)
{
    auto const domain = PumpedDomain();
    std::atomic<int> passes{0};
    Counted<TestTask> const task = MakeCounted<TestTask>(1, true, true, [&](TestTask & self) {
        return Work([&, keep = Counted<TestTask>(&self)](TestDomain &) {
            if (++passes == 1) {
                keep->Dirty();
            }
            keep->Clean();
        });
    });
    domain->AddBackgroundTask(task);
    task->Dirty();
    Activity::WaitForRest();
    EXPECT_EQ(passes, 2);
    EXPECT_FALSE(task->IsDirty());
}

TEST(BackgroundTaskTest, WaitingForRestFiresDirtyTasksAtOnceHoweverTheClockStands)
{
    StandingClock clock;
    auto const domain = PumpedDomain();
    int passes = 0;
    for (bool const gathers : {false, true}) {
        auto const task = MakeCounted<TestTask>(1000000, false, gathers, [&](TestTask & self) {
            return Work([&, keep = Counted<TestTask>(&self)](TestDomain &) {
                ++passes;
                keep->Clean();
            });
        });
        domain->AddBackgroundTask(task);
        task->Dirty();
        Activity::WaitForRest();
        EXPECT_FALSE(task->IsDirty());
    }
    EXPECT_EQ(passes, 2);
}

TEST(BackgroundTaskTest, APoliteTaskLetsTheQueueRunEmptyFirst)
{
    auto const domain = PumpedDomain();
    Semaphore reached(0);
    Semaphore open(0);
    auto const task = MakeCounted<TestTask>(0, false, false, [&](TestTask & self) {
        return Work([&, keep = Counted<TestTask>(&self)](TestDomain & owner) {
            owner.m_Words.push_back("task");
            keep->Clean();
        });
    });
    domain->AddBackgroundTask(task);
    domain->EnqueueCommand(Work([&](TestDomain &) {
        reached.Signal();
        open.Wait(0);
    }));
    reached.Wait(0);
    task->Dirty();
    domain->EnqueueCommand(Say("a"));
    domain->EnqueueCommand(Say("b"));
    open.Signal();
    Activity::WaitForRest();
    EXPECT_THAT(domain->m_Words, ElementsAre("a", "b", "task"));
}

TEST(BackgroundTaskTest, AnUnwantedOrClosedDomainsTaskRestsAndKeepsNobodyWaiting)
{
    auto const domain = MakeCounted<TestDomain>();
    auto const task = MakeCounted<TestTask>(0, true, false, [](TestTask & self) {
        return Work([keep = Counted<TestTask>(&self)](TestDomain & owner) {
            owner.m_Words.push_back("task");
            keep->Clean();
        });
    });
    domain->AddBackgroundTask(task);
    task->Dirty();
    Activity::WaitForRest();
    EXPECT_TRUE(domain->m_Words.empty());
    domain->StartBackgroundTaskPump();
    domain->SetWantBackgroundTasks(true);
    Activity::WaitForRest();
    EXPECT_EQ(domain->m_Words.size(), 1U);
    domain->DisableCommandEnqueueAndEmpty();
    task->Dirty();
    Activity::WaitForRest();
    EXPECT_EQ(domain->m_Words.size(), 1U);
}

TEST(BackgroundTaskTest, TasksOfDomainsThatComeAndGoUnderFireLoseNothingAndCrashNothing)
{
    std::atomic<int> passes{0};
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 3; ++thread) {
        threads.emplace_back([&] {
            for (int round = 0; round < 100; ++round) {
                auto domain = PumpedDomain();
                auto const task = MakeCounted<TestTask>(0, round % 2 == 0, round % 3 == 0, [&](TestTask & self) {
                    return Work([&, keep = Counted<TestTask>(&self)](TestDomain &) {
                        ++passes;
                        keep->Clean();
                    });
                });
                domain->AddBackgroundTask(task);
                task->Dirty();
                domain->EnqueueCommand(Say("x"));
                if (round % 5 == 0) {
                    domain->DisableCommandEnqueueAndEmpty();
                }
                domain.Reset();
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    EXPECT_EQ(Activity::WaitForRest(), Activity::Rest::Idle);
    EXPECT_GE(passes, 240);
}

}
