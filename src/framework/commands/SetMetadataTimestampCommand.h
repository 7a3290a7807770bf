#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Stamps the document's metadata with a moment. The stamp for output is kept in memory only and leaves the document
/// clean; the others make it dirty. Not a step of the history.
class SetMetadataTimestampCommand : public PassingDocumentCommand
{
public:
    enum Action : int
    {
        Created = 0,
        Modified = 1,
        Output = 2
    };

    /// \param time in the form that metadata have it (2026-11-21T06:30:00Z); empty: now
    SetMetadataTimestampCommand(enum Action action, String time) : m_Time(std::move(time)), m_Action(action) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}

private:
    String const m_Time;
    enum Action const m_Action;
};

/// Puts other metadata in place of the document's. Empty texts count as well.
class SetMetadataCommand : public UndoableDocumentCommand
{
public:
    explicit SetMetadataCommand(DocumentMetadata::Values values) : m_Values(std::move(values)) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    DocumentMetadata::Values const m_Values;
    DocumentMetadata::Values m_Before;
};
