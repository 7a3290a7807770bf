#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/CriticalSection.h"
#include "framework/kernel/ProgressReporter.h"
#include "framework/kernel/ThreadSafety.h"

namespace Kernel
{

/// What a long piece of work reports to: how much of it is done, from 0 to 1. Either the work sets it itself, or a
/// reporter that divides the work into stages is attached. Safe on any thread.
class Progress : public virtual Countable
{
public:
    /// Attaches a reporter: from now on its value is this one's, and each change of it shows here. Null detaches.
    void SetReporter(Counted<ProgressReporter> const & reporter);

    /// Values outside of 0 to 1 are clipped.
    void SetFraction(double fraction);
    [[nodiscard]] double GetFraction() const;

protected:
    ~Progress() override;

    /// The value has changed. Called on the thread that changed it, without a lock.
    virtual void OnChanged() {}

private:
    friend class ProgressReporter;

    CriticalSection m_Lock;
    Counted<ProgressReporter> m_Reporter KORVANE_GUARDED_BY(m_Lock);
    double m_Fraction KORVANE_GUARDED_BY(m_Lock) = 0;
};

}
