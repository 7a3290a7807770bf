#include "framework/commands/PreflightCheckDocumentCommand.h"

#include "framework/commands/PreflightChecker.h"
#include "framework/kernel/DomainWriterUnlockSession.h"

namespace
{

CommandRegistration const s_Preflight(typeid(PreflightCheckDocumentCommand), "PreflightCheckDocumentCommand");

}

Kernel::LocalisedString PreflightCheckDocumentCommand::GetDescription() const
{
    return Kernel::LocalisedString("Preflight", "Document Command");
}

void PreflightCheckDocumentCommand::Do()
{
    DocumentController & document = *GetDocument();
    document.ComposeText(false, nullptr);
    PreflightChecker checker(document);
    checker.CheckDocument(m_ExpectedFormat);
    {
        // Who knows the publication may have to read this document.
        DomainWriterUnlockSession const unlocked{Kernel::Counted<DomainController>(&document)};
        checker.AskPublication();
    }
    document.SetPreflightResults(Kernel::MakeCounted<PreflightResults>(
        checker.TakeResults(PreflightForOperation::Export == m_Operation ? PreflightResult::Status::Error
                                                                         : PreflightResult::Status::Warning)));
}

void PreflightCheckDocumentCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<PreflightResultsUpdatedNotification>(Self()));
}
