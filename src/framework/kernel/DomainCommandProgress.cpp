#include "framework/kernel/DomainCommandProgress.h"

#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/DomainController.h"

DomainCommandProgress::DomainCommandProgress(String const & description,
                                             Kernel::Counted<DomainController> const & controller,
                                             Kernel::NonCounted<DomainCommand const> const & command)
    : m_Description(description), m_Controller(controller), m_Command(command)
{
}

void DomainCommandProgress::OnChanged()
{
    if (m_Controller && m_Command) {
        m_Controller->UpdateProgress(m_Command.Get(), static_cast<float>(GetFraction()));
    }
}
