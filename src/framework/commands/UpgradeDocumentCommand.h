#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Has a document that came from a file of an older format written in the present one by the next save, also if nothing
/// else changes in it. Nothing for a document of the present format.
class UpgradeDocumentCommand : public PassingDocumentCommand
{
public:
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
};
