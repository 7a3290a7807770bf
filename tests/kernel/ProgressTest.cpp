#include "QueueFixtures.h"

#include "framework/kernel/Activity.h"
#include "framework/kernel/CommandNotifications.h"
#include "framework/kernel/DomainCommandProgress.h"
#include "framework/kernel/SequenceProgressReporter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <mutex>

namespace
{

using Kernel::Counted;
using Kernel::MakeCounted;
using Kernel::Progress;
using Kernel::SequenceProgressReporter;
using testing::ElementsAre;

class WatchedProgress : public Progress
{
public:
    std::vector<double> m_Values;

protected:
    void OnChanged() override { m_Values.push_back(GetFraction()); }
};

TEST(ProgressTest, StagesTakeTheirShareByCountOrWeight)
{
    struct Row
    {
        char const * m_Why;
        std::vector<float> m_Weights;
        unsigned long long m_Index;
        double m_AtBegin;
        double m_HalfWay;
        double m_AtEnd;
    };
    Row const rows[] = {
        {"equal stages", {1, 1, 1, 1}, 1, 0.25, 0.375, 0.5},
        {"by weight", {1, 3}, 1, 0.25, 0.625, 1},
        {"a stage without weight takes nothing", {0, 1, 0}, 2, 1, 1, 1},
        {"without any weight all are equal", {0, 0}, 1, 0.5, 0.75, 1},
        {"an index past the end is the last", {1, 1}, 7, 0.5, 0.75, 1},
        {"a weight that is no number counts as none", {-1, 2, 2}, 1, 0, 0.25, 0.5},
    };
    for (Row const & row : rows) {
        SCOPED_TRACE(row.m_Why);
        auto const reporter = MakeCounted<SequenceProgressReporter>(row.m_Weights);
        Counted<Progress> const stage = reporter->BeginItemAtIndex(row.m_Index);
        EXPECT_DOUBLE_EQ(reporter->GetProgress(), row.m_AtBegin);
        stage->SetFraction(0.5);
        EXPECT_DOUBLE_EQ(reporter->GetProgress(), row.m_HalfWay);
        EXPECT_EQ(reporter->ItemComplete(), stage);
        EXPECT_DOUBLE_EQ(reporter->GetProgress(), row.m_AtEnd);
        EXPECT_EQ(reporter->ItemComplete(), nullptr);
    }
}

TEST(ProgressTest, AChangeDeepInsideShowsAtTheTop)
{
    auto const top = MakeCounted<WatchedProgress>();
    auto const outer = MakeCounted<SequenceProgressReporter>(2ULL);
    top->SetReporter(outer);
    Counted<Progress> const stage = outer->BeginItemAtIndex(1);
    auto const inner = MakeCounted<SequenceProgressReporter>(4ULL);
    stage->SetReporter(inner);
    top->m_Values.clear();
    inner->BeginItemAtIndex(2)->SetFraction(0.5);
    EXPECT_THAT(top->m_Values, ElementsAre(0.75, 0.8125));
    inner->ItemComplete();
    outer->ItemComplete();
    EXPECT_DOUBLE_EQ(top->GetFraction(), 1);
    // Work that holds on to its stage does no harm once the sequence has gone on.
    stage->SetFraction(0.1);
    EXPECT_DOUBLE_EQ(top->GetFraction(), 1);
}

class ShownCommand : public TestCommand
{
public:
    using TestCommand::TestCommand;
    ProgressType GetProgressType() override { return ShowProgress; }
    int GetProgressInterval() const override { return 1000000; }
};

struct ProgressSink : BroadcastNotificationSink
{
    ProgressSink() { BroadcastNotification::RegisterBroadcastSink(this); }
    ~ProgressSink() override { BroadcastNotification::UnregisterBroadcastSink(this); }
    void Notify(Counted<Kernel::Notification> notification) override
    {
        if (auto const progress = Kernel::CountedCast<CommandProgressNotification>(notification)) {
            m_Fractions.push_back(progress->GetFraction());
        }
    }
    std::vector<float> m_Fractions;
};

TEST(ProgressTest, ACommandsProgressIsPostedAtItsIntervalAndAtBothEnds)
{
    ProgressSink sink;
    auto const domain = MakeCounted<TestDomain>();
    Counted<ShownCommand> command;
    command = MakeCounted<ShownCommand>([&](TestDomain & owner) {
        auto const progress = MakeCounted<DomainCommandProgress>("Test", Counted<DomainController>(&owner),
                                                                 Kernel::NonCounted<DomainCommand const>(command.Get()));
        for (double const fraction : {0.0, 0.2, 0.4, 1.0}) {
            progress->SetFraction(fraction);
        }
        owner.SetCanShowProgress(false);
        progress->SetFraction(1.0);
    });
    domain->EnqueueCommandAndWait(command);
    Kernel::Activity::WaitForRest();
    EXPECT_THAT(sink.m_Fractions, ElementsAre(0.0F, 1.0F));
}

}
