#include "commands/BookBackgroundTaskCommand.h"

namespace Book
{

namespace
{

/// Not in the registry, and without a uid that could be.
constexpr Kernel::ClassProperties NoClass(Kernel::ClassUID(), nullptr, 0, {}, nullptr);

}

void BookBackgroundTaskCommand::PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller)
{
    BookCommand::PostDequeueWithMutableDomainController(controller);
    DomainBackgroundTaskCommand::PostDequeueWithMutableDomainController(controller);
}

Kernel::ClassProperties const & BookBackgroundTaskCommand::GetObjectClassProperties() const
{
    return NoClass;
}

}
