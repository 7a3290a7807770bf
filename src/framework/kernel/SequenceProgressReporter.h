#pragma once

#include "framework/kernel/Progress.h"
#include "framework/kernel/ProgressReporter.h"

#include <vector>

namespace Kernel
{

/// Divides one progress bar into stages that run one after the other. A stage may be left out; beginning one counts
/// those before it as done. Safe on any thread.
class SequenceProgressReporter : public ProgressReporter
{
public:
    /// So many stages of equal length.
    explicit SequenceProgressReporter(unsigned long long count);
    /// One stage for each weight, as long as its share of the sum. Negative weights count as 0; if all are 0, the stages
    /// are equal.
    explicit SequenceProgressReporter(std::vector<float> const & weights);
    ~SequenceProgressReporter() override;

    /// The stage's own progress object, to be handed to the work. An index past the end counts as the last.
    Counted<Progress> BeginItemAtIndex(unsigned long long index);
    /// The stage that was begun last is done. Gives its progress object, at 1; null if none is under way.
    Counted<Progress> ItemComplete();

    [[nodiscard]] double GetProgress() const override;

private:
    class Stage;

    void StageChanged() const { Changed(); }

    /// Share of the whole that lies before each stage, and 1 at the end.
    std::vector<double> m_Starts;
    mutable CriticalSection m_Lock;
    Counted<Stage> m_Stage KORVANE_GUARDED_BY(m_Lock);
    unsigned long long m_Index KORVANE_GUARDED_BY(m_Lock) = 0;
    double m_Done KORVANE_GUARDED_BY(m_Lock) = 0;
};

}
