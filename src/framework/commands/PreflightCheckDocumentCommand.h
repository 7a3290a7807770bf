#pragma once

#include "framework/commands/DocumentCommandBase.h"

#include <optional>

/// Looks for what would spoil the output: pictures that are missing, locked, too coarse or not what they were; fonts
/// that are not installed, characters that no font has, text without a place; references that lead nowhere, anchors
/// without a name, generated parts that are not up to date. The results hang in the document afterwards.
class PreflightCheckDocumentCommand : public PassingDocumentCommand
{
public:
    explicit PreflightCheckDocumentCommand(enum PreflightForOperation operation) : m_Operation(operation) {}

    /// The colour format of the publication that the document is part of; a document of another format is then
    /// reported. Before it is handed in.
    void ExpectFormat(enum Raster::Format format) { m_ExpectedFormat = format; }

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    enum PreflightForOperation const m_Operation;
    std::optional<enum Raster::Format> m_ExpectedFormat;
};
