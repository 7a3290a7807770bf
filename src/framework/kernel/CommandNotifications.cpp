#include "framework/kernel/CommandNotifications.h"

#include "framework/kernel/DomainController.h"

#include <utility>

CommandProgressNotification::CommandProgressNotification(Kernel::Counted<DomainController const> controller,
                                                         String description, float fraction, bool canAbort)
    : m_Controller(std::move(controller)), m_Description(std::move(description)), m_Fraction(fraction),
      m_CanAbort(canAbort)
{
}

CommandProgressNotification::~CommandProgressNotification() = default;

CommandFailedNotification::CommandFailedNotification(Kernel::Counted<DomainController const> controller,
                                                     String description, String reason)
    : m_Controller(std::move(controller)), m_Description(std::move(description)), m_Reason(std::move(reason))
{
}

CommandFailedNotification::~CommandFailedNotification() = default;
