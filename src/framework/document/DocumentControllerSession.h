#pragma once

#include "framework/document/DocumentController.h"

/// Holds a document's reader lock for its own lifetime, so that its tree may be read from any thread. Whoever holds one
/// waits for no queue.
class DocumentControllerSession
{
public:
    explicit DocumentControllerSession(Kernel::NonCounted<DocumentController const> document);
    ~DocumentControllerSession();
    DocumentControllerSession(DocumentControllerSession const &) = delete;
    DocumentControllerSession & operator=(DocumentControllerSession const &) = delete;

private:
    Kernel::Counted<DocumentController const> m_Document;
};
