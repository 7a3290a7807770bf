#pragma once

#include "framework/kernel/Counted.h"

class DocumentController;

/// Somebody who closes documents to end the application, and learns how each close went.
class ApplicationTerminator : public virtual Kernel::Countable
{
public:
    /// The document is closed, or `closed` is false: it stays open, since it could not be saved. Called once for each
    /// `CloseDocumentCommand` that was given this object, on the thread that ended the close, without locks.
    virtual void OnDocumentClose(Kernel::Counted<DocumentController const> document, bool closed) = 0;
};
