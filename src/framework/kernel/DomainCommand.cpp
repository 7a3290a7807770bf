#include "framework/kernel/DomainCommand.h"

#include "framework/kernel/DomainBackgroundTaskCommand.h"
#include "framework/kernel/DomainController.h"

#include <typeinfo>

bool DomainCommand::IsAnotherAlreadyInQueue(Kernel::Counted<DomainCommand> const & other) const
{
    DomainCommand const & command = *other;
    return typeid(*this) == typeid(command);
}

void DomainBackgroundTaskCommand::PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller)
{
    m_Controller = controller;
}
