#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Brings layouts and pages in step with the text. Next to free where nothing has changed. Not a step of the history;
/// it makes the document dirty only if there are more or fewer pages afterwards.
class ComposeTextCommand : public PassingDocumentCommand
{
public:
    /// \param force sets the text anew also where nothing seems to have changed
    /// \param abort polled; may be null, and outlives the command otherwise
    ComposeTextCommand(bool force, bool * abort) : m_Abort(abort), m_Force(force) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;
    [[nodiscard]] bool * GetProgressAbortPointer() const override { return m_Abort; }

private:
    bool * const m_Abort;
    bool const m_Force;
    ComposeOutcome m_Outcome;
};
