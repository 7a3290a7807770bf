#pragma once

#include "framework/kernel/Counted.h"
#include "framework/kernel/DomainCommand.h"
#include "framework/kernel/Notification.h"
#include "framework/kernel/StringT.h"

class DomainController;

/// A command is under way. Posted for domains that may show progress, for commands of type `ShowProgress`.
class CommandProgressNotification : public Kernel::Notification
{
public:
    /// \param fraction from 0 to 1
    CommandProgressNotification(Kernel::Counted<DomainController const> controller, String description, float fraction,
                                bool canAbort);
    ~CommandProgressNotification() override;

    [[nodiscard]] Kernel::Counted<DomainController const> const & GetDomainController() const { return m_Controller; }
    /// In the user's language.
    [[nodiscard]] String const & GetDescription() const { return m_Description; }
    [[nodiscard]] float GetFraction() const { return m_Fraction; }
    [[nodiscard]] bool CanAbort() const { return m_CanAbort; }

private:
    Kernel::Counted<DomainController const> const m_Controller;
    String const m_Description;
    float const m_Fraction;
    bool const m_CanAbort;
};

/// A command ended by an exception: its domain is as it was before.
class CommandFailedNotification : public Kernel::Notification
{
public:
    CommandFailedNotification(Kernel::Counted<DomainController const> controller, String description, String reason);
    ~CommandFailedNotification() override;

    /// Null for a command of the application.
    [[nodiscard]] Kernel::Counted<DomainController const> const & GetDomainController() const { return m_Controller; }
    [[nodiscard]] String const & GetDescription() const { return m_Description; }
    /// What went wrong, as the exception says it.
    [[nodiscard]] String const & GetReason() const { return m_Reason; }

private:
    Kernel::Counted<DomainController const> const m_Controller;
    String const m_Description;
    String const m_Reason;
};
