#include "commands/BookBackgroundTaskCommand.h"

namespace Book
{

void BookBackgroundTaskCommand::PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller)
{
    BookCommand::PostDequeueWithMutableDomainController(controller);
    DomainBackgroundTaskCommand::PostDequeueWithMutableDomainController(controller);
}

}
