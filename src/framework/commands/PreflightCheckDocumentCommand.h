#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Looks for what would spoil the output: pictures that are missing or have changed since they were taken in, fonts
/// that are not installed, characters that no font has, text without a place. The results hang in the document
/// afterwards.
class PreflightCheckDocumentCommand : public PassingDocumentCommand
{
public:
    explicit PreflightCheckDocumentCommand(enum PreflightForOperation operation) : m_Operation(operation) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    enum PreflightForOperation const m_Operation;
};
