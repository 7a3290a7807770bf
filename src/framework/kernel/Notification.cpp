#include "framework/kernel/Notification.h"

namespace Kernel
{

Counted<Notification> Notification::Merge(Counted<Notification>)
{
    return nullptr;
}

}
