#pragma once

#include "framework/kernel/Counted.h"

class DomainController;

/// Gives up a domain's writer lock, however often the thread has taken it, for its own lifetime, and takes it back as it
/// was. For a command that waits for other commands, for an answer, or does long work that readers may overlap. Nothing
/// read from the domain before is certain afterwards. Does nothing on a thread that does not hold the lock.
class DomainWriterUnlockSession
{
public:
    explicit DomainWriterUnlockSession(Kernel::Counted<DomainController> controller);
    ~DomainWriterUnlockSession();
    DomainWriterUnlockSession(DomainWriterUnlockSession const &) = delete;
    DomainWriterUnlockSession & operator=(DomainWriterUnlockSession const &) = delete;

private:
    Kernel::Counted<DomainController> const m_Controller;
    /// How often the thread had taken the lock; 0: it does not hold it.
    int const m_Depth;
};
