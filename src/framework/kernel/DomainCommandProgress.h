#pragma once

#include "framework/kernel/Progress.h"
#include "framework/kernel/StringT.h"

class DomainCommand;
class DomainController;

/// The progress of a command, shown by the front end under the command's description: each change goes to the domain's
/// `UpdateProgress`. Lives no longer than the command runs.
class DomainCommandProgress : public Kernel::Progress
{
public:
    DomainCommandProgress(String const & description, Kernel::Counted<DomainController> const & controller,
                          Kernel::NonCounted<DomainCommand const> const & command);

    [[nodiscard]] String const & GetDescription() const { return m_Description; }

protected:
    void OnChanged() override;

private:
    String const m_Description;
    Kernel::Counted<DomainController> const m_Controller;
    Kernel::NonCounted<DomainCommand const> const m_Command;
};
