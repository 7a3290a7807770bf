#include "framework/kernel/DomainWriterUnlockSession.h"

#include "framework/kernel/DomainController.h"
#include "framework/kernel/ReaderWriterLock.h"

#include <utility>

DomainWriterUnlockSession::DomainWriterUnlockSession(Kernel::Counted<DomainController> controller)
    : m_Controller(std::move(controller)), m_Depth(m_Controller ? m_Controller->m_Lock->SetAside() : 0)
{
}

DomainWriterUnlockSession::~DomainWriterUnlockSession()
{
    if (m_Depth > 0) {
        m_Controller->m_Lock->TakeBack(m_Depth);
    }
}
