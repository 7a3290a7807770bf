#pragma once

#include "commands/BookBackgroundTaskCommand.h"

namespace Book
{

/// One background pass: opens every chapter in turn to bring its record up to date, or looks only at those that the
/// user has open.
class UpdateChaptersCommand final : public BookBackgroundTaskCommand
{
public:
    explicit UpdateChaptersCommand(bool foregroundOnly);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    bool m_ForegroundOnly;
};

}
