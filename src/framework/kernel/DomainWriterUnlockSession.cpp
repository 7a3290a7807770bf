#include "framework/kernel/DomainWriterUnlockSession.h"

#include "framework/kernel/DomainController.h"
#include "framework/kernel/ReaderWriterLock.h"

#include <utility>

DomainWriterUnlockSession::DomainWriterUnlockSession(Kernel::Counted<DomainController> controller)
    : m_Controller(std::move(controller)), m_Hold(m_Controller ? m_Controller->m_Lock->SetAside() : nullptr)
{
}

DomainWriterUnlockSession::~DomainWriterUnlockSession()
{
    if (m_Hold) {
        m_Controller->m_Lock->TakeBack(std::move(m_Hold));
    }
}
