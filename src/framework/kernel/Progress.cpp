#include "framework/kernel/Progress.h"

#include <algorithm>

namespace Kernel
{

Progress::~Progress()
{
    if (m_Reporter) {
        m_Reporter->SetOwner(nullptr);
    }
}

void Progress::SetReporter(Counted<ProgressReporter> const & reporter)
{
    Counted<ProgressReporter> former;
    {
        ScopedLock const lock(m_Lock);
        former = m_Reporter;
        m_Reporter = reporter;
    }
    if (former) {
        former->SetOwner(nullptr);
    }
    if (reporter) {
        reporter->SetOwner(this);
        OnChanged();
    }
}

void Progress::SetFraction(double fraction)
{
    {
        ScopedLock const lock(m_Lock);
        m_Fraction = std::clamp(fraction, 0.0, 1.0);
    }
    OnChanged();
}

double Progress::GetFraction() const
{
    Counted<ProgressReporter> reporter;
    {
        ScopedLock const lock(m_Lock);
        if (!m_Reporter) {
            return m_Fraction;
        }
        reporter = m_Reporter;
    }
    return std::clamp(reporter->GetProgress(), 0.0, 1.0);
}

void ProgressReporter::SetOwner(Progress * owner)
{
    ScopedLock const lock(m_OwnerLock);
    m_Owner = owner;
}

void ProgressReporter::Changed() const
{
    Counted<Progress> owner;
    {
        ScopedLock const lock(m_OwnerLock);
        if (!m_Owner || !m_Owner->RetainIfAlive()) {
            return;
        }
        owner = m_Owner;
        m_Owner->Release();
    }
    owner->OnChanged();
}

}
