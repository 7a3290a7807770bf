#include "QueueFixtures.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/PostingFlag.h"
#include "framework/kernel/Question.h"
#include "framework/kernel/Semaphore.h"
#include "framework/kernel/TurnSession.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace
{

using Kernel::Activity;
using Kernel::Counted;
using Kernel::MakeCounted;
using Kernel::Question;
using Kernel::Semaphore;
using testing::ElementsAre;
using testing::IsEmpty;

void Post(std::string name)
{
    BroadcastNotification::Post(MakeCounted<TestNotification>(std::move(name)));
}

TEST(NotificationTest, AllSinksGetTheSameOrderFromManyPostingThreads)
{
    std::vector<std::uint64_t> numbers;
    RecordingSink first([&](TestNotification const & notification) { numbers.push_back(notification.GetPostingNumber()); });
    RecordingSink second;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([thread] {
            for (int number = 0; number < 300; ++number) {
                Post(std::to_string(thread) + ":" + std::to_string(number));
            }
        });
    }
    for (std::thread & thread : threads) {
        thread.join();
    }
    Activity::WaitForRest();
    EXPECT_EQ(first.Names().size(), 1200U);
    EXPECT_EQ(first.Names(), second.Names());
    EXPECT_TRUE(std::is_sorted(numbers.begin(), numbers.end()));
}

TEST(NotificationTest, ASinkThatIsStuckDelaysNobodyElseAndNobodyDeliversOnThePostersThread)
{
    Semaphore reached(0);
    Semaphore open(0);
    RecordingSink stuck([&](TestNotification const &) {
        reached.Signal();
        open.Wait(0);
    });
    Semaphore delivered(0);
    std::thread::id const poster = std::this_thread::get_id();
    RecordingSink quick([&](TestNotification const &) {
        EXPECT_NE(std::this_thread::get_id(), poster);
        delivered.Signal();
    });
    for (int number = 0; number < 3; ++number) {
        Post("n");
        delivered.Wait(0);
    }
    reached.Wait(0);
    EXPECT_EQ(stuck.Names().size(), 1U);
    for (int number = 0; number < 3; ++number) {
        open.Signal();
    }
    Activity::WaitForRest();
    EXPECT_EQ(stuck.Names().size(), 3U);
}

TEST(NotificationTest, AnUnregisteredSinkIsNotCalledAnyMore)
{
    for (int round = 0; round < 200; ++round) {
        auto const gone = std::make_shared<std::atomic<bool>>(false);
        {
            RecordingSink sink([gone](TestNotification const &) { EXPECT_FALSE(*gone); });
            std::thread poster([] {
                for (int number = 0; number < 5; ++number) {
                    Post("n");
                }
            });
            BroadcastNotification::UnregisterBroadcastSink(&sink);
            *gone = true;
            poster.join();
        }
    }
    Activity::WaitForRest();
}

class PassingNotification : public TestNotification
{
public:
    PassingNotification(std::string name, std::function<void()> passed)
        : TestNotification(std::move(name)), m_Passed(std::move(passed))
    {
        TellWhenPassed();
    }

protected:
    void OnPassedEveryLine() override { m_Passed(); }

private:
    std::function<void()> const m_Passed;
};

TEST(NotificationTest, ANotificationIsToldOnceThatItHasPassedEveryLine)
{
    std::atomic<int> passed{0};
    {
        Semaphore open(0);
        RecordingSink slow([&](TestNotification const &) { open.Wait(0); });
        RecordingSink other;
        RecordingSink leaving;
        BroadcastNotification::Post(MakeCounted<PassingNotification>("a", [&] {
            EXPECT_EQ(slow.Names().size(), 1U);
            ++passed;
        }));
        // What a line still holds when its sink goes has passed it.
        BroadcastNotification::UnregisterBroadcastSink(&leaving);
        EXPECT_EQ(passed, 0);
        open.Signal();
        Activity::WaitForRest();
    }
    EXPECT_EQ(passed, 1);
    BroadcastNotification::Post(MakeCounted<PassingNotification>("b", [&] { ++passed; }));
    Activity::WaitForRest();
    EXPECT_EQ(passed, 2);
}

TEST(NotificationTest, AFunctionLeftOnALineRunsThereBehindWhatWasPosted)
{
    std::vector<std::string> order;
    std::uint64_t line = 0;
    RecordingSink sink([&](TestNotification const & notification) {
        order.push_back(notification.m_Name);
        line = BroadcastNotification::CurrentLine();
        if (notification.m_Name == "a") {
            Post("b");
            BroadcastNotification::RunOnLine(line, [&] {
                EXPECT_EQ(BroadcastNotification::CurrentLine(), line);
                order.push_back("function");
            });
        }
    });
    Post("a");
    Activity::WaitForRest();
    EXPECT_THAT(order, ElementsAre("a", "b", "function"));
}

