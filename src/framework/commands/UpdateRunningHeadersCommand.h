#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Brings what running heads show in step with title and text. Leaves the document clean and the history alone.
class UpdateRunningHeadersCommand : public PassingDocumentCommand
{
public:
    UpdateRunningHeadersCommand() = default;

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
};
