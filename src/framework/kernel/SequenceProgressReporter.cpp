#include "framework/kernel/SequenceProgressReporter.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace Kernel
{

/// The progress of one stage; it tells the sequence, which may have gone before the work lets go of the stage.
class SequenceProgressReporter::Stage final : public Progress
{
public:
    explicit Stage(SequenceProgressReporter * sequence) : m_Sequence(sequence) {}

    void LetGo()
    {
        ScopedLock const lock(m_SequenceLock);
        m_Sequence = nullptr;
    }

private:
    void OnChanged() override
    {
        Counted<SequenceProgressReporter> sequence;
        {
            ScopedLock const lock(m_SequenceLock);
            if (!m_Sequence || !m_Sequence->RetainIfAlive()) {
                return;
            }
            sequence = m_Sequence;
            m_Sequence->Release();
        }
        sequence->Changed();
    }

    CriticalSection m_SequenceLock;
    SequenceProgressReporter * m_Sequence KORVANE_GUARDED_BY(m_SequenceLock);
};

namespace
{

std::vector<float> EqualWeights(unsigned long long count)
{
    return std::vector<float>(static_cast<std::size_t>(count), 1.0F);
}

}

SequenceProgressReporter::SequenceProgressReporter(unsigned long long count)
    : SequenceProgressReporter(EqualWeights(count))
{
}

SequenceProgressReporter::SequenceProgressReporter(std::vector<float> const & weights)
{
    auto const usable = [](float weight) { return std::isfinite(weight) && weight > 0 ? double(weight) : 0.0; };
    double sum = 0;
    for (float const weight : weights) {
        sum += usable(weight);
    }
    double const equal = sum > 0 ? 0.0 : 1.0;
    sum = sum > 0 ? sum : static_cast<double>(std::max<std::size_t>(1, weights.size()));
    double start = 0;
    m_Starts.reserve(weights.size() + 1);
    for (float const weight : weights) {
        m_Starts.push_back(std::min(1.0, start / sum));
        start += equal > 0 ? equal : usable(weight);
    }
    m_Starts.push_back(1.0);
}

SequenceProgressReporter::~SequenceProgressReporter()
{
    if (m_Stage) {
        m_Stage->LetGo();
    }
}

Counted<Progress> SequenceProgressReporter::BeginItemAtIndex(unsigned long long index)
{
    auto const stage = MakeCounted<Stage>(this);
    Counted<Stage> former;
    {
        ScopedLock const lock(m_Lock);
        former = std::exchange(m_Stage, stage);
        std::size_t const last = m_Starts.size() < 2 ? 0 : m_Starts.size() - 2;
        m_Index = std::min<unsigned long long>(index, last);
        m_Done = m_Starts[static_cast<std::size_t>(m_Index)];
    }
    if (former) {
        former->LetGo();
    }
    Changed();
    return stage;
}

Counted<Progress> SequenceProgressReporter::ItemComplete()
{
    Counted<Stage> stage;
    {
        ScopedLock const lock(m_Lock);
        stage.Swap(m_Stage);
        if (!stage) {
            return nullptr;
        }
        m_Done = m_Starts[std::min(static_cast<std::size_t>(m_Index) + 1, m_Starts.size() - 1)];
    }
    stage->LetGo();
    stage->SetReporter(nullptr);
    stage->SetFraction(1);
    Changed();
    return stage;
}

double SequenceProgressReporter::GetProgress() const
{
    Counted<Stage> stage;
    double start = 0;
    double end = 0;
    {
        ScopedLock const lock(m_Lock);
        stage = m_Stage;
        start = m_Done;
        end = m_Starts[std::min(static_cast<std::size_t>(m_Index) + 1, m_Starts.size() - 1)];
    }
    return stage ? start + (end - start) * stage->GetFraction() : start;
}

}