TEST(NotificationTest, AFlagStaysSetForWhatWasPostedWhileItWasSet)
{
    Kernel::PostingFlag flag;
    std::vector<std::string> seen;
    Semaphore open(0);
    RecordingSink sink([&](TestNotification const & notification) {
        if (notification.m_Name == "gate") {
            open.Wait(0);
            return;
        }
        seen.push_back(notification.m_Name + (flag.IsSet() ? " set" : " clear"));
    });
    // All of it is delivered after the flag has come and gone twice.
    Post("gate");
    Post("before");
    flag.Set(true);
    Post("during");
    flag.Set(false);
    Post("between");
    flag.Set(true);
    Post("again");
    flag.Set(false);
    Post("after");
    EXPECT_FALSE(flag.IsSet());
    open.Signal();
    Activity::WaitForRest();
    EXPECT_THAT(seen, ElementsAre("before clear", "during set", "between clear", "again set", "after clear"));
}

TEST(QuestionTest, AnAnswerRunsOnceAsATurnOfTheNamedDomain)
{
    auto const domain = MakeCounted<TestDomain>();
    std::vector<std::string> answers;
    auto const say = [&](std::string word) {
        return [&answers, domain, word] {
            EXPECT_TRUE(domain->IsWriterLockHeld());
            answers.push_back(word);
        };
    };
    {
        Question const question(domain, say("nothing"));
        question.MarkAsked();
        EXPECT_EQ(Activity::WaitForRest(), Activity::Rest::WaitingForUser);
        EXPECT_TRUE(question.Answer(say("yes")));
        EXPECT_FALSE(question.Answer(say("no")));
    }
    EXPECT_EQ(Activity::WaitForRest(), Activity::Rest::Idle);
    EXPECT_THAT(answers, ElementsAre("yes"));
}

TEST(QuestionTest, AQuestionAnswersItselfWithNothingWhenNobodyListensOrItsDomainCloses)
{
    auto const domain = MakeCounted<TestDomain>();
    std::atomic<int> nothing{0};
    {
        Question const question(domain, [&] { ++nothing; });
        Question const copy = question;
    }
    Activity::WaitForRest();
    EXPECT_EQ(nothing, 1) << "the last copy has gone";
    Question const open(domain, [&] {
        EXPECT_TRUE(domain->IsWriterLockHeld());
        ++nothing;
    });
    open.MarkAsked();
    domain->DisableCommandEnqueueAndEmpty();
    EXPECT_EQ(Activity::WaitForRest(), Activity::Rest::Idle);
    EXPECT_EQ(nothing, 2) << "the domain has closed";
    EXPECT_FALSE(open.Answer([] { FAIL() << "too late"; }));
    Question const late(domain, [&] { ++nothing; });
    Activity::WaitForRest();
    EXPECT_EQ(nothing, 3) << "asked about a closed domain";
}

TEST(QuestionTest, OneOfManyRacingAnswersWins)
{
    for (int round = 0; round < 100; ++round) {
        auto const domain = MakeCounted<TestDomain>();
        std::atomic<int> answers{0};
        {
            Question const question(domain, [&] { ++answers; });
            std::vector<std::thread> threads;
            for (int thread = 0; thread < 3; ++thread) {
                threads.emplace_back([&, thread] {
                    if (thread == 0) {
                        domain->DisableCommandEnqueueAndEmpty();
                    } else {
                        question.Answer([&] { ++answers; });
                    }
                });
            }
            for (std::thread & thread : threads) {
                thread.join();
            }
        }
        Activity::WaitForRest();
        ASSERT_EQ(answers, 1);
    }
}

TEST(TurnSessionTest, WhatIsKeptStaysToTheEndOfTheTurn)
{
    struct Witness : Kernel::Countable
    {
        explicit Witness(bool & gone) : m_Gone(gone) {}
        ~Witness() override { m_Gone = true; }
        bool & m_Gone;
    };
    bool gone = false;
    auto const domain = MakeCounted<TestDomain>();
    EXPECT_FALSE(Kernel::TurnSession::IsOpen());
    domain->EnqueueCommandAndWait(Work([&](TestDomain &) {
        Kernel::TurnSession::Keep(MakeCounted<Witness>(gone));
        EXPECT_FALSE(gone);
        Kernel::TurnSession const inner;
        EXPECT_FALSE(gone);
    }));
    EXPECT_TRUE(gone);
}

}
