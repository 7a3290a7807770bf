#pragma once

#include "framework/kernel/DomainCommand.h"

class DocumentController;

/// A command on one document. Run by `VantraController`, or by the document's own queue.
class DocumentCommand : public DomainCommand
{
public:
    [[nodiscard]] Kernel::Counted<DomainController const> GetDomainController() const override;
    [[nodiscard]] Kernel::Counted<DomainController> GetDomainController() override;
    /// Passes the document on to `PostDequeueWithMutableController`; null if the controller is no document.
    void PostDequeueWithMutableDomainController(Kernel::NonCounted<DomainController> controller) override;

    /// The document that it is going to run on. Whoever runs a command by hand, under the document's writer lock, calls
    /// this first.
    virtual void PostDequeueWithMutableController(Kernel::NonCounted<DocumentController> document);

protected:
    ~DocumentCommand() override;

    /// Not counted: valid from dequeueing to the end of `Notify`, and again while it stands in the document's history.
    [[nodiscard]] Kernel::NonCounted<DocumentController> GetDocument() const { return m_Document; }

private:
    Kernel::NonCounted<DocumentController> m_Document;
};
